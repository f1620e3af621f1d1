// Node acceptance, bisection along the edge and the fallback copy (see
// node_check.hpp).
#include "voronoi/detail/node_check.hpp"

#include <algorithm>
#include <cmath>

#include "voronoi/detail/root_selection.hpp"

namespace zt::vd::geo {
namespace {

Point2d lerp(Point2d a, Point2d b, double u) { return {a.x + (b.x - a.x) * u, a.y + (b.y - a.y) * u}; }

// The point and the segment of a parabolic edge, or null when e is straight.
bool parabolic(const EdgeFrame& e, const PointSite*& p, const SegSite*& s) {
  if (e.left.kind == kKindPnt && e.right.kind == kKindSeg) {
    p = &e.left.pnt;
    s = &e.right.seg;
  } else if (e.left.kind == kKindSeg && e.right.kind == kKindPnt) {
    p = &e.right.pnt;
    s = &e.left.seg;
  } else {
    return false;
  }
  return !s->has_end(p->index) && std::fabs(s->D(p->p)) > kOnSiteTol;
}

// Positive where the new site is farther than the edge's own sites, and
// beyond the new segment's strip, where it cannot claim the point.
double excess(const EdgeFrame& e, const SiteRef& s, Point2d x) {
  return s.strip_dist(x, 0.0) - left_clearance(e, x);
}

}  // namespace

Point2d edge_point(const EdgeFrame& e, double u) {
  const Point2d k = e.kept().p;
  const Point2d g = e.gone().p;
  const PointSite* p = nullptr;
  const SegSite* s = nullptr;
  if (!parabolic(e, p, s)) return lerp(k, g, u);
  const double lk = s->lambda(k);
  const double lg = s->lambda(g);
  const double l = lk + (lg - lk) * u;
  const Point2d foot{s->p1.x + l * s->b, s->p1.y - l * s->a};
  const double dp = s->D(p->p);
  const double h = norm2(sub(foot, p->p)) / (2.0 * std::fabs(dp));
  const double side = dp > 0.0 ? 1.0 : -1.0;
  return {foot.x + side * h * s->a, foot.y + side * h * s->b};
}

bool node_is_sound(const EdgeFrame& e, const SiteRef& s, Point2d n) {
  if (!std::isfinite(n.x) || !std::isfinite(n.y)) return false;
  if (extent_on_edge(e, n) > kNodeCheckTol) return false;
  const double dl = e.left.strip_dist(n, kNodeCheckTol);
  const double dr = e.right.strip_dist(n, kNodeCheckTol);
  const double ds = s.strip_dist(n, kNodeCheckTol);
  const double tol = kNodeCheckTol * (1.0 + std::max({dl, dr, ds}));
  return std::fabs(dl - dr) <= tol && std::fabs(dl - ds) <= tol && std::fabs(dr - ds) <= tol;
}

bool bisect_on_edge(const EdgeFrame& e, const SiteRef& s, NodeResult& out) {
  if (e.left.kind != kKindPnt && e.left.kind != kKindSeg) return false;
  if (e.right.kind != kKindPnt && e.right.kind != kKindSeg) return false;
  double lo = 0.0;
  double hi = 1.0;
  // Where the new site touches the edge tangentially (a segment starting
  // at one of the edge's points) the excess vanishes to second order, and
  // rounding decides its sign within a stretch of about √ε; counting the
  // rounding band as conflict finds the point where the conflict begins.
  const auto conflicts = [&](double u) {
    const Point2d x = edge_point(e, u);
    return excess(e, s, x) <= kBisectNoise * (1.0 + left_clearance(e, x));
  };
  if (excess(e, s, edge_point(e, lo)) < 0.0 || !conflicts(hi)) return false;
  for (int i = 0; i < kBisectSteps && hi - lo > 0.0; ++i) {
    const double mid = 0.5 * (lo + hi);
    if (mid <= lo || mid >= hi) break;
    if (!conflicts(mid)) {
      lo = mid;
    } else {
      hi = mid;
    }
  }
  const Point2d n = edge_point(e, 0.5 * (lo + hi));
  if (!node_is_sound(e, s, n)) return false;
  out.n = n;
  out.r = left_clearance(e, n);
  out.copied = false;
  return true;
}

bool copy_kept_node(const EdgeFrame& e, NodeResult& out) {
  out.n = e.kept().p;
  out.r = e.kept().r;
  out.copied = true;
  return true;
}

bool finish_node(const EdgeFrame& e, const SiteRef& s, Point2d n, double r, NodeResult& out) {
  if (node_is_sound(e, s, n)) {
    out.n = n;
    out.r = r;
    return true;
  }
  return search_or_copy(e, s, out);
}

bool search_or_copy(const EdgeFrame& e, const SiteRef& s, NodeResult& out) {
  if (bisect_on_edge(e, s, out)) return true;
  return copy_kept_node(e, out);
}

}  // namespace zt::vd::geo
