// Diagnostics of the runtime services: three replaceable handlers (fatal,
// warning, trace) and the switches that route their default output.
//
// Promises: with the default handlers, fatal texts and warnings go to standard
// error and traces are dropped, unless KVL_KVLFILES_VERBOSE is set to anything
// but "off" (then everything goes to standard output). The default fatal
// handler ends the process with status -1. A replaced fatal handler may
// return: every caller then carries on with a failure result of its own.
// The handler setters themselves are declared in runtime/path_expansion.hpp.
#pragma once

#include <string>

namespace zt {

// Outside verbose mode, warnings are not printed.
void set_diagnostics_quiet(bool quiet);
// Every default handler prints to standard output.
void set_diagnostics_to_stdout(bool all_to_stdout);

// Hands a text to the current handler of its kind.
void diagnose_fatal(const std::string& text);
void diagnose_warning(const std::string& text);
void diagnose_trace(const std::string& text);

// printf-style formatting into a std::string for the texts above.
std::string format_text(const char* format, ...) __attribute__((format(printf, 1, 2)));

}  // namespace zt
