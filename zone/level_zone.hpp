// Level zone computation: one Z level's rest-machining zones.
//
// The level's rest-material contours are grown by the context's offset
// distance on their right side (outwards for counter-clockwise contours)
// through the Voronoi engine, the offset curves thinned, and the region they
// bound intersected with the region of the finishing contours of the same z.
// When the engine cannot offset, the rest material itself stands in for its
// offset. The result goes to context.levelResult as single-precision pairs,
// separators (99999, 99999) included. The finishing contours enter the
// intersection thinned within kFinishingThinTolerance. Rest material that grows into no curve
// at all (nothing to feed: points, contours below the engine's extent) gives
// the level no zones rather than an empty operand of the intersection.
#pragma once

#include <cstdint>
#include <vector>

#include "core/points.hpp"
#include "zone/slope_domain.hpp"
#include "zone/zone_context.hpp"

namespace zt {

// Input pairs whose x exceeds this are separators.
inline constexpr float kInputSeparatorX = 99990.0f;
// Room every working list gets before a level is read.
inline constexpr std::int32_t kLevelListCapacity = 10000;
// Tolerance of the thinning of the offset curves.
inline constexpr double kLevelSimplifyTolerance = 0.005;
// The finishing contours are thinned within this before the intersection:
// they are sampled far more densely than the zones need (fillets every few
// microns), and the intersection's work grows with their points. A tenth of
// the arc tolerance of the offsets, so the zones move by no more than a
// tenth of what the offsets' chords already allow.
inline constexpr double kFinishingThinTolerance = kArcTolerance / 10;
// Tag of a rest-material point.
inline constexpr std::int32_t kRestPointTag = 0;

// 0 with context.levelResult holding the level's zones (possibly none, as
// when the rest material grows into no curve); -1 when no finishing level
// matches z, it has no records or cannot be read, or the intersection fails.
std::int32_t compute_level_zone(ZoneContext& context, double z, const Point2f* points,
                                std::int32_t count);

// The two halves of compute_level_zone, for levels computed at once: the
// reading of the finishing contours of z (one thread reads the file), 0 when
// `contour` holds some; then the zones from them on the calling thread's
// engines, with `work`'s lists and offset distance (`contour` is used up).
// A level whose contours, rest material and distance equal, bit for bit,
// those of the thread's last level gets that level's zones again without
// the engines (with the Voronoi engine only; a stand-in is asked each time).
std::int32_t read_level_contours(ZoneContext& context, double z, TaggedPointList& contour);
std::int32_t zone_from_contours(ZoneContext& work, TaggedPointList& contour, const Point2f* points,
                                std::int32_t count, std::vector<Point2f>& result);

// Fills context.zonePoints with the thinned offset curves of the rest
// material, or with the rest material itself when the engine cannot offset.
void build_level_zones(ZoneContext& context, const Point2f* points, std::int32_t count);

}  // namespace zt
