// Expansion of the suite's path names ("$TMP/contour.bin", "?TXT/textg.$KVLLANG").
//
// Promises: the forms $NAME ?NAME ${NAME} $(NAME) ?{NAME} ?(NAME) $$ ??;
// variables from the process environment, then the configuration table loaded
// from the suite's environ.cfg files; $TMP is the workzone's temporary
// directory, created on first use; the result is a normalised path with single
// "/" separators. Statuses: 0, -21 (file absent / not deleted), -31 (syntax),
// -32 (buffer too small), -43 (some variable undefined, result usable),
// -44 (invalid argument). Expansion errors are never fatal by themselves.
//
// Implemented in path_expansion.cpp (buffers, diagnostics), detail/expander.cpp
// (the expansion proper), environment.cpp (variables, configuration) and
// temp_directory.cpp; the diagnostics' routing is in diagnostics.hpp.
#pragma once

#include <cstdint>
#include <string>

namespace zt {

inline constexpr std::int32_t kExpandOk = 0;
inline constexpr std::int32_t kExpandNotFound = -21;
inline constexpr std::int32_t kExpandSyntax = -31;
inline constexpr std::int32_t kExpandTooSmall = -32;
inline constexpr std::int32_t kExpandUndefined = -43;
inline constexpr std::int32_t kExpandInvalid = -44;

// Expands the zero-terminated text in `buffer` in place. On 0 or -43 the
// buffer holds the result; otherwise it is unchanged.
std::int32_t expand_path(char* buffer, std::int32_t capacity);

// Driver-side forms: `name` is a blank-padded buffer of `length` characters
// (trailing blanks are not part of the name); the zero-terminated result goes
// to `out` of `capacity` characters.
void expand_name(const char* name, const std::int32_t& length, char* out,
                 const std::int32_t& capacity, std::int32_t& status);
// As expand_name, and the file or directory must exist (-21 when it does not;
// the plain expansion is still delivered in `out`). ?NAME/rest searches the
// directories of the path variable's list.
void expand_existing(const char* name, const std::int32_t& length, char* out,
                     const std::int32_t& capacity, std::int32_t& status);
// Expands the name and deletes the file; -21 when the deletion fails.
void delete_file(const char* name, const std::int32_t& length, std::int32_t& status);

// Convenience for C++ callers: expand_path into a std::string (capacity 512).
std::int32_t expand_to_string(const std::string& name, std::string& out);

// Variable lookups; nullptr when undefined. The pointer stays valid until the
// next lookup of a variable.
const char* get_variable(const char* name);
const char* get_path_variable(const char* name);

// The temporary directory: KVLTMPDIR when set and not empty (taken as is),
// else the workzone's directory under KVLTMP, created when missing; nullptr
// when it cannot be had (after a fatal diagnostic when a variable is missing).
const char* temp_directory();

// Loads the configuration table from the environ.cfg files (first need only).
void load_environment();

// Replaceable diagnostics; each setter returns the previous handler; a null
// handler restores the default.
using DiagnosticHandler = void (*)(const char* text);
DiagnosticHandler set_fatal_handler(DiagnosticHandler h);
DiagnosticHandler set_warning_handler(DiagnosticHandler h);
DiagnosticHandler set_trace_handler(DiagnosticHandler h);

}  // namespace zt
