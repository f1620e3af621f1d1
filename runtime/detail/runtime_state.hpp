// Internal seams between the path expansion, the environment and the
// temporary directory, and the reset that lets tests start from a fresh
// process state.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace zt::detail {

enum class Lookup { kFound, kUndefined, kFailed };
struct VariableValue {
  Lookup kind;
  std::string value;
};

// $NAME and ?NAME as the expansion sees them; kFailed only for a $TMP whose
// directory could not be had.
VariableValue lookup_variable(std::string_view name);
VariableValue lookup_path_variable(std::string_view name);

// The expansion proper: references resolved, the path normalised. Status 0,
// -43, -31 or -44; no diagnostic, no capacity check.
std::int32_t expand_text(std::string_view input, std::string& out);

// Every run of "/" and "\" becomes one "/".
std::string normalise_path(const std::string& path);

// "<home>" when `exe` is "<home>/exe/<msw|linux>/<program>", else "".
std::string installation_directory_from(const std::string& exe);

// Forgets the configuration table, the temporary directory and the hook, as
// in a new process (tests only).
void reset_runtime_state();
void forget_temp_directory();

}  // namespace zt::detail
