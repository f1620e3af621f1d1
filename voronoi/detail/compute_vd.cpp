// ComputeVD (see compute_vd.hpp).
#include "voronoi/detail/compute_vd.hpp"

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

void ClearDiagram() {
  Engine& g = Vd();
  g.nodes.count = 0;
  g.edges.count = 0;
  g.freeNodes.count = 0;
  g.freeEdges.count = 0;
  g.degree2.count = 0;
  g.nodeRadiiSquared = true;
  g.bisectorsSplit = false;
  g.upToDate = false;
  g.insertionOrder.count = 0;
  g.orderRemaining = 0;
  g.markedSites.count = 0;
  g.checkedNodes.count = 0;
  for (std::int32_t i = 0; i < g.points.count; ++i) {
    PointRecord& p = g.points[i];
    p.vd = kNone;
    p.node = kNone;
    p.marked = 0;
    p.hasNode = 0;
  }
  for (std::int32_t i = 0; i < g.segments.count; ++i) {
    g.segments[i].vd = kNone;
    g.segments[i].flag = 0;
  }
  for (std::int32_t i = 0; i < g.arcs.count; ++i) g.arcs[i].vd = kNone;
}

void ComputeVD(const ComputeArgs&, bool& finished) { finished = true; }

}  // namespace zt::vd
