// Node equidistant from three segments.
#include <algorithm>
#include <cmath>

#include "voronoi/detail/line_bisector.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_constructions.hpp"
#include "voronoi/detail/quadratic.hpp"
#include "voronoi/detail/root_selection.hpp"

namespace zt::vd::geo {
namespace {

// Pivots at or below this: two of the lines are parallel.
constexpr double kPivotTol = 1e-50;

bool same_ends(const SegSite& s, const SegSite& t) {
  return (s.i1 == t.i1 && s.i2 == t.i2) || (s.i1 == t.i2 && s.i2 == t.i1);
}

// Orients s's line so that the node lies on its positive side, judged by the
// deleted end node first (the part of e between it and the node lies in the
// new segment's region, which never crosses a segment's line outside the
// segment), then by the kept one. False when both lie on the line.
bool orient_by_edge(const EdgeFrame& e, const SegSite& s, OrientedLine& out) {
  for (const EdgeEnd* x : {&e.gone(), &e.kept()}) {
    const double d = s.D(x->p);
    if (std::fabs(d) > kOrientTol) {
      out = OrientedLine(s, d < 0.0);
      return true;
    }
  }
  return false;
}

// The point where the three oriented distances agree, by elimination with
// the larger pivot first. False when two lines are parallel.
bool equal_distances(const OrientedLine& l1, const OrientedLine& l2, const OrientedLine& l3, Point2d& x) {
  double m[2][3] = {{l1.a - l2.a, l1.b - l2.b, l2.c - l1.c}, {l1.a - l3.a, l1.b - l3.b, l3.c - l1.c}};
  if (std::fabs(m[1][0]) > std::fabs(m[0][0])) std::swap(m[0], m[1]);
  if (std::fabs(m[0][0]) <= kPivotTol) return false;
  const double f = m[1][0] / m[0][0];
  const double p2 = m[1][1] - f * m[0][1];
  if (std::fabs(p2) <= kPivotTol) return false;
  x.y = (m[1][2] - f * m[0][2]) / p2;
  x.x = (m[0][2] - m[0][1] * x.y) / m[0][0];
  return true;
}

}  // namespace

bool node_sss(const EdgeFrame& e, const SiteRef& fresh, const SegSite& sa, const SegSite& sb, const SegSite& sc,
              SuspectPair& suspect, NodeResult& out) {
  const SegSite* s[3] = {&sa, &sb, &sc};
  std::sort(s, s + 3, [](const SegSite* x, const SegSite* y) { return x->index < y->index; });
  if (s[0]->index == s[1]->index || s[1]->index == s[2]->index) return false;
  if (s[0]->arc >= 0 && s[0]->arc == s[1]->arc && s[1]->arc == s[2]->arc) {
    return finish_node(e, fresh, s[0]->arc_center, s[0]->arc_radius, out);
  }
  for (std::int32_t end : {s[0]->i1, s[0]->i2}) {
    if (s[1]->has_end(end) && s[2]->has_end(end)) {
      out.n = end == s[0]->i1 ? s[0]->p1 : s[0]->p2;
      out.r = 0.0;
      out.on_point = end;
      return true;
    }
  }
  for (int i = 0; i < 3; ++i) {
    for (int j = i + 1; j < 3; ++j) {
      if (same_ends(*s[i], *s[j])) {
        suspect.record(s[i]->index, kKindSeg, s[j]->index, kKindSeg);
        return false;
      }
    }
  }
  OrientedLine l[3];
  for (int i = 0; i < 3; ++i) {
    if (!orient_by_edge(e, *s[i], l[i])) return search_or_copy(e, fresh, out);
  }
  Point2d x;
  if (equal_distances(l[0], l[1], l[2], x) && extent_on_edge(e, x) <= kSssOnEdgeTol) {
    return finish_node(e, fresh, x, std::fabs(l[0].D(x)), out);
  }
  // Along e itself, the bisector of its two segments, the node is where the
  // distance to the new segment's line equals theirs (either orientation).
  const SegSite& left = e.left.seg;
  const SegSite& right = e.right.seg;
  const SegSite& added = fresh.seg;
  OrientedLine ll, lr;
  LineBisector bis;
  if (!orient_by_edge(e, left, ll) || !orient_by_edge(e, right, lr) ||
      !line_bisector(ll, left, lr, right, e.kept().p, bis)) {
    return search_or_copy(e, fresh, out);
  }
  const double k = dot(ll.normal(), bis.v);
  const double m = dot(Point2d{added.a, added.b}, bis.v);
  const double d0 = ll.D(bis.p0);
  const double e0 = added.D(bis.p0);
  const QuadRoots roots = solve_quadratic({k * k - m * m, 2.0 * (d0 * k - e0 * m), d0 * d0 - e0 * e0});
  if (roots.count == 0) return search_or_copy(e, fresh, out);
  Point2d node = add(bis.p0, mul(bis.v, roots.t1));
  if (roots.count == 2) {
    const Point2d other = add(bis.p0, mul(bis.v, roots.t2));
    if (!first_root_wins(e, node, other, RootChain().then(*s[2]).then(*s[1]).then(*s[0]))) node = other;
  }
  return finish_node(e, fresh, node, std::fabs(ll.D(node)), out);
}

}  // namespace zt::vd::geo
