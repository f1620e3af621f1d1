// Segment phase: insertion of each segment into the diagram, and the final
// splitting of edges at segment end points.
#include "voronoi/detail/segment_phase.hpp"

#include <algorithm>
#include <cmath>

#include "voronoi/detail/diagram.hpp"
#include "voronoi/detail/insertion_order.hpp"
#include "voronoi/detail/node_on_edge.hpp"
#include "voronoi/detail/segment_insertion.hpp"

namespace zt::vd {

namespace {

// Segments whose mean length exceeds this many times the mean spacing of
// the points at their start get the partly sorted random order. Measured
// ratios: polygons with finely sampled contours 0.02-0.05, a pocket of spiky
// stars 2.3 (index order 12 % faster), star polygons 13 and 32 (random
// rounds 10 % and 35 % faster).
constexpr double kLongSegmentRatio = 6.0;
// Segments sampled for that ratio, spread evenly over the indices.
constexpr std::int32_t kRatioSamples = 64;
// Region edges looked at per sampled point (a point's region has six on
// average).
constexpr std::int64_t kRatioRegionEdges = 64;
// The first round of the random order, left unsorted.
constexpr std::int32_t kFirstSegmentRound = 32;

// Mean length of the sampled segments over the mean distance from their
// start points to the neighbouring input points in the diagram of points
// (0 when nothing could be sampled).
double LengthOverSpacing() {
  Engine& g = Vd();
  const std::int32_t n = g.segments.count;
  const std::int32_t samples = std::min(n, kRatioSamples);
  const std::int32_t realEnd = g.points.count - 2;  // the last two slots are corners
  double sumLength = 0.0, sumSpacing = 0.0;
  for (std::int32_t k = 0; k < samples; ++k) {
    const SegmentRecord& s = g.segments[static_cast<std::int32_t>(std::int64_t{k} * n / samples)];
    const std::int32_t p = s.i1;
    const std::int32_t e0 = g.points[p].vd;
    if (e0 < 0) continue;
    double sum = 0.0;
    int count = 0;
    std::int32_t e = e0;
    std::int64_t guard = 0;
    do {
      const EdgeRecord& er = g.edges[e];
      const bool onLeft = er.lft == p && er.ltype == PNT;
      const std::int32_t q = onLeft ? er.rgt : er.lft;
      const std::int32_t kind = onLeft ? er.rtype : er.ltype;
      if (kind == PNT && q >= 2 && q < realEnd) {
        sum += std::hypot(g.points[q].x - g.points[p].x, g.points[q].y - g.points[p].y);
        ++count;
      }
      e = NextRegionEdge(e, p, PNT);
    } while (e >= 0 && e != e0 && ++guard < kRatioRegionEdges);
    if (count == 0) continue;
    sumLength += s.length;
    sumSpacing += sum / count;
  }
  return sumSpacing > 0.0 ? sumLength / sumSpacing : 0.0;
}

}  // namespace

void BuildSegmentOrder() {
  Engine& g = Vd();
  BuildOrder(0, g.segments.count);
  std::int32_t* order = g.insertionOrder.data;
  const std::int32_t n = g.insertionOrder.count;
  g.orderPresorted = true;
  if (!(LengthOverSpacing() > kLongSegmentRatio)) return;
  if (n < 2 * kFirstSegmentRound) {
    g.orderPresorted = false;  // drawn at random, one draw at a time
    return;
  }
  for (std::int32_t i = n - 1; i > 0; --i) {
    const std::int32_t j = static_cast<std::int32_t>(g.random() % static_cast<std::uint32_t>(i + 1));
    std::swap(order[i], order[j]);
  }
  for (std::int32_t hi = n; hi >= 2 * kFirstSegmentRound; hi /= 2) std::sort(order + hi / 2, order + hi);
}

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

std::int32_t SplitAtSegmentEndPoints() {
  Engine& g = Vd();
  std::int32_t splits = 0;
  // The regions lie scattered in memory: the walk of one region overlaps
  // with fetching where the next one starts.
  constexpr std::int32_t kAhead = 4;
  for (std::int32_t s = 0; s < g.segments.count; ++s) {
    if (s + kAhead < g.segments.count && g.segments[s + kAhead].vd >= 0) g.edges.Prefetch(g.segments[s + kAhead].vd);
    splits += SplitRegionAtEndPoints(s);
  }
  return splits;
}

}  // namespace zt::vd
