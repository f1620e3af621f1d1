// The run's status protocol with the calling suite: the status marker
// "$TMP/erreur.tmp.<pid>" exists while the program runs and only a normal end
// removes it; every user message is echoed on the console and appended to
// "$TMP/kvlerror.prg".
//
// Every -1 is reliable: a marker or message file whose name cannot be fully
// expanded, opened or written is a failure, never a file elsewhere.
#pragma once

#include <cstdint>
#include <string>

namespace zt {

// Creates or truncates the status marker with `text` (may be null). 0 or -1.
std::int32_t report_begin(const char* text);
// The same; on -1 `reason` says what failed: the marker's path (or its name
// when that cannot be expanded) and the system's or the expansion's reason.
std::int32_t report_begin(const char* text, std::string& reason);
// Trims trailing blanks; a non-empty text goes to standard output with a line
// end; the text is appended to the message file in every case. 0 or -1.
std::int32_t report_message(const char* buffer, const std::int32_t& length);
std::int32_t report_status(const char* buffer, const std::int32_t& length);
[[noreturn]] void report_fatal(const std::int32_t& number, const char* buffer,
                               const std::int32_t& length);
// Deletes the status marker: 0 when deleted or absent, else the system's error code.
std::int32_t report_end();
std::int32_t report_mark_empty();

}  // namespace zt
