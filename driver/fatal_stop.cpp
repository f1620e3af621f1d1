// The driver side's fatal stop.
#include "driver/fatal_stop.hpp"

#include <cstdio>
#include <cstdlib>

#include "core/fatal_gate.hpp"

namespace zt {

namespace {

std::string_view trim_right(std::string_view s) {
  while (!s.empty() && s.back() == ' ') s.remove_suffix(1);
  return s;
}

std::string_view buffer_view(const char* text, std::int32_t length) {
  if (text == nullptr || length <= 0) return {};
  return {text, static_cast<std::size_t>(length)};
}

}  // namespace

std::string fatal_stop_text(std::initializer_list<StopPiece> message,
                            std::span<const std::int32_t> values) {
  std::string out;
  std::size_t next = 0;
  for (const StopPiece& piece : message) {
    if (!piece.fill) {
      out += piece.text;
      continue;
    }
    for (char c : piece.text) {
      if (c == '%' && next < values.size()) {
        out += std::to_string(values[next++]);
      } else {
        out += c;
      }
    }
  }
  return out;
}

void fatal_stop(std::string_view routine, std::initializer_list<StopPiece> message,
                std::span<const std::int32_t> values) {
  claim_fatal_end();
  const std::string text = fatal_stop_text(message, values);
  if (!trim_right(routine).empty()) {
    std::printf(" Fatal error in %.*s : \n", static_cast<int>(routine.size()), routine.data());
  }
  std::printf(" %s\n", text.c_str());
  std::printf(" Program terminated.\n");
  std::fflush(stdout);
  std::exit(0);
}

void fatal_stop(const char* routine, const std::int32_t& routine_length, const char* message,
                const std::int32_t& message_length, const std::int32_t* values,
                const std::int32_t& count) {
  const std::span<const std::int32_t> v(values, values != nullptr && count > 0 ? count : 0);
  fatal_stop(buffer_view(routine, routine_length),
             {stop_template(trim_right(buffer_view(message, message_length)))}, v);
}

}  // namespace zt
