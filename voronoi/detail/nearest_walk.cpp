// Nearest site by a walk through the diagram (see nearest_walk.hpp).
#include "voronoi/detail/nearest_walk.hpp"

#include <limits>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

Nearest WalkToNearest(std::int32_t from, std::int32_t p) {
  Engine& g = Vd();
  const double x = g.points[p].x, y = g.points[p].y;
  const auto dist2 = [&](std::int32_t s) {
    const double dx = g.points[s].x - x, dy = g.points[s].y - y;
    return dx * dx + dy * dy;
  };
  Nearest at{from, dist2(from)};
  // Every step is to a strictly nearer site, so no site is visited twice.
  for (std::int32_t visits = 0; visits < g.points.count && at.dist2 > kCoincidentDist2; ++visits) {
    Nearest best = at;
    const std::int32_t start = g.points[at.point].vd;
    std::int32_t e = start;
    // A region has at most as many edges as the diagram.
    for (std::int32_t steps = 0; e >= 0 && steps <= g.edges.count; ++steps) {
      const EdgeRecord& r = g.edges[e];
      std::int32_t across, kind;
      if (r.lft == at.point && r.ltype == PNT) {
        across = r.rgt, kind = r.rtype, e = r.e_cw;
      } else if (r.rgt == at.point && r.rtype == PNT) {
        across = r.lft, kind = r.ltype, e = r.s_cw;
      } else {
        break;
      }
      if (kind == PNT && across >= 0) {
        const double d2 = dist2(across);
        if (d2 < best.dist2) best = Nearest{across, d2};
      }
      if (e == start) break;
    }
    if (best.point == at.point) break;
    at = best;
  }
  return at;
}

Nearest ScanNearest(std::int32_t p) {
  Engine& g = Vd();
  const double x = g.points[p].x, y = g.points[p].y;
  Nearest best{kNone, std::numeric_limits<double>::infinity()};
  for (std::int32_t i = 0; i < g.points.count; ++i) {
    const PointRecord& q = g.points[i];
    if (i == p || q.vd < 0 || q.deleted) continue;
    const double dx = q.x - x, dy = q.y - y;
    const double d2 = dx * dx + dy * dy;
    if (d2 < best.dist2) best = Nearest{i, d2};
  }
  return best;
}

}  // namespace zt::vd
