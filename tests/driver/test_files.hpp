// Helpers of the driver tests: record files built record by record, on top
// of the shared scratch directory and whole-file access.
#pragma once

#include <cstdint>
#include <vector>

#include "driver/record_stream.hpp"
#include "support/record_bytes.hpp"
#include "support/scratch_dir.hpp"

namespace zt::test {

// A record file of the given records, each written as segments.
inline Bytes record_file(const std::vector<Bytes>& records) { return segmented_record_file(records); }

// A point record of `size` bytes (12, 16 or 18) with x, y, z.
inline Bytes point(float x, float y, float z, std::size_t size = kPointRecordBytes) {
  const bool separator = x > 99998.0f;
  const PointRecord r = encode_point_record(x, y, z, separator ? kSeparatorCode : kPointCode, kPointFlag);
  return Bytes(r.begin(), r.begin() + static_cast<std::ptrdiff_t>(size));
}

inline Bytes separator(std::size_t size = kPointRecordBytes) {
  return point(kSeparatorValue, kSeparatorValue, kSeparatorValue, size);
}

}  // namespace zt::test
