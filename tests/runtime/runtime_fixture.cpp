// Shared fixture of the runtime tests (see runtime_fixture.hpp).
#include "runtime_fixture.hpp"

#include <cstdlib>
#include <filesystem>

#include "runtime/detail/runtime_state.hpp"
#include "runtime/diagnostics.hpp"
#include "runtime/path_expansion.hpp"

namespace zt::testing {

std::vector<std::string> RuntimeTest::fatals;
std::vector<std::string> RuntimeTest::warnings;
std::vector<std::string> RuntimeTest::traces;

namespace {

const char* const kRuntimeVariables[] = {
    "KVLHOME", "KVLHOME_LS", "KVLZONE", "KVLCONF", "KVLTMP", "KVLTMPDIR", "KVLNULL",
    "KVL_KVLFILES_VERBOSE", "ENVPATH", "TXTPATH", "KVL_EXPAND_MIN_BUFFER_SIZE",
    "KVL_EXPAND_LOGFILE_NAME", "KVL_EXPAND_WATCH", "KVL_BUFFER_TOO_SMALL_OPTION"};

}  // namespace

void RuntimeTest::SetUp() {
  dir_ = scratch_.path().string();
  for (const char* name : kRuntimeVariables) unset_env(name);
  write_file("home/config/environ.cfg", "");
  set_env("KVLHOME", path("home"));
  fatals.clear();
  warnings.clear();
  traces.clear();
  set_fatal_handler([](const char* t) { fatals.emplace_back(t); });
  set_warning_handler([](const char* t) { warnings.emplace_back(t); });
  set_trace_handler([](const char* t) { traces.emplace_back(t); });
  detail::reset_runtime_state();
}

void RuntimeTest::TearDown() {
  detail::reset_runtime_state();
  set_fatal_handler(nullptr);
  set_warning_handler(nullptr);
  set_trace_handler(nullptr);
  for (const auto& [name, value] : saved_env_) {
    if (value) ::setenv(name.c_str(), value->c_str(), 1);
    else ::unsetenv(name.c_str());
  }
}

void RuntimeTest::set_env(const std::string& name, const std::string& value) {
  unset_env(name);
  ::setenv(name.c_str(), value.c_str(), 1);
}

void RuntimeTest::unset_env(const std::string& name) {
  if (!saved_env_.count(name)) {
    const char* old = std::getenv(name.c_str());
    saved_env_[name] = old ? std::optional<std::string>(old) : std::nullopt;
  }
  ::unsetenv(name.c_str());
}

void RuntimeTest::write_file(const std::string& relative, const std::string& content) const {
  std::filesystem::create_directories(std::filesystem::path(path(relative)).parent_path());
  test::write_text(path(relative), content);
}

std::optional<std::string> RuntimeTest::read_file(const std::string& relative) const {
  if (!std::filesystem::exists(path(relative))) return std::nullopt;
  return test::read_text(path(relative));
}

}  // namespace zt::testing
