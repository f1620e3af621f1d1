// Plain geometry of the node constructions (see node_geometry.hpp).
#include "voronoi/detail/node_geometry.hpp"

#include <cmath>

namespace zt::vd::geo {

// Internal coordinates are at most about 1e154 (the far nodes), whose squares
// stay finite: no need for the slower overflow-safe hypot.
double distance(Point2d u, Point2d v) {
  const double dx = u.x - v.x, dy = u.y - v.y;
  return std::sqrt(dx * dx + dy * dy);
}

SegSite SegSite::make(std::int32_t index, std::int32_t i1, Point2d p1, std::int32_t i2, Point2d p2) {
  SegSite s;
  s.index = index;
  s.i1 = i1;
  s.i2 = i2;
  s.p1 = p1;
  s.p2 = p2;
  s.len = distance(p1, p2);
  s.a = -(p2.y - p1.y) / s.len;
  s.b = (p2.x - p1.x) / s.len;
  s.c = -(s.a * p1.x + s.b * p1.y);
  return s;
}

double SegSite::dist(Point2d q) const {
  const double l = lambda(q);
  if (l < 0.0) return distance(q, p1);
  if (l > len) return distance(q, p2);
  return std::fabs(D(q));
}

double SegSite::beyond(Point2d q) const {
  const double l = lambda(q);
  if (l < 0.0) return -l;
  if (l > len) return l - len;
  return 0.0;
}

bool SegSite::contains(Point2d q) const {
  const double l = lambda(q);
  return std::fabs(D(q)) <= kOnSiteTol && l >= -kOnSiteTol && l <= len + kOnSiteTol;
}

double SiteRef::dist(Point2d q) const {
  if (kind == kKindPnt) return distance(q, pnt.p);
  if (kind == kKindSeg) return seg.dist(q);
  return HUGE_VAL;
}

double SiteRef::strip_dist(Point2d q, double band) const {
  if (kind != kKindSeg) return dist(q);
  const double l = seg.lambda(q);
  if (l < -band || l > seg.len + band) return HUGE_VAL;
  return std::fabs(seg.D(q));
}

}  // namespace zt::vd::geo
