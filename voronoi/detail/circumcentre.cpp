// Circumcentre of three point sites (see circumcentre.hpp).
#include "voronoi/detail/circumcentre.hpp"

#include <algorithm>
#include <cmath>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {

void RecordSuspect(std::int32_t a, std::int32_t b) {
  SuspectPair& s = Vd().suspect;
  s = SuspectPair{true, a, PNT, b, PNT};
}

}  // namespace

bool Circumcentre(std::int32_t i, std::int32_t j, std::int32_t k, double& x, double& y, double& r2) {
  std::int32_t idx[3] = {i, j, k};
  std::sort(idx, idx + 3);
  if (idx[0] == idx[1] || idx[1] == idx[2]) return false;
  const Engine& g = Vd();
  const PointRecord* p[3] = {&g.points[idx[0]], &g.points[idx[1]], &g.points[idx[2]]};
  if (p[0]->arc >= 0 && p[0]->arc == p[1]->arc && p[1]->arc == p[2]->arc) {
    const ArcRecord& a = g.arcs[p[0]->arc];
    x = a.cx;
    y = a.cy;
    r2 = a.radius * a.radius;
    return true;
  }
  constexpr double kSuspect2 = kSuspectDistance * kSuspectDistance;
  // Squared side lengths, side m opposite vertex m; computed once for the
  // closeness test and the choice of bisectors.
  double side2[3];
  for (int m = 0; m < 3; ++m) {
    const PointRecord& a = *p[(m + 1) % 3];
    const PointRecord& b = *p[(m + 2) % 3];
    side2[m] = (b.x - a.x) * (b.x - a.x) + (b.y - a.y) * (b.y - a.y);
  }
  // Pairs (0,1), (1,2), (2,0) in turn: the first too close is the suspect.
  for (int m = 0; m < 3; ++m) {
    if (side2[(m + 2) % 3] <= kSuspect2) {
      RecordSuspect(idx[m], idx[(m + 1) % 3]);
      return false;
    }
  }
  // Intersect the two bisectors that are furthest from parallel: those of
  // the two sides meeting at the vertex whose angle has the largest sine.
  // Twice the triangle's area is the same cross product at every vertex, so
  // that vertex is the one whose two sides have the smallest product of
  // lengths: the vertex opposite the longest side.
  const int best = side2[0] >= side2[1] ? (side2[0] >= side2[2] ? 0 : 2) : (side2[1] >= side2[2] ? 1 : 2);
  const PointRecord& a = *p[best];
  const PointRecord& b = *p[(best + 1) % 3];
  const PointRecord& c = *p[(best + 2) % 3];
  const double ux = b.x - a.x, uy = b.y - a.y, vx = c.x - a.x, vy = c.y - a.y;
  const double d = 2.0 * (ux * vy - uy * vx);
  if (d == 0.0) return false;  // collinear: no finite centre
  const double u2 = ux * ux + uy * uy, v2 = vx * vx + vy * vy;
  const double ox = (vy * u2 - uy * v2) / d;
  const double oy = (ux * v2 - vx * u2) / d;
  if (!std::isfinite(ox) || !std::isfinite(oy)) return false;
  x = a.x + ox;
  y = a.y + oy;
  r2 = ox * ox + oy * oy;
  return true;
}

}  // namespace zt::vd
