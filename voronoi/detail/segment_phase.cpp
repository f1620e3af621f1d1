// Segment phase: insertion of each segment into the diagram, and the final
// splitting of edges at segment end points.
#include "voronoi/detail/segment_phase.hpp"

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/node_on_edge.hpp"
#include "voronoi/detail/segment_insertion.hpp"

namespace zt::vd {

void InsertSegment(std::int32_t s) {
  Engine& g = Vd();
  // The orientation memory of the point-segment-segment construction starts
  // afresh with every segment, so no result depends on earlier insertions.
  g.pssOrientByKeptNode = false;
  ResetInsertionMarks();
  SegmentInsertion si;
  si.s = s;
  si.i1 = g.segments[s].i1;
  si.i2 = g.segments[s].i2;
  si.line = SiteFromRecords(s, SEG).seg;
  bool done = FindStartNodes(si) && GrowDeletedTree(si) && MakeTree(si) && RebuildRegion(si);
  ResetInsertionMarks();
  if (!done && !g.restartPending) {
    // Given up without a repair: the diagram stays as it was, without this
    // segment, and the computation is marked as recovered.
    RemoveDegree2Nodes();
    g.recoveryMode = true;
  }
}

void SplitAtSegmentEndPoints() {
  Engine& g = Vd();
  for (std::int32_t s = 0; s < g.segments.count; ++s) SplitRegionAtEndPoints(s);
}

}  // namespace zt::vd
