// The facade of the Voronoi engine (see engine.hpp).
#include "voronoi/engine.hpp"

#include <cfloat>
#include <cmath>

#include "voronoi/detail/compute_vd.hpp"
#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/nearest_search.hpp"
#include "voronoi/detail/offset_state.hpp"
#include "voronoi/detail/point_insertion.hpp"

namespace zt {

using namespace zt::vd;

namespace {

// A corner dummy value in points-only mode replaces a bound factor of 1.
constexpr std::int32_t kPointsOnlyBoundFactor = 5;

// Sites added after a computation: the stored coordinates are internal and
// the corner points occupy the last two slots. Bring the input back to the
// state the caller built, so that the next computation sees every site in
// user coordinates.
void ReopenInput() {
  Engine& g = Vd();
  if (!g.dummiesAdded) return;
  if (g.scaled) {
    for (std::int32_t i = 0; i < g.points.count; ++i) {
      g.points[i].x = ToUserX(g.points[i].x);
      g.points[i].y = ToUserY(g.points[i].y);
    }
    for (std::int32_t i = 0; i < g.arcs.count; ++i) {
      ArcRecord& a = g.arcs[i];
      a.cx = ToUserX(a.cx);
      a.cy = ToUserY(a.cy);
      a.radius /= g.scale;
    }
  }
  g.points.count -= 2;  // the two trailing corner points
  g.scale = 1.0;
  g.shiftX = g.shiftY = 0.0;
  g.scaled = false;
  g.dummiesAdded = false;
  g.frameSet = false;
  g.bboxSet = false;
  ClearDiagram();
}

void ResetPointDiagramFields(PointRecord& p) {
  p.vd = kNone;
  p.node = kNone;
  p.marked = 0;
  p.hasNode = 0;
}

}  // namespace

bool VD_Initialize() {
  Engine& g = Vd();
  if (g.initialised) return false;
  g.scalingOption = true;
  g.checkAllRepair = false;
  g.LARGE = std::sqrt(DBL_MAX) / 100.0;
  g.initialised = true;
  return true;
}

void VD_Reset() {
  Engine& g = Vd();
  if (!g.initialised) return;
  g.points.count = 0;
  g.segments.count = 0;
  g.arcs.count = 0;
  g.scale = 1.0;
  g.shiftX = g.shiftY = 0.0;
  g.scaled = false;
  g.bboxSet = false;
  g.frameSet = false;
  g.dummiesAdded = false;
  g.arcsApproximated = 0;
  ClearDiagram();  // no site left whose fields it would reset
  g.computing = false;
  g.restartPending = false;
  g.offsetNewRequest = true;
  ResetOffsetState();
  g.offsetCurves.count = 0;
  g.offsetElements.count = 0;
  g.medialAxisComputed = false;
  g.isolatedPoints = false;
  ReleaseNearestSearch();
  g.xrefBuilt = false;
}

void VD_Terminate() {
  Engine& g = Vd();
  if (!g.initialised) return;
  VD_Reset();
  g.points.Free();
  g.segments.Free();
  g.arcs.Free();
  g.nodes.Free();
  g.edges.Free();
  g.freeNodes.Free();
  g.freeEdges.Free();
  g.degree2.Free();
  g.insertionOrder.Free();
  g.xrefStart.Free();
  g.xrefEnds.Free();
  g.xrefMerged.Free();
  g.markedSites.Free();
  g.checkedNodes.Free();
  g.deletedNodes.Free();
  g.boundaryEdges.Free();
  g.newNodes.Free();
  g.stack.Free();
  g.offsetCurves.Free();
  g.offsetElements.Free();
  FreeOffsetState();
  ReleaseInsertionScratch();
  g.initialised = false;
}

std::int32_t API_AddPoint(double x, double y, std::int32_t tag) {
  Engine& g = Vd();
  ReopenInput();
  g.upToDate = false;
  PointRecord p{};
  p.x = x;
  p.y = y;
  ResetPointDiagramFields(p);
  p.deleted = 0;
  p.arc = kNone;
  p.tag = tag;
  if (g.points.count == 0) {
    PointRecord reserved = p;
    reserved.tag = -1;
    g.points.Append(reserved, kSiteGrowth);
    g.points.Append(reserved, kSiteGrowth);
  }
  return g.points.Append(p, kSiteGrowth);
}

std::int32_t API_AddSegment(std::int32_t i1, std::int32_t i2, std::int32_t tag) {
  Engine& g = Vd();
  ReopenInput();
  const auto callerPoint = [&](std::int32_t i) { return i >= 2 && i < g.points.count; };
  if (!callerPoint(i1) || !callerPoint(i2)) return -1;
  g.upToDate = false;
  SegmentRecord s{};
  s.i1 = i1;
  s.i2 = i2;
  s.flag = 0;
  s.directions = 1;
  s.vd = kNone;
  s.tag = tag;
  s.arc = kNone;
  return g.segments.Append(s, kSiteGrowth);
}

bool VD_ComputeDiagram(bool clean, std::int32_t boundFactor, bool pointsOnly, bool keepArcLinks,
                       std::int32_t sampleDensity, std::int32_t arcPieces, double arcTolerance,
                       double arcTolerance2, bool autoArcTolerance) {
  Engine& g = Vd();
  // A second computation of the same input starts from the caller's input.
  ReopenInput();
  // Refuse what the scaling and the search grid cannot take: a non-finite
  // coordinate would make the scaling loop spin and the grid index garbage.
  const std::int32_t realEnd = g.dummiesAdded ? g.points.count - 2 : g.points.count;
  for (std::int32_t i = 2; i < realEnd; ++i) {
    const PointRecord& p = g.points[i];
    if (!(std::fabs(p.x) <= kMaxInputMagnitude) || !(std::fabs(p.y) <= kMaxInputMagnitude)) {
      g.upToDate = false;
      return false;
    }
  }
  if (boundFactor < 1) boundFactor = 1;
  if (!pointsOnly && g.segments.count == 0 && g.arcs.count == 0) pointsOnly = true;
  if (pointsOnly && boundFactor == 1) boundFactor = kPointsOnlyBoundFactor;
  API_ComputeVD(false, true, false, boundFactor, sampleDensity, arcPieces, nullptr, clean,
                keepArcLinks, arcTolerance, arcTolerance2, autoArcTolerance, pointsOnly, false,
                nullptr);
  return g.upToDate;
}

void API_ComputeVD(bool writeOutput, bool newInput, bool timing, std::int32_t boundFactor,
                   std::int32_t sampleDensity, std::int32_t arcPieces, const char* outputFile,
                   bool clean, bool keepArcLinks, double arcTolerance, double arcTolerance2,
                   bool autoArcTolerance, bool pointsOnly, bool printCells, const char* cellsFile) {
  ComputeArgs a;
  a.writeOutput = writeOutput;
  a.newInput = newInput;
  a.timing = timing;
  a.boundFactor = boundFactor;
  a.sampleDensity = sampleDensity;
  a.arcPieces = arcPieces;
  a.outputFile = outputFile;
  a.clean = clean;
  a.keepArcLinks = keepArcLinks;
  a.arcTolerance = arcTolerance;
  a.arcTolerance2 = arcTolerance2;
  a.autoArcTolerance = autoArcTolerance;
  a.pointsOnly = pointsOnly;
  a.printCells = printCells;
  a.cellsFile = cellsFile;
  bool finished = false;
  ComputeVD(a, finished);
  a.newInput = false;
  while (Vd().restartPending) ComputeVD(a, finished);
}

bool VD_IsUpToDate() { return Vd().upToDate; }

std::int32_t VD_GetRestartCount() { return Vd().restartCount; }
bool VD_InRecoveryMode() { return Vd().recoveryMode; }
std::int32_t VD_GetDuplicateCount() { return Vd().duplicatePoints; }

std::int32_t VD_GetNodeCount() { return Vd().nodes.count; }
std::int32_t VD_GetEdgeCount() { return Vd().edges.count; }
std::int32_t VD_GetPointCount() { return Vd().points.count; }
std::int32_t VD_GetPointTag(std::int32_t point) {
  return Vd().points.Valid(point) ? Vd().points[point].tag : -1;
}
std::int32_t VD_GetSegmentTag(std::int32_t segment) {
  return Vd().segments.Valid(segment) ? Vd().segments[segment].tag : -1;
}

VD_NodeInfo VD_GetNode(std::int32_t i) {
  const Engine& g = Vd();
  VD_NodeInfo info{};
  if (!g.nodes.Valid(i)) return info;
  const NodeRecord& n = g.nodes[i];
  info.live = n.status != DELETED;
  info.x = ToUserX(n.x);
  info.y = ToUserY(n.y);
  info.r = (g.nodeRadiiSquared ? std::sqrt(std::fmax(n.r, 0.0)) : n.r) / g.scale;
  info.degree2 = n.degree2 != 0;
  return info;
}

VD_EdgeInfo VD_GetEdge(std::int32_t i) {
  const Engine& g = Vd();
  VD_EdgeInfo info{};
  if (!g.edges.Valid(i)) return info;
  const EdgeRecord& e = g.edges[i];
  info = VD_EdgeInfo{e.deleted == 0, e.n1, e.n2, e.lft, e.ltype, e.rgt, e.rtype};
  return info;
}

}  // namespace zt
