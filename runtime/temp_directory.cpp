// The workzone's temporary directory ($TMP): its number, taken from the
// workzone's own number file or allocated from the suite-wide counter, and
// the directory itself, created on first use.
#include <sys/file.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <optional>
#include <string>

#include "runtime/detail/platform.hpp"
#include "runtime/detail/runtime_state.hpp"
#include "runtime/diagnostics.hpp"
#include "runtime/path_expansion.hpp"

namespace zt {
namespace {

constexpr std::int32_t kTempDirCapacity = 524;
constexpr std::size_t kMaxNumberLine = 80;

struct FileCloser {
  void operator()(std::FILE* f) const { std::fclose(f); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

std::string g_temp_dir;     // empty until the first use
std::string g_forced_dir;   // KVLTMPDIR's value, as last handed out

// A variable that names a base directory: an empty value would put the
// workzone's files at the filesystem root, so it counts as undefined.
bool has_value(const char* variable) {
  const char* value = get_variable(variable);
  return value != nullptr && *value != '\0';
}

// Expands "$<variable>/<rest>"; an undefined variable counts as failure here,
// since the result would name a file at the filesystem root.
std::optional<std::string> expand_strict(const char* variable, const char* rest) {
  const std::string name = std::string("$") + variable + "/" + rest;
  std::string out;
  const std::int32_t status = expand_to_string(name, out);
  if (status != kExpandOk || !has_value(variable)) {
    diagnose_trace(format_text("%s expansion error : %d", name.c_str(), status));
    return std::nullopt;
  }
  return out;
}

std::optional<std::string> read_own_number(const std::string& file) {
  File f(std::fopen(file.c_str(), "r"));
  if (!f) {
    diagnose_fatal(format_text("Error opening file '%s' for read access\n", file.c_str()));
    return std::nullopt;
  }
  const std::optional<std::string> line = detail::read_first_line(f.get(), kMaxNumberLine);
  if (!line) {
    diagnose_fatal(format_text("Error reading file '%s'\n", file.c_str()));
    return std::nullopt;
  }
  return std::string(detail::trim_trailing_blanks(*line));
}

// Takes the next number of the suite-wide counter, locked against the other
// processes of the suite doing the same.
std::optional<std::string> allocate_number(const std::string& own_file) {
  std::optional<std::string> counter = expand_strict("KVLCONF", "workzone.num");
  if (!counter) {
    counter = expand_strict("KVLHOME", "client/kvlconf/workzone.num");
    if (!counter) {
      diagnose_fatal("KVLHOME is not defined\n");
      return std::nullopt;
    }
  }
  File f(std::fopen(counter->c_str(), "r+"));
  if (!f) {
    diagnose_fatal(format_text("Error opening '%s' file\n", counter->c_str()));
    return std::nullopt;
  }
  ::flock(::fileno(f.get()), LOCK_EX);
  const std::optional<std::string> line = detail::read_first_line(f.get(), kMaxNumberLine);
  if (!line) {
    diagnose_fatal(format_text("Error reading '%s' file\n", counter->c_str()));
    return std::nullopt;
  }
  unsigned int value = 0;
  if (std::sscanf(line->c_str(), "%x", &value) != 1) value = 0;
  const std::string number = format_text("%08x", value + 1u);
  std::rewind(f.get());
  const bool written = std::fprintf(f.get(), "%s\n", number.c_str()) > 0 &&
                       std::fflush(f.get()) == 0 &&
                       ::ftruncate(::fileno(f.get()), static_cast<off_t>(number.size() + 1)) == 0;
  if (!written) {
    diagnose_fatal(format_text("Error writing '%s' file\n", counter->c_str()));
    return std::nullopt;
  }
  f.reset();  // releases the lock

  File own(std::fopen(own_file.c_str(), "w"));
  if (!own || std::fprintf(own.get(), "%s\n", number.c_str()) <= 0 ||
      std::fclose(own.release()) != 0) {
    diagnose_fatal(format_text("Error creating '%s' file\n", own_file.c_str()));
    return std::nullopt;
  }
  return number;
}

std::optional<std::string> workzone_directory() {
  const std::optional<std::string> own_file = expand_strict("KVLZONE", "workzone.num");
  if (!own_file) {
    diagnose_fatal("KVLZONE is not defined\n");
    return std::nullopt;
  }
  const std::optional<std::string> number =
      detail::path_exists(*own_file) ? read_own_number(*own_file) : allocate_number(*own_file);
  if (!number) return std::nullopt;
  std::string dir = "$KVLTMP/" + *number;
  if (dir.size() + 1 > static_cast<std::size_t>(kTempDirCapacity)) return std::nullopt;
  std::string buffer(kTempDirCapacity, '\0');
  dir.copy(buffer.data(), dir.size());
  const std::int32_t status = expand_path(buffer.data(), kTempDirCapacity);
  if (status == kExpandUndefined || !has_value("KVLTMP")) {
    diagnose_fatal("KVLTMP is not defined\n");
    return std::nullopt;
  }
  if (status != kExpandOk) return std::nullopt;
  return std::string(buffer.c_str());
}

}  // namespace

namespace detail {
void forget_temp_directory() {
  g_temp_dir.clear();
  g_forced_dir.clear();
}
}  // namespace detail

const char* temp_directory() {
  if (const char* forced = std::getenv("KVLTMPDIR"); forced != nullptr && *forced != '\0') {
    g_forced_dir = forced;
    return g_forced_dir.c_str();
  }
  if (g_temp_dir.empty()) {
    const std::optional<std::string> dir = workzone_directory();
    if (!dir || dir->empty()) return nullptr;
    g_temp_dir = *dir;
  }
  if (!detail::make_directories(g_temp_dir)) {
    diagnose_fatal(format_text("Could not create temporary directory '%s'", g_temp_dir.c_str()));
    return nullptr;
  }
  return g_temp_dir.c_str();
}

}  // namespace zt
