// The fatal stop of the driver-side utilities (opening text files, loading
// message files): prints what failed where and ends the program.
//
// Output on standard output, each line with one leading blank:
//   " Fatal error in ROUTINE : "   (left out when the routine text is blank)
//   " MESSAGE"
//   " Program terminated."
// then a plain stop (exit status 0; the status marker left behind tells the
// calling suite that the run failed).
//
// The message is built from pieces: template pieces, in which each "%" takes
// the next value as a decimal integer, and inserted pieces (file names),
// copied as they are. A "%" left when the values run out stays a "%".
#pragma once

#include <cstdint>
#include <initializer_list>
#include <span>
#include <string>
#include <string_view>

namespace zt {

struct StopPiece {
  std::string_view text;
  bool fill = true;  // false: inserted text, never filled
};

// A template piece and an inserted piece.
inline StopPiece stop_template(std::string_view t) { return {t, true}; }
inline StopPiece stop_inserted(std::string_view t) { return {t, false}; }

// The message as it is printed.
std::string fatal_stop_text(std::initializer_list<StopPiece> message,
                            std::span<const std::int32_t> values);

[[noreturn]] void fatal_stop(std::string_view routine, std::initializer_list<StopPiece> message,
                             std::span<const std::int32_t> values);

// Driver-side form: routine and message are blank-padded buffers with their
// lengths; the whole message is a template; `count` values.
[[noreturn]] void fatal_stop(const char* routine, const std::int32_t& routine_length,
                             const char* message, const std::int32_t& message_length,
                             const std::int32_t* values, const std::int32_t& count);

}  // namespace zt
