// The input repair tests that involve segments. Each returns true when it
// changed the input; a restart of the computation is then pending.
//
// Distances are in internal units: points within kRepairPointDistance of a
// segment's line (and within its extent) lie on it; crossings are judged by
// the signs of end points against the other segment's line, with a zero
// band of kCrossBand, so that touching segments are never "crossing".
#pragma once

#include <cstdint>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

inline constexpr double kCrossBand = 1e-14;
inline constexpr double kExtentBand = 1e-11;

// Segment s against point p (not one of its ends): merges p into the near
// end within kRepairPointDistance, else splits s at p.
bool RepairSegmentPoint(std::int32_t s, std::int32_t p);
// Duplicate segments (either orientation): the higher index goes; crossing
// segments: both are split at their crossing, appended as a new point.
bool RepairSegmentSegment(std::int32_t a, std::int32_t b);

// A suspect pair with at least one segment.
bool RepairSuspectWithSegment(const SuspectPair& pair);
// Point p against every segment.
bool RepairPointAgainstSegments(std::int32_t p);
// Segment s against every point (its own end points included, against the
// other points) and every other segment.
bool RepairSegmentAgainstAll(std::int32_t s);
// Every pair of segments and every segment against every point.
bool RepairAllSegmentPairs();

}  // namespace zt::vd
