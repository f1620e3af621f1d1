// compute_level_zone and build_level_zones.
#include "zone/level_zone.hpp"

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
  if (!engineReady) {
    engineReady = true;
    offset_engine().initialize();
  }
  work.zonePoints.SetCapacity(kLevelListCapacity);
  work.zonePoints.Clear();
  build_level_zones(work, points, count);
  result.clear();
  if (!has_edge(work.zonePoints)) return 0;
  if (rg_boolean(contour, work.zonePoints, "i", &contour) != 0) return -1;
  result.reserve(static_cast<std::size_t>(contour.count()));
  for (const TaggedPoint& p : contour) {
    result.push_back({static_cast<float>(p.x), static_cast<float>(p.y)});
  }
  return 0;
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
