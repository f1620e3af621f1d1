// The OutputCollector: receives result points in normalised coordinates,
// maps them back to input coordinates and appends them to the result list.
// It drops a point within the duplicate tolerance of the stored one when
// their tags agree, and at a change of tag first moves the stored point to
// the last point emitted, so every run of one tag ends on its last point.
// Thread-local: one operation per thread at a time.
#pragma once

#include <cstdint>

#include "core/points.hpp"

namespace zt::detail {

// Emitted points below this x are mapped back; separators pass unchanged.
inline constexpr double kMapBackLimit = 90000.0;
inline constexpr double kDuplicateTolerance = 1e-7;

struct OutputCollector {
  std::int32_t lastTag = kSeparatorTag;
  double lastY = 0.0;
  double lastX = 0.0;
  double tolerance = kDuplicateTolerance;
  TaggedPointList* target = nullptr;
  double offsetX = 0.0, offsetY = 0.0, scaleX = 1.0, scaleY = 1.0;
};

OutputCollector& thread_collector();
// Starts a new result: last tag and point reset, the target and the mapping set.
void collector_reset(TaggedPointList* target, double offsetX, double offsetY, double scaleX, double scaleY);
void collector_set_tolerance(double tolerance);
// The emit callback of the emission.
void emit_point(double x, double y, std::int32_t tag);
inline void emit_separator() { emit_point(kSeparatorCoord, kSeparatorCoord, kSeparatorTag); }

}  // namespace zt::detail
