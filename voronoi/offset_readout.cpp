// Offset requests and the read-out of the offset store (see engine.hpp).
#include <cmath>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/engine.hpp"

namespace zt {

using namespace zt::vd;

bool VD_ComputeOffsets(std::int32_t, double, double) { return false; }

bool API_ComputeOff(bool, const char*, bool, bool, double, double, bool, bool, bool) { return false; }

std::int32_t GetNumOffsetCurves() { return Vd().offsetCurves.count; }

bool GetOffsetCurve(std::int32_t i, double& offset, std::int32_t& first, std::int32_t& last) {
  const Engine& g = Vd();
  if (!g.offsetCurves.Valid(i)) return false;
  const OffsetCurveRecord& c = g.offsetCurves[i];
  offset = c.offset;
  first = c.first;
  last = c.last;
  return true;
}

bool GetOffsetElement(std::int32_t k, std::int32_t& kind, std::int32_t& site, double& x, double& y,
                      std::int32_t& tag) {
  const Engine& g = Vd();
  if (!g.offsetElements.Valid(k)) return false;
  const OffsetElementRecord& e = g.offsetElements[k];
  kind = e.kind;
  site = e.site;
  x = e.x;
  y = e.y;
  tag = -1;
  return true;
}

void ToUserCoordinates(const Point2d& p, double& x, double& y) {
  x = ToUserX(p.x);
  y = ToUserY(p.y);
}

bool PointsCoincide(const Point2d& a, const Point2d& b) {
  return std::hypot(a.x - b.x, a.y - b.y) <= kCoincidenceDistance;
}

Point2d VD_GetPointCentre(std::int32_t point) {
  const Engine& g = Vd();
  if (!g.points.Valid(point)) return {};
  return {g.points[point].x, g.points[point].y};
}

Point2d VD_GetArcCentre(std::int32_t arc) {
  const Engine& g = Vd();
  if (!g.arcs.Valid(arc)) return {};
  return {g.arcs[arc].cx, g.arcs[arc].cy};
}

std::int32_t VD_GetArcTag(std::int32_t arc) { return Vd().arcs.Valid(arc) ? Vd().arcs[arc].tag : -1; }

}  // namespace zt
