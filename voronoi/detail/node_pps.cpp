// Node equidistant from two points and a segment.
#include <cmath>
#include <utility>

#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_constructions.hpp"
#include "voronoi/detail/quadratic.hpp"
#include "voronoi/detail/root_selection.hpp"

namespace zt::vd::geo {
namespace {

// Neither point ends the segment: the node lies on the bisector of the two
// points, m + t·n, where the distance to p equals the distance to the line.
bool pps_free(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const PointSite& q, const SegSite& s,
              SuspectPair& suspect, NodeResult& out) {
  const Point2d d = sub(q.p, p.p);
  const double dd = norm2(d);
  if (dd <= kCoincideSq) {
    suspect.record(p.index, kKindPnt, q.index, kKindPnt);
    return false;
  }
  for (const PointSite* x : {&p, &q}) {
    if (s.contains(x->p)) {
      suspect.record(s.index, kKindSeg, x->index, kKindPnt);
      return false;
    }
  }
  const Point2d m = mul(add(p.p, q.p), 0.5);
  const Point2d n{-d.y / 2.0, d.x / 2.0};
  const double k = s.a * n.x + s.b * n.y;
  const double dm = (s.D(p.p) + s.D(q.p)) / 2.0;
  const QuadRoots roots = solve_quadratic({k * k - dd / 4.0, 2.0 * dm * k, dm * dm - dd / 4.0});
  if (roots.count == 0) return search_or_copy(e, fresh, out);
  Point2d node = add(m, mul(n, roots.t1));
  if (roots.count == 2) {
    const Point2d other = add(m, mul(n, roots.t2));
    if (!first_root_wins(e, node, other, RootChain().then(s))) node = other;
  }
  return finish_node(e, fresh, node, std::fabs(s.D(node)), out);
}

// p ends the segment, q does not: the node lies on the segment's normal
// through p, where it is as far from q as from p.
bool pps_at_end(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const PointSite& q, const SegSite& s,
                SuspectPair& suspect, NodeResult& out) {
  const double dq = s.D(q.p);
  if (std::fabs(dq) <= kOnSiteTol) {
    if (s.contains(q.p)) {
      suspect.record(s.index, kKindSeg, q.index, kKindPnt);
      return false;
    }
    return search_or_copy(e, fresh, out);
  }
  const Point2d d = sub(p.p, q.p);
  const double dd = norm2(d);
  if (dd <= kCoincideSq) {
    suspect.record(p.index, kKindPnt, q.index, kKindPnt);
    return false;
  }
  const Point2d u = dq > 0.0 ? Point2d{-s.a, -s.b} : Point2d{s.a, s.b};
  const double w = dot(u, d);
  if (std::fabs(w) <= kDenomTol) return search_or_copy(e, fresh, out);
  const double t = -dd / (2.0 * w);
  return finish_node(e, fresh, add(p.p, mul(u, t)), std::fabs(t), out);
}

}  // namespace

bool node_pps(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p0, const PointSite& q0, const SegSite& s,
              SuspectPair& suspect, NodeResult& out) {
  if (p0.index == q0.index) return false;
  PointSite p = p0;
  PointSite q = q0;
  if (s.has_end(q.index)) std::swap(p, q);
  if (!s.has_end(p.index)) {
    if (q.index < p.index) std::swap(p, q);
    return pps_free(e, fresh, p, q, s, suspect, out);
  }
  if (!s.has_end(q.index)) return pps_at_end(e, fresh, p, q, s, suspect, out);
  // Both points end the segment: no node of their bisector is as near the
  // segment as to them, short of the segment itself.
  return search_or_copy(e, fresh, out);
}

}  // namespace zt::vd::geo
