// Point-point bisector splitting (see bisector_split.hpp).
#include "voronoi/detail/bisector_split.hpp"

#include <cassert>
#include <cmath>

#include "voronoi/detail/diagram.hpp"

namespace zt::vd {

void SplitPointBisectors() {
  Engine& g = Vd();
  if (g.bisectorsSplit) return;
  assert(!g.nodeRadiiSquared);
  const std::int32_t edgeCount = g.edges.count;  // new edges need no split
  for (std::int32_t e = 0; e < edgeCount; ++e) {
    const EdgeRecord r = g.edges[e];
    if (r.deleted || r.ltype != PNT || r.rtype != PNT || r.lft < 0 || r.rgt < 0) continue;
    if (g.nodes[r.n1].degree2 || g.nodes[r.n2].degree2) continue;
    const PointRecord& L = g.points[r.lft];
    const PointRecord& R = g.points[r.rgt];
    const auto side = [&](const NodeRecord& n) {
      return (L.x - R.x) * (R.y - n.y) - (L.y - R.y) * (R.x - n.x);
    };
    if (!(side(g.nodes[r.n1]) < 0.0 && side(g.nodes[r.n2]) > 0.0)) continue;
    const double dx = L.x - R.x, dy = L.y - R.y;
    const std::int32_t m = NewNode(0.5 * (L.x + R.x), 0.5 * (L.y + R.y), 0.5 * std::sqrt(dx * dx + dy * dy));
    SplitEdge(e, m, false);
  }
  g.bisectorsSplit = true;
}

}  // namespace zt::vd
