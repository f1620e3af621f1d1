// The few operating-system services the runtime layer needs, on Linux:
// the running executable's path, the process identifier, existence tests,
// directory creation and reading the first line of a text file.
#pragma once

#include <cstdio>
#include <optional>
#include <string>
#include <string_view>

namespace zt::detail {

// Full path of the running executable ("" when it cannot be had).
std::string executable_path();
long process_id();

bool path_exists(const std::string& path);
bool is_directory(const std::string& path);

// Creates the directory and its missing parents; true when it exists afterwards.
bool make_directories(const std::string& path);

// Reads the first line of `stream` (without its line end, CR included),
// keeping at most `max_chars` characters of it. None on end of file or a
// read error before any character.
std::optional<std::string> read_first_line(std::FILE* stream, std::size_t max_chars);

// Trailing characters up to and including the blank (<= 32 with control).
std::string_view trim_trailing_blanks(std::string_view text);
std::string_view trim_trailing_controls(std::string_view text);
std::string_view trim_blanks(std::string_view text);

bool equals_ignoring_case(std::string_view a, std::string_view b);

}  // namespace zt::detail
