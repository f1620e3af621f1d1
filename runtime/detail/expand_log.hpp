// Debugging aids that find callers with small expansion buffers; inactive
// unless their environment variables are set:
//   KVL_EXPAND_MIN_BUFFER_SIZE=n   log expansions into buffers below |n|
//                                  characters (one more for in-place calls)
//   KVL_EXPAND_LOGFILE_NAME        the log file (default $TEMP/kavrel_expand_log.txt)
//   KVL_EXPAND_WATCH               a logged expansion of a text holding this stops the process
//   KVL_BUFFER_TOO_SMALL_OPTION=crash   a buffer too small stops the process
#pragma once

#include <cstdint>
#include <string>

namespace zt::detail {

void log_small_buffer(const std::string& input, std::int32_t capacity, bool in_place);
void on_buffer_too_small();

}  // namespace zt::detail
