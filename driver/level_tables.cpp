// Level scanning, lookup and reading.
#include "driver/level_tables.hpp"

#include <cmath>
#include <limits>

#include "driver/logical_units.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_stream.hpp"

namespace zt {

void scan_levels(const std::int32_t& unit, LevelTable& table) {
  table.clear();
  float previous = kSeparatorValue;
  float x = 0, y = 0, z = 0;
  std::int32_t record = record_position(unit) - 1;
  while (read_record_xyz(unit, x, y, z)) {
    if (record == std::numeric_limits<std::int32_t>::max()) {
      record_stop({RecordFault::kDamaged, unit_path(unit), static_cast<std::int64_t>(record) + 1,
                   "more records than a level table can number"});
    }
    ++record;
    if (x > kDriverSeparatorX) continue;
    // The first point record always opens a level, even at z = 99999: the
    // starting value of `previous` must not swallow it.
    if (table.z.empty() || std::fabs(z - previous) > kLevelTolerance) {
      table.z.push_back(z);
      table.range.push_back({record, record});
      previous = z;
    }
    table.range.back().last = record;
  }
}

bool find_level(const float& z, const LevelTable& table, std::int32_t& first, std::int32_t& last) {
  for (std::size_t j = 0; j < table.z.size(); ++j) {
    if (z > table.z[j] + kLevelTolerance) return false;
    if (table.z[j] - kLevelTolerance <= z) {
      first = table.range[j].first;
      last = table.range[j].last;
      return true;
    }
  }
  return false;
}

bool read_level_points(const std::int32_t& unit, const std::int32_t& first, const std::int32_t& last,
                       std::vector<Point2f>& points, RecordFaultInfo& fault) {
  points.clear();
  fault = {};
  if (first < 1 || last < first) return true;
  if (record_position(unit) > first && !rewind_unit(unit, fault)) return false;
  float x = 0, y = 0, z = 0;
  while (record_position(unit) < first) {
    if (!read_record_xyz(unit, x, y, z, fault)) return fault.fault == RecordFault::kNone;
  }
  const std::int64_t n = static_cast<std::int64_t>(last) - first + 1;
  for (std::int64_t i = 0; i < n; ++i) {
    if (!read_record_xyz(unit, x, y, z, fault)) return fault.fault == RecordFault::kNone;
    points.push_back({x, y});
  }
  return true;
}

void read_level_points(const std::int32_t& unit, const std::int32_t& first, const std::int32_t& last,
                       std::vector<Point2f>& points) {
  RecordFaultInfo fault;
  if (!read_level_points(unit, first, last, points, fault)) record_stop(fault);
}

}  // namespace zt
