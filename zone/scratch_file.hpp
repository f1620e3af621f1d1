// Scratch files of the zone builder ("$TMP/temp1", "$TMP/temp2"): bare
// sequences of Point2f (x then y, little-endian 32-bit floats, 8 bytes a
// point, no header), point k (from 1) at byte 8 x (k - 1).
//
// Every fault (a failed positioning, a short read, a write the disk refused,
// a failed flush or close) is reported, never swallowed: a zone contour cut
// short would later be closed with a false chord. Positions are 64-bit.
#pragma once

#include <cstdint>
#include <cstdio>

#include "core/points.hpp"

namespace zt {

class ScratchFile {
 public:
  ScratchFile() = default;
  ~ScratchFile();
  ScratchFile(const ScratchFile&) = delete;
  ScratchFile& operator=(const ScratchFile&) = delete;

  // Creates or truncates the file for reading and writing; 0 or -1.
  std::int32_t create(const char* path);
  // Opens an existing file for reading and writing, keeping its contents;
  // 0 or -1.
  std::int32_t reopen(const char* path);
  // Flushes and closes; 0, or -1 when either failed. 0 when not open.
  std::int32_t close();
  bool isOpen() const { return file_ != nullptr; }
  std::FILE* stream() { return file_; }

 private:
  std::FILE* file_ = nullptr;
};

inline constexpr std::int64_t kScratchPointBytes = 8;

// Reads n points starting with point `start` (from 0) into buffer; 0, or -1
// when the file is not open or positioning or any read fails. 0 at once for
// n < 1.
std::int32_t read_points(ScratchFile& file, Point2f* buffer, std::int32_t n, std::int64_t start);

// Writes n points after the first `written` points of the file, adding 1 to
// `written` for each point that went out, and flushes; -1 at the first
// failure (and when `written` would pass the 32-bit range). 0 at once for
// n < 1.
std::int32_t write_points(ScratchFile& file, const Point2f* points, std::int32_t n,
                          std::int32_t& written);

}  // namespace zt
