// Contour store: the zone builder's index of the finishing contours.
//
// "$TMP/contour.bin" is scanned once; the scan records, per Z level in file
// order, the range of record numbers holding the level (its point records
// and the separator records that follow its contours). Each level handed in
// later is matched by z with a cursor that only moves forward (files and the
// driver both go from the top down) and read back by seeking. No points are
// kept between levels.
//
// Level rules: separator records before the first point record are skipped;
// a new level opens only where z drops by more than kContourLevelDrop; a z
// that rises or drops less stays in the current level. A file without point
// records gives one level of z 99999 that no real z finds.
#pragma once

#include <cstdint>
#include <memory>

#include "runtime/record_readers.hpp"
#include "core/points.hpp"

namespace zt {

// A drop of z by more than this (single precision) opens a new level.
inline constexpr float kContourLevelDrop = 0.001f;
// A level matches a z within this (single precision).
inline constexpr float kContourLevelMatch = 0.0001f;
// The scan takes a record whose x is at least this for a separator.
inline constexpr float kScanSeparatorX = 99990.0f;
// The level read marks a record whose x is at least this as a separator.
inline constexpr float kReadSeparatorX = 90000.0f;
// Size of the level table; a file with more levels is refused.
inline constexpr std::int32_t kMaxContourLevels = 10000;

struct ContourLevel {
  std::int64_t first = 0;  // record number of the level's first point record
  std::int64_t last = 0;   // record number of its last record, separators included
  float z = 0.0f;          // z of its first point record
};

// Reads x, y, z of the next record through the reader and stores the
// reader's result in recordIndex; 1 when that is a record number, 0 at the
// end of the file or on a damaged record (x, y, z then unchanged).
using ContourRecordReader = std::int32_t (*)(CKvlBinaryResFileReader& reader, float& x, float& y,
                                             float& z, std::int64_t& recordIndex);

std::int32_t read_contour_record(CKvlBinaryResFileReader& reader, float& x, float& y, float& z,
                                 std::int64_t& recordIndex);

// The store's part of the zone context.
struct ContourStore {
  std::int32_t levelCount = 0;
  std::int32_t levelCursor = 0;
  std::unique_ptr<ContourLevel[]> levels;
  ContourRecordReader readRecord = nullptr;
  std::unique_ptr<CKvlBinaryResFileReader> reader;  // open on contour.bin
  std::int64_t recordIndex = 0;
};

// Scans the whole file through `readRecord` and builds the level table;
// 0, or -1 when there is no reader, no level table can be had, or the file
// holds more than kMaxContourLevels levels.
std::int32_t load_contours(ContourStore& store, ContourRecordReader readRecord);

// recordIndex 0 and the reader on record 1.
void rewind_contours(ContourStore& store);

// Index of the level whose z matches, starting at the cursor; -1 for none.
// The cursor moves past levels above z and stops on the level found or on
// the first level below z; a z above the cursor's level (or NaN) leaves it.
std::int32_t find_contour_level(ContourStore& store, double z);

// Appends level `index`'s records to `list` (emptied by the caller): points
// tagged with their record's flag (1 when the file's records carry none),
// separators tagged kSeparatorTag with their coordinates as stored. 0, or -1
// when the index is bad or a record of the level cannot be read.
std::int32_t read_contour_level(ContourStore& store, std::int32_t index, TaggedPointList& list);

}  // namespace zt
