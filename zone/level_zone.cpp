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
  if (!engineReady) {
    engineReady = true;
    offset_engine().initialize();
  }
  context.contourPoints.SetCapacity(kLevelListCapacity);
  context.contourPoints.Clear();
  context.zonePoints.SetCapacity(kLevelListCapacity);
  context.zonePoints.Clear();

  const std::int32_t level = find_contour_level(context.store, z);
  if (level >= 0 && read_contour_level(context.store, level, context.contourPoints) != 0) {
    return -1;
  }
  if (context.contourPoints.count() == 0) return -1;

  build_level_zones(context, points, count);
  context.levelResult.clear();
  if (!has_edge(context.zonePoints)) return 0;
  if (rg_boolean(context.contourPoints, context.zonePoints, "i", &context.contourPoints) != 0) {
    return -1;
  }
  context.levelResult.reserve(static_cast<std::size_t>(context.contourPoints.count()));
  for (const TaggedPoint& p : context.contourPoints) {
    context.levelResult.push_back({static_cast<float>(p.x), static_cast<float>(p.y)});
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
