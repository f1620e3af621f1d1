// The initial diagram (see initial_diagram.hpp).
#include "voronoi/detail/initial_diagram.hpp"

#include <algorithm>
#include <cfloat>
#include <cmath>

#include "voronoi/detail/circumcentre.hpp"
#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/fatal.hpp"
#include "voronoi/detail/nearest_search.hpp"

namespace zt::vd {

void BuildInitialDiagram() {
  Engine& g = Vd();
  ++g.generation;
  g.upToDate = false;
  const std::int64_t m = std::max(g.points.count, g.segments.count);
  // Whatever the arrays held is dropped below: not copied when they grow.
  g.nodes.ReserveEmpty(4 * m);
  g.edges.ReserveEmpty(6 * m);
  g.freeNodes.Reserve(kFreeStackGrowth);
  g.freeEdges.Reserve(kFreeStackGrowth);
  g.nodes.count = g.edges.count = g.freeNodes.count = g.freeEdges.count = 0;

  const std::int32_t n = g.points.count;
  const std::int32_t c0 = 0, c1 = 1, c2 = n - 1, c3 = n - 2, p = kInitialDiagramPoint;
  const std::int32_t tri[4][3] = {{c0, c1, p}, {c1, p, c2}, {p, c3, c2}, {c0, p, c3}};
  double cx[4], cy[4], cr[4];
  for (int i = 0; i < 4; ++i) {
    // Corners lie at least a box extent beyond every caller point, so these
    // triangles are never degenerate.
    if (!Circumcentre(tri[i][0], tri[i][1], tri[i][2], cx[i], cy[i], cr[i]))
      VdFatal("ComputeVD() - degenerate initial diagram!");
  }
  const double far = std::sqrt(DBL_MAX / kFarNodeDistanceDivisor);
  NewNode(cx[0] - far, cy[0], 0.0);
  NewNode(cx[1], cy[1] + far, 0.0);
  NewNode(cx[2] + far, cy[2], 0.0);
  NewNode(cx[3], cy[3] - far, 0.0);
  for (int i = 0; i < 4; ++i) NewNode(cx[i], cy[i], cr[i]);

  struct E {
    std::int32_t n1, n2, lft, rgt, ltype, rtype;
    std::int32_t s_ccw, s_cw, e_ccw, e_cw;
  };
  const E edges[12] = {
      {0, 4, c1, c0, PNT, PNT, 8, 11, 7, 4},
      {1, 5, c2, c1, PNT, PNT, 9, 8, 4, 5},
      {2, 6, c3, c2, PNT, PNT, 10, 9, 5, 6},
      {3, 7, c0, c3, PNT, PNT, 11, 10, 6, 7},
      {4, 5, c1, p, PNT, PNT, 0, 7, 5, 1},
      {5, 6, c2, p, PNT, PNT, 1, 4, 6, 2},
      {6, 7, c3, p, PNT, PNT, 2, 5, 7, 3},
      {7, 4, c0, p, PNT, PNT, 3, 6, 4, 0},
      {0, 1, kNone, c1, kNoSiteKind, PNT, 11, 0, 1, 9},
      {1, 2, kNone, c2, kNoSiteKind, PNT, 8, 1, 2, 10},
      {2, 3, kNone, c3, kNoSiteKind, PNT, 9, 2, 3, 11},
      {3, 0, kNone, c0, kNoSiteKind, PNT, 10, 3, 0, 8},
  };
  for (const E& e : edges) {
    const std::int32_t i = NewEdge(e.n1, e.n2, e.lft, e.rgt, e.ltype, e.rtype);
    EdgeRecord& r = g.edges[i];
    r.s_ccw = e.s_ccw;
    r.s_cw = e.s_cw;
    r.e_ccw = e.e_ccw;
    r.e_cw = e.e_cw;
  }
  g.points[c0].vd = 11;
  g.points[c1].vd = 8;
  g.points[p].vd = 4;
  g.points[c2].vd = 9;
  g.points[c3].vd = 10;
  for (int i = 0; i < 4; ++i) {
    g.nodes[i].edge = i;
    g.nodes[i + 4].edge = i;
  }
  InsertNearest(p);
}

}  // namespace zt::vd
