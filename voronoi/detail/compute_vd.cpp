// ComputeVD (see compute_vd.hpp): start of a call, restarts, preparation of
// the input, and the phases, each resumable at its cursor.
#include "voronoi/detail/compute_vd.hpp"

#include <cassert>
#include <cmath>

#include "voronoi/detail/bisector_split.hpp"
#include "voronoi/detail/checker.hpp"
#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/fatal.hpp"
#include "voronoi/detail/initial_diagram.hpp"
#include "voronoi/detail/input_sweep.hpp"
#include "voronoi/detail/insertion_order.hpp"
#include "voronoi/detail/nearest_search.hpp"
#include "voronoi/detail/point_insertion.hpp"
#include "voronoi/detail/point_lookahead.hpp"
#include "voronoi/detail/preprocess.hpp"
#include "voronoi/detail/segment_phase.hpp"

namespace zt::vd {

namespace {

void EmptyInsertionLists() {
  Engine& g = Vd();
  g.insertionOrder.count = 0;
  g.orderRemaining = 0;
  g.markedSites.count = 0;
  g.checkedNodes.count = 0;
}

void SquareRootRadii() {
  Engine& g = Vd();
  if (!g.nodeRadiiSquared) return;
  for (std::int32_t n = 0; n < g.nodes.count; ++n) g.nodes[n].r = std::sqrt(std::fmax(g.nodes[n].r, 0.0));
  g.nodeRadiiSquared = false;
}

// Returns false when the call must return (restart pending).
bool PointPhase() {
  Engine& g = Vd();
  if (g.pointsDone) return true;
  const std::int32_t end = g.points.count - 2;
  if (g.pointsFirstPass) {
    g.pointsFirstPass = false;
    BuildInitialDiagram();
    BuildPointOrder(3, end);
  }
  // A presorted order finds nearest points by walking the diagram: the
  // search structure is not needed.
  if (g.orderPresorted) ReleaseNearestSearch();
  {
    PointLookahead ahead(g.orderPresorted, kInitialDiagramPoint);
    Nearest nearest;
    for (std::int32_t p = ahead.Next(nearest); p >= 0; p = ahead.Next(nearest)) {
      InsertPoint(p, nearest, ahead);
      if (g.restartPending) {
        ahead.Abandon();
        return false;
      }
      if (g.insertionObserver) g.insertionObserver(g.insertionObserverContext, p);
    }
  }
  ReleaseNearestSearch();
  ReleaseCrossReference();
  if (g.segments.count > 0 || g.arcs.count > 0) {
    SquareRootRadii();
    SplitPointBisectors();
  }
  g.pointsDone = true;
  return true;
}

bool SegmentPhase() {
  Engine& g = Vd();
  if (g.segmentsDone) return true;
  if (g.segmentsFirstPass) {
    g.segmentsFirstPass = false;
    BuildSegmentOrder();
  }
  while (g.orderRemaining > 0) {
    const std::int32_t s = DrawNext().entry;
    InsertSegment(s);
    if (g.restartPending) return false;
    // Segments reach the test hook as -1 - index.
    if (g.insertionObserver) g.insertionObserver(g.insertionObserverContext, -1 - s);
  }
  ReleaseCrossReference();  // built on demand by the start-node search
  g.segmentsDone = true;
  return true;
}

// Every live node at finite coordinates with a finite clearance of at
// least zero. A node that is not would put a wrong diagram (and offsets
// from nowhere) behind a success; one pass over the nodes costs little
// beside building them.
bool NodesFinite() {
  const Engine& g = Vd();
  for (std::int32_t n = 0; n < g.nodes.count; ++n) {
    const NodeRecord& r = g.nodes[n];
    if (r.status == DELETED) continue;
    if (!std::isfinite(r.x) || !std::isfinite(r.y) || !std::isfinite(r.r) || !(r.r >= 0.0)) return false;
  }
  return true;
}

}  // namespace

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
  EmptyInsertionLists();
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

void ComputeVD(const ComputeArgs& args, bool& finished) {
  Engine& g = Vd();
  finished = false;
  // 1. Nothing stored.
  if (g.points.count == 0) {
    g.computing = false;
    finished = true;
    return;
  }
  bool restarting = false;
  if (g.restartPending) {
    // 2. Restart: count it, empty the diagram, clean whatever `clean` says.
    if (++g.restartCount > kMaxRestarts) VdFatal("ComputeVD() - aborting computation -- too many restarts!");
    ClearDiagram();
    restarting = true;
  } else if (!args.newInput) {
    // 3. Resume a computation under way.
    if (!g.computing) {
      finished = true;
      return;
    }
  } else {
    g.duplicatePoints = g.removedSegments = g.removedArcs = 0;
    g.restartCount = 0;
    g.frameSet = false;
    g.random.seed(0);
    g.recoveryMode = false;
    g.usedQuadtree = false;
    g.inputSorted = false;
    ClearDiagram();
  }
  const bool resume = !restarting && !args.newInput;
  if (!resume) {
    // 4.
    g.computing = true;
    g.restartPending = false;
    g.errorFlag = false;
    g.dataModified = false;
    g.suspect.set = false;
    g.pointsFirstPass = g.segmentsFirstPass = g.arcsFirstPass = true;
    g.pointsDone = false;
    g.nearestRescans = 0;
    g.segmentsDone = g.segments.count == 0 || args.pointsOnly;
    g.arcsDone = g.arcs.count == 0 || args.pointsOnly;
    // 5. Frame: bounding box and scaling of a new computation.
    if (!g.frameSet) {
      ComputeBoundingBox();
      if (g.scalingOption) ApplyScaling();
    }
    // 6. Only points wanted: forget the rest.
    if (args.pointsOnly) {
      g.segments.count = 0;
      g.arcs.count = 0;
      g.isolatedPoints = true;
    }
    // 7. Cleaning.
    const bool firstCall = !g.dummiesAdded;
    if (firstCall) AddDummySlots();
    if (restarting) {
      // A repair asked for this restart: mend every other defect of the
      // input too before building again, not one per restart.
      RepairWholeInput();
      g.restartPending = false;
    }
    if (restarting || args.clean) CleanInput(args.clean);
    // 8. Segment line data.
    if (g.segments.count > 0) ComputeSegmentLineData();
    // 9. Corners.
    if (!g.frameSet) PlaceCornerDummies(args.boundFactor);
    // 10-11.
    if (g.restartPending) return;
    BuildNearestSearch(g.points.count, g.minX, g.minY, g.maxX, g.maxY);
  }

  // 12-13. Phases.
  if (!PointPhase()) return;
  if (!SegmentPhase()) return;
  // 14.
  if (!g.arcsDone && g.arcs.count > 0)
    VdFatal("Compute() - insertion of circular arcs into VD not yet supported!");
  g.arcsDone = true;
  // 15. Needed after a fallback only (see SplitAtSegmentEndPoints): the
  // pass walks every segment's region, records scattered over the whole
  // diagram, a tenth of a large input's time. Debug builds run it always and
  // check that it found nothing to split (a pass that splits nothing leaves
  // the diagram as it was).
  if (g.segments.count > 0 && g.recoveryMode) SplitAtSegmentEndPoints();
  assert(g.segments.count == 0 || g.recoveryMode || SplitAtSegmentEndPoints() == 0);
  // 16.
  if (g.segments.count == 0 && g.arcs.count == 0) {
    g.isolatedPoints = true;
  } else {
    g.isolatedPoints = false;
    for (std::int32_t i = 2; i < g.points.count - 2; ++i) {
      if (!g.points[i].deleted && !g.points[i].hasNode) {
        g.isolatedPoints = true;
        break;
      }
    }
  }
  // 17. Arc links of approximated arcs.
  if ((args.pointsOnly || !args.keepArcLinks) && g.arcsApproximated > 0) {
    for (std::int32_t i = 0; i < g.points.count; ++i) g.points[i].arc = kNone;
    for (std::int32_t i = 0; i < g.segments.count; ++i) g.segments[i].arc = kNone;
    g.arcsApproximated = 0;
  }
  // 18-19. Debug builds check the diagram's topology before declaring it up
  // to date (not after a forced fallback, whose diagram is only as good as
  // the fallback could make it).
  assert(g.recoveryMode || CheckDiagram(CheckOptions{false, false, true}).empty());
  // A fallback builds what it can; its diagram counts as computed only when
  // it passes the checker's local tests (topology, every node equidistant
  // from its sites, no site across an edge inside a node's circle, every
  // point with a region). Otherwise, or with a node of no finite place or
  // clearance, the computation ends without a diagram rather than report a
  // wrong one.
  if (!NodesFinite() || (g.recoveryMode && !CheckDiagram(CheckOptions{true, false, true}).empty())) {
    g.upToDate = false;
    g.computing = false;
    finished = true;
    return;
  }
  g.upToDate = true;
  g.computing = false;
  finished = true;
}

}  // namespace zt::vd
