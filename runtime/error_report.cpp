// The status protocol with the calling suite: status marker, message file,
// console echo and the numbered fatal stop.
#include "runtime/error_report.hpp"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <optional>
#include <string>
#include <string_view>

#include "runtime/detail/platform.hpp"
#include "runtime/path_expansion.hpp"

namespace zt {
namespace {

constexpr std::size_t kMaxProgramPath = 2048;

// Only space characters count as trailing blanks of a driver buffer.
std::string_view trimmed(const char* buffer, std::int32_t length) {
  if (buffer == nullptr || length <= 0) return {};
  std::string_view text(buffer, static_cast<std::size_t>(length));
  while (!text.empty() && text.back() == ' ') text.remove_suffix(1);
  return text;
}

// A status-protocol file's path; none unless the expansion is complete (an
// undefined variable would put the file elsewhere than the suite looks).
std::optional<std::string> protocol_path(const std::string& name) {
  std::string out;
  if (expand_to_string(name, out) != kExpandOk) return std::nullopt;
  return out;
}

std::string marker_name() {
  const long pid = detail::process_id();
  return pid == 0 ? std::string("$TMP/erreur.tmp") : "$TMP/erreur.tmp." + std::to_string(pid);
}

bool write_all(int fd, std::string_view text) {
  while (!text.empty()) {
    const ssize_t n = ::write(fd, text.data(), text.size());
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return false;
    text.remove_prefix(static_cast<std::size_t>(n));
  }
  return true;
}

// Writes `text` to the file opened with `flags`; 0, or -1 when the file could
// not be opened or written (then `reason`, when given, says why). A FIFO
// without a reader is a failure, never a wait.
std::int32_t write_file(const std::string& name, int flags, std::string_view text,
                        std::string* reason = nullptr) {
  std::string path;
  const std::int32_t status = expand_to_string(name, path);
  if (status != kExpandOk) {
    if (reason) *reason = "\"" + name + "\" cannot be expanded (status " + std::to_string(status) + ")";
    return -1;
  }
  const int fd = ::open(path.c_str(), flags | O_WRONLY | O_CREAT | O_CLOEXEC | O_NONBLOCK, 0666);
  int error = fd < 0 ? errno : 0;
  if (fd >= 0) {
    errno = 0;
    if (!write_all(fd, text)) error = errno != 0 ? errno : EIO;
    if (::close(fd) != 0 && error == 0) error = errno;
  }
  if (error == 0) return 0;
  if (reason) *reason = "\"" + path + "\": " + std::strerror(error);
  return -1;
}

std::int32_t show_message(std::string_view text) {
  if (!text.empty()) {
    std::fwrite(text.data(), 1, text.size(), stdout);
    std::fputc('\n', stdout);
    std::fflush(stdout);
  }
  // One write per message on an O_APPEND descriptor: messages of several
  // processes never interleave.
  return write_file("$TMP/kvlerror.prg", O_APPEND, text);
}

}  // namespace

std::int32_t report_begin(const char* text) {
  std::string reason;
  return report_begin(text, reason);
}

std::int32_t report_begin(const char* text, std::string& reason) {
  reason.clear();
  return write_file(marker_name(), O_TRUNC, text ? std::string_view(text) : std::string_view(), &reason);
}

std::int32_t report_message(const char* buffer, const std::int32_t& length) {
  return show_message(trimmed(buffer, length));
}

std::int32_t report_status(const char* buffer, const std::int32_t& length) {
  return write_file(marker_name(), O_TRUNC, trimmed(buffer, length));
}

void report_fatal(const std::int32_t& number, const char* buffer, const std::int32_t& length) {
  std::fputs("*** The following error(s) occured: ***\n", stdout);
  char stamp[64] = "";
  const std::time_t now = std::time(nullptr);
  std::tm local{};
  if (::localtime_r(&now, &local) != nullptr)
    std::strftime(stamp, sizeof stamp, "%d-%m-%Y %H:%M:%S", &local);
  std::string program = detail::executable_path();
  if (program.size() > kMaxProgramPath) program.resize(kMaxProgramPath);
  std::string text = stamp;
  text += "\nError number " + std::to_string(number) + ": ";
  text += trimmed(buffer, length);
  text += "\n in program " + program;
  show_message(text);
  std::fflush(nullptr);
  // Only the low byte of an exit status reaches the suite: a number that is a
  // multiple of 256 would read as success, so it ends like 0 does.
  std::exit((number & 0xFF) != 0 ? number : -1);
}

std::int32_t report_end() {
  const std::optional<std::string> path = protocol_path(marker_name());
  if (!path) return EINVAL;
  if (::unlink(path->c_str()) == 0 || errno == ENOENT) return 0;
  return errno;
}

std::int32_t report_mark_empty() { return write_file("$TMP/errvide.tmp", O_TRUNC, {}); }

}  // namespace zt
