// Final zone assembly: the zones of every level, merged from the deepest
// level that has zones up to the top, then written as closed contours.
//
// Going up, each level's zones are grown by mergeRadius + 0.04, united with
// the grown zones carried up from below, and the union, shrunk by
// mergeRadius, is the level's final zones ("$TMP/temp2", one result range
// per level, entry 0 the deepest); the union is carried on. A level without
// zones of its own gets a copy of the final zones of the level below it.
// write_zones then copies the levels, top first, into the result file.
#pragma once

#include <cstdint>
#include <vector>

#include "core/points.hpp"
#include "zone/entry_points.hpp"
#include "zone/zone_context.hpp"

namespace zt {

// The zones are grown by mergeRadius plus this before the union.
inline constexpr double kMergeGrowthMargin = 0.04;
// Thinning tolerances: the grown zones, the union, the shrunk result.
inline constexpr double kGrownTolerance = 0.005;
inline constexpr double kUnionTolerance = 0.001;
inline constexpr double kShrunkTolerance = 0.01;
// Scratch points with x at or above this are separators in the merge.
inline constexpr float kMergeSeparatorX = 99990.0f;
// write_zones: x at or above this never starts a contour; above it ends one.
inline constexpr float kWriteSeparatorX = 90000.0f;
// Runs shorter than this are not written.
inline constexpr std::int32_t kMinContourPoints = 4;

// Reads "$TMP/grid.tmp", merges the levels of "$TMP/temp1" into "$TMP/temp2"
// and fills the result range table. points: scratch space, grown to the
// largest level. 0, or -1 on any failure (parameter file, scratch file
// names, opening, reading, writing, flushing or closing, offset, union).
std::int32_t assemble_zones(std::vector<Point2f>& points);

// One level of the assembly: A the union carried up (updated), B and C
// working lists, points[0..n) the level's zones; out receives the level's
// final zones. 0 or -1.
std::int32_t merge_level_zones(TaggedPointList& A, TaggedPointList& B, TaggedPointList& C,
                               const Point2f* points, std::int32_t n, std::vector<Point2f>& out);

// The three steps of merge_level_zones, for levels merged at once: the
// level's zones points[0..n) grown into C (B scratch); C united into the
// carried union A (C used up); the union C shrunk into out (B scratch, C
// used up). Grow and shrink work on the calling thread's engine. 0 or -1.
std::int32_t grow_level_zones(const Point2f* points, std::int32_t n, TaggedPointList& B,
                              TaggedPointList& C);
std::int32_t unite_level_zones(TaggedPointList& A, TaggedPointList& C);
std::int32_t shrink_level_zones(TaggedPointList& B, TaggedPointList& C, std::vector<Point2f>& out);

// Copies ranges[count - 1] down to ranges[0] of the scratch file `name` to
// the unit as closed contours; 0, or -1 when the file cannot be opened or
// read, or a contour is refused.
std::int32_t write_zones(const std::int32_t& unit, const char* name, std::int32_t count,
                         const LevelRange* ranges, ContourWriter writeContour);

// The runs write_zones writes: [begin, end) index pairs of points[0..n).
std::vector<std::pair<std::int32_t, std::int32_t>> split_runs(const Point2f* points,
                                                               std::int32_t n);

}  // namespace zt
