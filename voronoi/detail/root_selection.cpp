// Root selection chains C1-C4 (see root_selection.hpp).
#include "voronoi/detail/root_selection.hpp"

#include <algorithm>
#include <cmath>

namespace zt::vd::geo {
namespace {

bool is_own_end(const SiteRef& seg, const SiteRef& pnt) {
  return seg.kind == kKindSeg && pnt.kind == kKindPnt && seg.seg.has_end(pnt.pnt.index);
}

// Compares two criterion values; returns -1 when the first is better, 1 when
// the second is, 0 on an exact tie.
int compare(double a, double b) { return a < b ? -1 : (b < a ? 1 : 0); }

}  // namespace

double edge_position(const EdgeFrame& e, const EdgeEnd& x, Point2d c) {
  const SiteRef& l = e.left;
  const SiteRef& r = e.right;
  if (l.kind == kKindPnt && r.kind == kKindPnt) {
    const bool lower = l.pnt.index <= r.pnt.index;
    const Point2d p = lower ? l.pnt.p : r.pnt.p;
    const Point2d q = lower ? r.pnt.p : l.pnt.p;
    const double len = distance(p, q);
    if (len == 0.0) return 0.0;  // coincident sites: no direction to measure
    return cross(sub(q, p), sub(x.p, c)) / len;
  }
  if (is_own_end(l, r) || is_own_end(r, l)) {
    const SiteRef& s = l.kind == kKindSeg ? l : r;
    const SiteRef& p = l.kind == kKindSeg ? r : l;
    // A node of clearance 0 sits on the end point itself.
    const Point2d xp = x.r == 0.0 ? p.pnt.p : x.p;
    const Point2d dir{s.seg.b, -s.seg.a};
    return cross(dir, sub(xp, c));
  }
  const SegSite* s = nullptr;
  if (l.kind == kKindSeg && r.kind == kKindSeg) {
    s = l.seg.index <= r.seg.index ? &l.seg : &r.seg;
  } else if (l.kind == kKindSeg) {
    s = &l.seg;
  } else if (r.kind == kKindSeg) {
    s = &r.seg;
  }
  if (!s) return 0.0;  // arcs and outer edges: no measure, every point counts as inside
  return s->lambda(x.p) - s->lambda(c);
}

double extent_on_edge(const EdgeFrame& e, Point2d c) {
  const double p1 = edge_position(e, e.n1, c);
  const double p2 = edge_position(e, e.n2, c);
  if (p1 == 0.0 || p2 == 0.0 || (p1 < 0.0) != (p2 < 0.0)) return 0.0;
  return std::min(std::fabs(p1), std::fabs(p2));
}

double left_clearance(const EdgeFrame& e, Point2d c) {
  switch (e.left.kind) {
    case kKindPnt:
      return distance(c, e.left.pnt.p);
    case kKindSeg:
      return std::fabs(e.left.seg.D(c));
    default:
      return std::min(e.n1.r, e.n2.r);
  }
}

namespace {

// The point of least clearance on the bisector of two sites where that lies
// between the sites rather than at infinity: the midpoint of two points, the
// apex of the parabola of a point and a segment not ending at it. False for
// other pairs (the clearance is monotone along their edges).
bool clearance_apex(const EdgeFrame& e, Point2d& apex, double& clearance) {
  const SiteRef& l = e.left;
  const SiteRef& r = e.right;
  if (l.kind == kKindPnt && r.kind == kKindPnt) {
    apex = mul(add(l.pnt.p, r.pnt.p), 0.5);
    clearance = 0.5 * distance(l.pnt.p, r.pnt.p);
    return true;
  }
  if ((l.kind == kKindPnt) == (r.kind == kKindPnt) || is_own_end(l, r) || is_own_end(r, l)) return false;
  const SiteRef& s = l.kind == kKindSeg ? l : r;
  const SiteRef& p = l.kind == kKindSeg ? r : l;
  if (s.kind != kKindSeg) return false;
  const double d = s.seg.D(p.pnt.p);
  apex = sub(p.pnt.p, mul(Point2d{s.seg.a, s.seg.b}, 0.5 * d));
  clearance = 0.5 * std::fabs(d);
  return true;
}

}  // namespace

double radius_band(const EdgeFrame& e, Point2d c) {
  double r1 = std::min(e.n1.r, e.n2.r);
  // Along an edge that passes its apex the clearance falls below both end
  // radii and rises again: the band reaches down to the apex's clearance.
  Point2d apex;
  double low;
  if (clearance_apex(e, apex, low) && low < r1 && extent_on_edge(e, apex) == 0.0) r1 = low;
  const double r2 = std::max(e.n1.r, e.n2.r);
  const double d = left_clearance(e, c);
  if (d < r1) return r1 - d;
  if (d <= r2) return 0.0;
  return d - r2;
}

bool first_root_wins(const EdgeFrame& e, Point2d n1, Point2d n2, const RootChain& chain) {
  // A root at an end node lies on the edge, whichever side of that node the
  // rounding puts it, and a root at the edge's apex lies within its radius
  // band: C1 and C3 decide only beyond the rounding band.
  const auto extent = [&](Point2d c) {
    const double x = extent_on_edge(e, c);
    return x <= kRootExtentBand ? 0.0 : x;
  };
  if (int v = compare(extent(n1), extent(n2))) return v < 0;
  for (int i = 0; i < chain.count; ++i) {
    if (int v = compare(chain.c2[i]->beyond(n1), chain.c2[i]->beyond(n2))) return v < 0;
  }
  const auto band = [&](Point2d c) {
    const double x = radius_band(e, c);
    return x <= kRootExtentBand ? 0.0 : x;
  };
  if (int v = compare(band(n1), band(n2))) return v < 0;
  const Point2d g = e.gone().p;
  return !(norm2(sub(n2, g)) < norm2(sub(n1, g)));
}

}  // namespace zt::vd::geo
