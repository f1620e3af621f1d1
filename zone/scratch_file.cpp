// Scratch files: creation, reopening without truncation, checked reads and
// appends.
#include "zone/scratch_file.hpp"

#include <sys/types.h>

#include <cstring>
#include <limits>

namespace zt {

namespace {

void put_float(unsigned char* out, float v) {
  std::uint32_t bits;
  std::memcpy(&bits, &v, 4);
  for (int b = 0; b < 4; ++b) out[b] = static_cast<unsigned char>(bits >> (8 * b));
}

float get_float(const unsigned char* in) {
  std::uint32_t bits = 0;
  for (int b = 0; b < 4; ++b) bits |= std::uint32_t{in[b]} << (8 * b);
  float v;
  std::memcpy(&v, &bits, 4);
  return v;
}

}  // namespace

ScratchFile::~ScratchFile() { close(); }

std::int32_t ScratchFile::create(const char* path) {
  close();
  file_ = std::fopen(path, "w+b");
  return file_ ? 0 : -1;
}

std::int32_t ScratchFile::reopen(const char* path) {
  close();
  file_ = std::fopen(path, "r+b");
  return file_ ? 0 : -1;
}

std::int32_t ScratchFile::close() {
  if (!file_) return 0;
  const bool flushed = std::fflush(file_) == 0;
  const bool closed = std::fclose(file_) == 0;
  file_ = nullptr;
  return flushed && closed ? 0 : -1;
}

std::int32_t read_points(ScratchFile& file, Point2f* buffer, std::int32_t n, std::int64_t start) {
  if (n < 1) return 0;
  std::FILE* f = file.stream();
  if (!f || start < 0) return -1;
  if (::fseeko(f, static_cast<off_t>(start * kScratchPointBytes), SEEK_SET) != 0) return -1;
  unsigned char bytes[kScratchPointBytes];
  for (std::int32_t i = 0; i < n; ++i) {
    if (std::fread(bytes, 1, sizeof bytes, f) != sizeof bytes) return -1;
    buffer[i] = {get_float(bytes), get_float(bytes + 4)};
  }
  return 0;
}

std::int32_t write_points(ScratchFile& file, const Point2f* points, std::int32_t n,
                          std::int32_t& written) {
  if (n < 1) return 0;
  std::FILE* f = file.stream();
  if (!f) return -1;
  // Reads may have moved the position; point `written` + 1 goes next.
  if (written < 0 || ::fseeko(f, static_cast<off_t>(written * kScratchPointBytes), SEEK_SET) != 0) {
    return -1;
  }
  unsigned char bytes[kScratchPointBytes];
  for (std::int32_t i = 0; i < n; ++i) {
    if (written == std::numeric_limits<std::int32_t>::max()) return -1;
    put_float(bytes, points[i].x);
    put_float(bytes + 4, points[i].y);
    if (std::fwrite(bytes, 1, sizeof bytes, f) != sizeof bytes) return -1;
    ++written;
  }
  // The disk may refuse only when the buffer goes out.
  return std::fflush(f) == 0 ? 0 : -1;
}

}  // namespace zt
