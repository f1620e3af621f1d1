// The console progress bar: 30 asterisks under a fixed percentage scale,
// written to standard output with exact bytes.
//
#pragma once

#include <cstdint>

namespace zt {

// Total below 1 counts as 1; current 0 prints the scale and starts a new bar;
// the bar is reprinted only when it grows; a full bar ends with "\n\n".
void progress(const std::int32_t& total, const std::int32_t& current);
// The same by value; returns the result of the last output call.
int progress_value(std::int32_t total, std::int32_t current);
// Ends the line of a bar left unfinished and flushes standard output.
int progress_finish();

}  // namespace zt
