// Expansion log for buffer-size hunting.
#include "runtime/detail/expand_log.hpp"

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace zt::detail {

void log_small_buffer(const std::string& input, std::int32_t capacity, bool in_place) {
  const char* minimum_text = std::getenv("KVL_EXPAND_MIN_BUFFER_SIZE");
  if (minimum_text == nullptr) return;
  const long long minimum = std::llabs(std::atoll(minimum_text)) + (in_place ? 1 : 0);
  if (capacity >= minimum) return;
  std::string file;
  if (const char* name = std::getenv("KVL_EXPAND_LOGFILE_NAME")) {
    file = name;
  } else if (const char* temp = std::getenv("TEMP")) {
    file = std::string(temp) + "/kavrel_expand_log.txt";
  } else {
    return;
  }
  if (std::FILE* log = std::fopen(file.c_str(), "a")) {
    std::fprintf(log, " expanding '%s' BufferSize=%d MinBufferSize=%lld\n", input.c_str(),
                 capacity, minimum);
    std::fclose(log);
  }
  const char* watch = std::getenv("KVL_EXPAND_WATCH");
  if (watch != nullptr && *watch != '\0' && input.find(watch) != std::string::npos) std::abort();
}

void on_buffer_too_small() {
  const char* option = std::getenv("KVL_BUFFER_TOO_SMALL_OPTION");
  if (option != nullptr && std::strcmp(option, "crash") == 0) std::abort();
}

}  // namespace zt::detail
