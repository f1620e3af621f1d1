// Linux layer of the runtime services.
#include "runtime/detail/platform.hpp"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cctype>
#include <vector>

namespace zt::detail {

std::string executable_path() {
  std::vector<char> buffer(4096);
  const ssize_t n = ::readlink("/proc/self/exe", buffer.data(), buffer.size() - 1);
  if (n <= 0) return {};
  return std::string(buffer.data(), static_cast<std::size_t>(n));
}

long process_id() { return static_cast<long>(::getpid()); }

bool path_exists(const std::string& path) {
  struct stat st;
  return !path.empty() && ::stat(path.c_str(), &st) == 0;
}

bool is_directory(const std::string& path) {
  struct stat st;
  return !path.empty() && ::stat(path.c_str(), &st) == 0 && S_ISDIR(st.st_mode);
}

bool make_directories(const std::string& path) {
  if (path.empty()) return false;
  if (is_directory(path)) return true;
  // Create every prefix that ends before a separator, then the whole path;
  // a run of separators counts as one.
  for (std::size_t i = 1; i <= path.size(); ++i) {
    if (i < path.size() && path[i] != '/' && path[i] != '\\') continue;
    if (path[i - 1] == '/' || path[i - 1] == '\\') continue;
    const std::string prefix = path.substr(0, i);
    if (::mkdir(prefix.c_str(), 0777) != 0 && errno != EEXIST) return false;
  }
  return is_directory(path);
}

std::optional<std::string> read_first_line(std::FILE* stream, std::size_t max_chars) {
  std::string line;
  bool any = false;
  for (int c = std::fgetc(stream); c != EOF; c = std::fgetc(stream)) {
    any = true;
    if (c == '\n') break;
    if (line.size() < max_chars) line.push_back(static_cast<char>(c));
  }
  if (!any) return std::nullopt;
  if (!line.empty() && line.back() == '\r') line.pop_back();
  return line;
}

std::string_view trim_trailing_blanks(std::string_view text) {
  while (!text.empty() && (text.back() == ' ' || text.back() == '\t')) text.remove_suffix(1);
  return text;
}

std::string_view trim_trailing_controls(std::string_view text) {
  while (!text.empty() && static_cast<unsigned char>(text.back()) <= 32) text.remove_suffix(1);
  return text;
}

std::string_view trim_blanks(std::string_view text) {
  while (!text.empty() && (text.front() == ' ' || text.front() == '\t')) text.remove_prefix(1);
  return trim_trailing_blanks(text);
}

bool equals_ignoring_case(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  for (std::size_t i = 0; i < a.size(); ++i) {
    if (std::tolower(static_cast<unsigned char>(a[i])) !=
        std::tolower(static_cast<unsigned char>(b[i])))
      return false;
  }
  return true;
}

}  // namespace zt::detail
