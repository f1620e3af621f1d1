// Level tables of the driver's input record files, and the reading of a
// level's points into the point buffer.
//
// A level is a run of consecutive point records whose z lies within
// kLevelTolerance of the run's first z (separator records inside the run do
// not end it). The table keeps, per level, that first z and the range of
// record numbers (from 1, separators counted) from its first to its last
// point record. The tables and the point buffer grow as needed.
#pragma once

#include <cstdint>
#include <vector>

#include "core/points.hpp"
#include "driver/record_fault.hpp"

namespace zt {

// z values closer than this (single precision) belong to the same level.
inline constexpr float kLevelTolerance = 0.0001f;
// A record whose x exceeds this is a separator record (driver's threshold).
inline constexpr float kDriverSeparatorX = 99998.0f;

struct RecordRange {
  std::int32_t first = -1;
  std::int32_t last = -1;
};

struct LevelTable {
  // The z column is contiguous so it can be handed on as a plain float array.
  std::vector<float> z;
  std::vector<RecordRange> range;

  std::int32_t count() const { return static_cast<std::int32_t>(z.size()); }
  void clear() {
    z.clear();
    range.clear();
  }
};

// Reads the file open on the unit from its current position to its end and
// fills the table.
void scan_levels(const std::int32_t& unit, LevelTable& table);

// The range of the first level j with z[j] - tol <= z; none (false) when a
// level above z + tol comes first or no level is left.
bool find_level(const float& z, const LevelTable& table, std::int32_t& first, std::int32_t& last);

// Fills `points` with (x, y) of records first..last of the file open on the
// unit (separator records included, their x marks contour boundaries). The
// unit is moved back to its start when it is already past `first`, so any
// range can be read in any order. An empty or inverted range, or a file that
// ends before `first`, gives no points; a file that ends inside the range
// gives the points up to its end.
// With `fault`, a fault of the file is handed back (false, the points read
// so far kept) instead of stopping the program.
void read_level_points(const std::int32_t& unit, const std::int32_t& first, const std::int32_t& last,
                       std::vector<Point2f>& points);
bool read_level_points(const std::int32_t& unit, const std::int32_t& first, const std::int32_t& last,
                       std::vector<Point2f>& points, RecordFaultInfo& fault);

}  // namespace zt
