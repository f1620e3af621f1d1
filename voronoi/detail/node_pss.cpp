// Node equidistant from a point and two segments.
#include <cmath>
#include <utility>

#include "voronoi/detail/line_bisector.hpp"
#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_constructions.hpp"
#include "voronoi/detail/quadratic.hpp"
#include "voronoi/detail/root_selection.hpp"

namespace zt::vd::geo {
namespace {

double sign_of(double v) { return v > 0.0 ? 1.0 : (v < 0.0 ? -1.0 : 0.0); }

// p ends `own` only: the node lies on own's normal through p, p + t·u, where
// |t| (the distance to p) equals the distance to the other segment's line.
bool pss_at_end(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const SegSite& own, const SegSite& other,
                SuspectPair& suspect, NodeResult& out) {
  if (other.contains(p.p)) {
    suspect.record(other.index, kKindSeg, p.index, kKindPnt);
    return false;
  }
  const Point2d u{own.a, own.b};
  const double c = dot(u, Point2d{other.a, other.b});
  const double d1 = other.D(p.p);
  const double sigma = sign_of(d1);
  double ts[2];
  int count = 0;
  if (std::fabs(c) <= kDenomTol) {
    ts[count++] = -d1;
    ts[count++] = d1;
  } else {
    if (std::fabs(sigma + c) > kDenomTol) ts[count++] = -d1 / (sigma + c);
    if (std::fabs(sigma - c) > kDenomTol) ts[count++] = d1 / (sigma - c);
  }
  if (count == 0) return search_or_copy(e, fresh, out);
  double t = ts[0];
  if (count == 2) {
    const Point2d n1 = add(p.p, mul(u, ts[0]));
    const Point2d n2 = add(p.p, mul(u, ts[1]));
    if (!first_root_wins(e, n1, n2, RootChain().then(other))) t = ts[1];
  }
  return finish_node(e, fresh, add(p.p, mul(u, t)), std::fabs(t), out);
}

// Orients one line so that the node lies on its positive side: by the side
// of p, or by the kept end node when p lies on the line (or while the memory
// says so). False when nothing decides; `degenerate` when p lies on the
// segment itself.
bool orient(const EdgeFrame& e, const PointSite& p, const SegSite& s, NodeMemory& memory, SuspectPair& suspect,
            bool& degenerate, OrientedLine& out) {
  const double dp = s.D(p.p);
  if (std::fabs(dp) <= kOnSiteTol) {
    if (s.contains(p.p)) {
      suspect.record(s.index, kKindSeg, p.index, kKindPnt);
      degenerate = true;
      return false;
    }
    memory.orient_by_kept = true;
  }
  if (!memory.orient_by_kept) {
    out = OrientedLine(s, dp < 0.0);
    return true;
  }
  const double dk = s.D(e.kept().p);
  if (std::fabs(dk) <= kOnSiteTol) return false;
  memory.orient_by_kept = false;
  out = OrientedLine(s, dk < 0.0);
  return true;
}

// Neither segment ends at p: along the bisector of the two oriented lines,
// p0 + t·v, the distance to p equals the oriented distance to either line.
bool pss_general(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const SegSite& s1, const SegSite& s2,
                 NodeMemory& memory, SuspectPair& suspect, NodeResult& out) {
  OrientedLine l1, l2;
  bool degenerate = false;
  if (!orient(e, p, s1, memory, suspect, degenerate, l1) || !orient(e, p, s2, memory, suspect, degenerate, l2)) {
    if (degenerate) return false;
    return search_or_copy(e, fresh, out);
  }
  LineBisector bis;
  if (!line_bisector(l1, s1, l2, s2, p.p, bis)) return search_or_copy(e, fresh, out);
  const double k = dot(l1.normal(), bis.v);
  const double d0 = l1.D(bis.p0);
  const Point2d w = sub(bis.p0, p.p);
  const QuadRoots roots =
      solve_quadratic({norm2(bis.v) - k * k, 2.0 * (dot(w, bis.v) - k * d0), norm2(w) - d0 * d0});
  if (roots.count == 0) return search_or_copy(e, fresh, out);
  Point2d node = add(bis.p0, mul(bis.v, roots.t1));
  if (roots.count == 2) {
    const Point2d other = add(bis.p0, mul(bis.v, roots.t2));
    if (!first_root_wins(e, node, other, RootChain().then(s2).then(s1))) node = other;
  }
  return finish_node(e, fresh, node, std::fabs(s1.D(node)), out);
}

}  // namespace

bool node_pss(const EdgeFrame& e, const SiteRef& fresh, const PointSite& p, const SegSite& sa, const SegSite& sb,
              NodeMemory& memory, SuspectPair& suspect, NodeResult& out) {
  const bool a_lower = sa.index < sb.index;
  const SegSite& s1 = a_lower ? sa : sb;
  const SegSite& s2 = a_lower ? sb : sa;
  if (s1.index == s2.index) return false;
  if ((s1.i1 == s2.i1 && s1.i2 == s2.i2) || (s1.i1 == s2.i2 && s1.i2 == s2.i1)) {
    suspect.record(s1.index, kKindSeg, s2.index, kKindSeg);
    return false;
  }
  const bool end1 = s1.has_end(p.index);
  const bool end2 = s2.has_end(p.index);
  if (end1 && end2) {
    out.n = p.p;
    out.r = 0.0;
    out.on_point = p.index;
    return true;
  }
  if (end1) return pss_at_end(e, fresh, p, s1, s2, suspect, out);
  if (end2) return pss_at_end(e, fresh, p, s2, s1, suspect, out);
  return pss_general(e, fresh, p, s1, s2, memory, suspect, out);
}

}  // namespace zt::vd::geo
