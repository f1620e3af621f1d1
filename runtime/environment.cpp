// Variables, path variables and the loading of the environ.cfg files.
#include "runtime/environment.hpp"

#include <cstdlib>
#include <string>
#include <vector>

#include "runtime/detail/platform.hpp"
#include "runtime/detail/runtime_state.hpp"
#include "runtime/diagnostics.hpp"
#include "runtime/path_expansion.hpp"

namespace zt {
namespace {

constexpr std::int32_t kEnvListCapacity = 4096;

struct EnvironmentState {
  ConfigTable* table = nullptr;  // kept for the whole run
  bool loaded = false;           // set when loading starts: a load never recurses
  ZoneChangeHook hook = nullptr;
  std::string last_value;        // what get_variable / get_path_variable hand out
};

EnvironmentState& state() {
  static EnvironmentState s;
  return s;
}

ConfigTable& table_storage() {
  EnvironmentState& s = state();
  if (s.table == nullptr) s.table = new ConfigTable;
  return *s.table;
}

const char* env_value(const char* name) {
  const char* v = std::getenv(name);
  return (v != nullptr && *v != '\0') ? v : nullptr;
}

std::string without_trailing_separator(std::string dir) {
  if (!dir.empty() && (dir.back() == '/' || dir.back() == '\\' || dir.back() == ' ')) dir.pop_back();
  return dir;
}

std::vector<std::string> split_directory_list(const std::string& list) {
  std::vector<std::string> dirs;
  std::size_t start = 0;
  for (std::size_t i = 0; i <= list.size(); ++i) {
    if (i < list.size() && list[i] != ';' && list[i] != ',') continue;
    dirs.push_back(without_trailing_separator(
        std::string(detail::trim_blanks(std::string_view(list).substr(start, i - start)))));
    start = i + 1;
  }
  return dirs;
}

std::string installation_directory() {
  if (const char* home = env_value("KVLHOME")) return home;
  if (const char* ls = env_value("KVLHOME_LS")) {
    ::setenv("KVLHOME", ls, 1);
    return ls;
  }
  std::string home = detail::installation_directory_from(detail::executable_path());
  if (!home.empty()) ::setenv("KVLHOME", home.c_str(), 1);
  return home;
}

}  // namespace

namespace detail {

std::string installation_directory_from(const std::string& exe) {
  std::string path = exe;
  for (char& c : path)
    if (c == '\\') c = '/';
  const std::size_t program = path.rfind('/');
  if (program == std::string::npos || program == 0) return {};
  const std::size_t platform = path.rfind('/', program - 1);
  if (platform == std::string::npos || platform == 0) return {};
  const std::string_view platform_name(path.data() + platform + 1, program - platform - 1);
  if (!equals_ignoring_case(platform_name, "msw") && !equals_ignoring_case(platform_name, "linux"))
    return {};
  const std::size_t exe_dir = path.rfind('/', platform - 1);
  if (exe_dir == std::string::npos) return {};
  const std::string_view exe_name(path.data() + exe_dir + 1, platform - exe_dir - 1);
  if (!equals_ignoring_case(exe_name, "exe")) return {};
  return exe_dir == 0 ? std::string("/") : path.substr(0, exe_dir);
}

VariableValue lookup_variable(std::string_view name) {
  if (name == "TMP") {
    const char* dir = temp_directory();
    if (dir == nullptr) return {Lookup::kFailed, {}};
    return {Lookup::kFound, dir};
  }
  const std::string key(name);
  if (name == "KVLZONE" && state().hook != nullptr) state().hook(key.c_str());
  if (const char* v = std::getenv(key.c_str())) return {Lookup::kFound, v};
  if (auto v = configuration().value("var", key))
    return {Lookup::kFound, std::string(trim_trailing_controls(*v))};
  return {Lookup::kUndefined, {}};
}

VariableValue lookup_path_variable(std::string_view name) {
  const std::string key(name);
  if (const char* v = std::getenv((key + "PATH").c_str())) return {Lookup::kFound, v};
  if (auto v = configuration().value("path", key))
    return {Lookup::kFound, std::string(trim_trailing_blanks(*v))};
  return {Lookup::kUndefined, {}};
}

void reset_runtime_state() {
  EnvironmentState& s = state();
  if (s.table != nullptr) s.table->clear();
  s.loaded = false;
  s.hook = nullptr;
  forget_temp_directory();
}

}  // namespace detail

ConfigTable& configuration() {
  if (!state().loaded) load_environment();
  return table_storage();
}

ZoneChangeHook set_zone_change_hook(ZoneChangeHook hook) {
  const ZoneChangeHook previous = state().hook;
  state().hook = hook;
  return previous;
}

const char* get_variable(const char* name) {
  if (name == nullptr) return nullptr;
  detail::VariableValue v = detail::lookup_variable(name);
  if (v.kind != detail::Lookup::kFound) return nullptr;
  state().last_value = std::move(v.value);
  return state().last_value.c_str();
}

const char* get_path_variable(const char* name) {
  if (name == nullptr) return nullptr;
  detail::VariableValue v = detail::lookup_path_variable(name);
  if (v.kind != detail::Lookup::kFound) return nullptr;
  state().last_value = std::move(v.value);
  return state().last_value.c_str();
}

void load_environment() {
  if (state().loaded) return;
  state().loaded = true;
  ConfigTable& table = table_storage();
  diagnose_trace("LOADING ENVIRONMENT FILES ....");

  std::string home = installation_directory();
  if (home.empty()) {
    diagnose_fatal("The environment variable 'KVLHOME' is not defined\n");
    return;
  }
  const std::string config_dir = without_trailing_separator(home) + "/config";
  const std::string own_file = config_dir + "/environ.cfg";
  diagnose_trace("loading configuration file '" + own_file + "'");
  if (!load_messages(own_file, table)) {
    diagnose_fatal("Error loading '" + own_file);
    return;
  }
  table.add_entry("var", "WINDOWS", "1", "", kSetByProgram);
  table.add_entry("var", "PC", "1", "", kSetByProgram);

  std::string list;
  const std::int32_t status = detail::expand_text("?ENV", list);
  if ((status != kExpandOk && status != kExpandUndefined) ||
      list.size() + 1 > static_cast<std::size_t>(kEnvListCapacity)) {
    diagnose_fatal("Error evaluation '?ENV' path\n");
    return;
  }
  const std::vector<std::string> dirs = split_directory_list(list);
  for (std::size_t i = dirs.size(); i-- > 0;) {
    const std::string& dir = dirs[i];
    bool repeated = dir.empty() || detail::equals_ignoring_case(dir, config_dir);
    for (std::size_t j = 0; j < i && !repeated; ++j)
      repeated = detail::equals_ignoring_case(dir, dirs[j]);
    if (repeated) continue;
    const std::string file = dir + "/environ.cfg";
    diagnose_trace(format_text("Overloading '%s'\n", file.c_str()));
    if (!detail::path_exists(file)) continue;
    if (!load_messages(file, table)) return;
  }
  diagnose_trace("LOADING ENVIRONMENT FILES ....done.");
}

}  // namespace zt
