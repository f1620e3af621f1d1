// compute_level_zone and build_level_zones.
#include "zone/level_zone.hpp"

#include <bit>
#include <cstdint>
#include <vector>

#include "regions/boolean.hpp"
#include "zone/offset_engine.hpp"
#include "zone/simplify.hpp"
#include "zone/slope_domain.hpp"

namespace zt {

namespace {

void append_rest_material(TaggedPointList& list, const Point2f* points, std::int32_t count) {
  for (std::int32_t i = 0; i < count; ++i) {
    const std::int32_t tag = points[i].x > kInputSeparatorX ? kSeparatorTag : kRestPointTag;
    list.AddDoubling({tag, double{points[i].x}, double{points[i].y}});
  }
}

// Whether the list holds an edge: two consecutive points of one polyline
// that differ. Without one the zone region is empty.
bool has_edge(const TaggedPointList& list) {
  for (std::int32_t i = 1; i < list.count(); ++i) {
    const TaggedPoint& a = list[i - 1];
    const TaggedPoint& b = list[i];
    if (a.tag != kSeparatorTag && b.tag != kSeparatorTag && (a.x != b.x || a.y != b.y)) return true;
  }
  return false;
}

// The last level zone computed on this thread and what it was computed
// from: a level whose finishing contours, rest material and offset distance
// are equal bit for bit to those gets the same zones without the engines
// (the levels of a part with vertical walls).
struct RememberedLevel {
  bool valid = false;
  std::uint64_t distanceBits = 0;
  std::vector<TaggedPoint> contour;
  std::vector<Point2f> rest;
  std::vector<Point2f> result;
};
thread_local RememberedLevel tl_level;

bool same_bits(double a, double b) {
  return std::bit_cast<std::uint64_t>(a) == std::bit_cast<std::uint64_t>(b);
}
bool same_bits(float a, float b) { return std::bit_cast<std::uint32_t>(a) == std::bit_cast<std::uint32_t>(b); }

bool remembered_level_matches(const TaggedPointList& contour, const Point2f* points, std::int32_t count,
                              double distance) {
  const RememberedLevel& r = tl_level;
  if (!r.valid || r.distanceBits != std::bit_cast<std::uint64_t>(distance) ||
      r.contour.size() != static_cast<std::size_t>(contour.count()) ||
      r.rest.size() != static_cast<std::size_t>(count)) {
    return false;
  }
  for (std::int32_t i = 0; i < contour.count(); ++i) {
    const TaggedPoint &a = contour[i], &b = r.contour[static_cast<std::size_t>(i)];
    if (a.tag != b.tag || !same_bits(a.x, b.x) || !same_bits(a.y, b.y)) return false;
  }
  for (std::int32_t i = 0; i < count; ++i) {
    const Point2f &a = points[i], &b = r.rest[static_cast<std::size_t>(i)];
    if (!same_bits(a.x, b.x) || !same_bits(a.y, b.y)) return false;
  }
  return true;
}

// zone_from_contours without looking at the level before.
std::int32_t level_zone_from_contours(ZoneContext& work, TaggedPointList& contour,
                                      const Point2f* points, std::int32_t count,
                                      std::vector<Point2f>& result) {
  if (!engineReady) {
    engineReady = true;
    offset_engine().initialize();
  }
  work.zonePoints.SetCapacity(kLevelListCapacity);
  work.zonePoints.Clear();
  build_level_zones(work, points, count);
  result.clear();
  if (!has_edge(work.zonePoints)) return 0;
  simplify_polylines(contour, work.finishingPoints, kFinishingThinTolerance);
  if (rg_boolean(work.finishingPoints, work.zonePoints, "i", &contour) != 0) return -1;
  result.reserve(static_cast<std::size_t>(contour.count()));
  for (const TaggedPoint& p : contour) {
    result.push_back({static_cast<float>(p.x), static_cast<float>(p.y)});
  }
  return 0;
}

}  // namespace

std::int32_t compute_level_zone(ZoneContext& context, double z, const Point2f* points,
                                std::int32_t count) {
  if (read_level_contours(context, z, context.contourPoints) != 0) return -1;
  return zone_from_contours(context, context.contourPoints, points, count, context.levelResult);
}

std::int32_t read_level_contours(ZoneContext& context, double z, TaggedPointList& contour) {
  contour.SetCapacity(kLevelListCapacity);
  contour.Clear();
  const std::int32_t level = find_contour_level(context.store, z);
  if (level >= 0 && read_contour_level(context.store, level, contour) != 0) return -1;
  return contour.count() == 0 ? -1 : 0;
}

std::int32_t zone_from_contours(ZoneContext& work, TaggedPointList& contour, const Point2f* points,
                                std::int32_t count, std::vector<Point2f>& result) {
  // Only the Voronoi engine computes purely from its input.
  const bool remember = &offset_engine() == &voronoi_offset_engine();
  if (remember && remembered_level_matches(contour, points, count, work.offsetDistance)) {
    result = tl_level.result;
    return 0;
  }
  tl_level.valid = false;
  if (remember) {
    tl_level.distanceBits = std::bit_cast<std::uint64_t>(work.offsetDistance);
    tl_level.contour.assign(contour.begin(), contour.end());
    tl_level.rest.assign(points, points + count);
  }
  const std::int32_t r = level_zone_from_contours(work, contour, points, count, result);
  if (remember && r == 0) {
    tl_level.result = result;
    tl_level.valid = true;
  }
  return r;
}

void build_level_zones(ZoneContext& context, const Point2f* points, std::int32_t count) {
  TaggedPointList& rest = context.restPoints;
  rest.SetCapacity(kLevelListCapacity);
  rest.Clear();
  append_rest_material(rest, points, count);

  SlopeDomain domain(context.offsetDistance);
  if (domain.compute(rest, kSideRight) == 0) {
    simplify_polylines(rest, context.zonePoints, kLevelSimplifyTolerance);
  } else {
    append_rest_material(context.zonePoints, points, count);
  }
}

}  // namespace zt
