// The suite's environment: variables from the process environment and the
// configuration table loaded from the environ.cfg files, and the reader of
// those files.
//
// Promises: the table is loaded once, on the first lookup that needs it (or an
// explicit load_environment); the installation's own file comes first, then
// the files of the "?ENV" directory list from the last to the first, so the
// first directory has the last word. Syntax errors of a file are diagnosed
// with the file name and line; fatal ones end the process with the default
// fatal handler.
// get_variable, get_path_variable and load_environment are declared in
// runtime/path_expansion.hpp.
#pragma once

#include <string>

#include "runtime/config_table.hpp"

namespace zt {

inline constexpr std::size_t kMaxConfigLine = 1024;
inline constexpr int kMaxNestedConditions = 7;

// Reads one environ.cfg-style file into `table`. False when it could not be
// opened or read, a fatal syntax error was diagnosed, or storage ran out.
bool load_messages(const std::string& file, ConfigTable& table);

// The process-wide configuration table, loaded on first use.
ConfigTable& configuration();

// Called with "KVLZONE" before each lookup of that variable; returns the
// previous hook (none by default).
using ZoneChangeHook = void (*)(const char* name);
ZoneChangeHook set_zone_change_hook(ZoneChangeHook hook);

}  // namespace zt
