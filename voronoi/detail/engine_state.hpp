// The Voronoi engine's state, one instance per thread.
//
// The engine has no handle: every operation works on the calling thread's
// state, returned by Vd(). The state is created on the thread's first use and
// never destroyed; VD_Reset empties it keeping memory, VD_Terminate frees the
// arrays.
//
// Coordinates of sites are user coordinates until a computation applies the
// scaling transform in place; nodes are always in internal coordinates.
#pragma once

#include <cassert>
#include <cstdint>
#include <random>

#include "core/per_thread.hpp"
#include "voronoi/detail/records.hpp"
#include "voronoi/detail/storage.hpp"

namespace zt::vd {

class NearestPointSearch;

// Growth steps, in records.
inline constexpr std::int32_t kSiteGrowth = 32768;
inline constexpr std::int32_t kNodeGrowth = 65536;
inline constexpr std::int32_t kEdgeGrowth = 65536;
inline constexpr std::int32_t kFreeStackGrowth = 1024;
inline constexpr std::int32_t kDegree2Growth = 16;
inline constexpr std::int32_t kScratchGrowth = 1024;
inline constexpr std::int32_t kOffsetCurveGrowth = 1024;
inline constexpr std::int32_t kOffsetElementGrowth = 32768;

// A (site, kind) pair named by a failing geometric computation; the next
// input repair tests it first.
struct SuspectPair {
  bool set = false;
  std::int32_t site1 = -1;
  std::int32_t kind1 = -1;
  std::int32_t site2 = -1;
  std::int32_t kind2 = -1;
};

// The generator of the insertion orders. The point phase draws a few
// entries ahead of its insertions; values drawn but not used when a restart
// ends the phase are given back, so the next draws repeat them in their
// order and the sequence of values is that of drawing one at a time. A draw
// may also peek at values to come, to request the entries they will take.
struct OrderRandom {
  static constexpr int kMaxGivenBack = 16;
  static constexpr int kMaxPeek = 16;
  static constexpr int kPending = kMaxGivenBack + kMaxPeek + 1;

  std::mt19937 gen{0};
  // Values given back (first) and peeked at (after them), in the order the
  // next calls return them: a ring from `front`.
  std::uint32_t pending[kPending] = {};
  int front = 0;
  int count = 0;

  void seed(std::uint32_t s) {
    gen.seed(s);
    count = 0;
  }
  std::uint32_t operator()() {
    if (count == 0) return static_cast<std::uint32_t>(gen());
    const std::uint32_t v = pending[front];
    front = (front + 1) % kPending;
    --count;
    return v;
  }
  // Values are given back newest first.
  void GiveBack(std::uint32_t v) {
    assert(count < kPending);
    front = (front + kPending - 1) % kPending;
    pending[front] = v;
    ++count;
  }
  // The value the call after the next j calls will return (0 <= j < kMaxPeek).
  std::uint32_t Peek(int j) {
    assert(j >= 0 && j < kMaxPeek && count < kPending);
    while (count <= j) {
      pending[(front + count) % kPending] = static_cast<std::uint32_t>(gen());
      ++count;
    }
    return pending[(front + j) % kPending];
  }
};

struct Engine {
  // Life cycle and options.
  bool initialised = false;
  bool scalingOption = false;
  bool checkAllRepair = false;
  bool errorFlag = false;
  double LARGE = 0.0;

  // Input sites.
  RecordArray<PointRecord> points;
  RecordArray<SegmentRecord> segments;
  RecordArray<ArcRecord> arcs;

  // Scaling transform: internal = (user - shift) * scale.
  double scale = 1.0;
  double shiftX = 0.0;
  double shiftY = 0.0;
  bool scaled = false;

  // Bounding box of the stored points (internal coordinates once scaled).
  double minX = 0.0, maxX = 0.0, minY = 0.0, maxY = 0.0;
  bool bboxSet = false;
  bool frameSet = false;      // bbox, scaling and corners of this computation in place
  bool dummiesAdded = false;  // the four dummy slots exist
  double maxOffset = 0.0;     // internal units

  // Diagram.
  RecordArray<NodeRecord> nodes;
  RecordArray<EdgeRecord> edges;
  RecordArray<std::int32_t> freeNodes;
  RecordArray<std::int32_t> freeEdges;
  RecordArray<Degree2Record> degree2;
  bool nodeRadiiSquared = true;
  bool bisectorsSplit = false;
  bool upToDate = false;
  std::int32_t generation = 0;

  // Computation (ComputeVD).
  bool computing = false;
  bool restartPending = false;
  std::int32_t restartCount = 0;
  bool pointsDone = false, segmentsDone = false, arcsDone = false;
  bool pointsFirstPass = false, segmentsFirstPass = false, arcsFirstPass = false;
  RecordArray<std::int32_t> insertionOrder;
  std::int32_t orderRemaining = 0;  // entries of insertionOrder not yet drawn
  bool orderPresorted = false;      // drawn front to back (BuildPointOrder)
  std::int32_t nearestRescans = 0;  // brute-force checks of walk answers (nearest_walk.hpp)
  // The point phase's order: partly sorted (BuildPointOrder), or fully
  // random when false (kept for the checks that compare the two).
  bool presortPointOrder = true;
  bool dataModified = false;
  bool lineDataInexact = false;
  bool inputSorted = false;  // the cleaning sorted the points in this computation
  bool isolatedPoints = false;
  bool medialAxisComputed = false;
  std::int32_t arcsApproximated = 0;
  OrderRandom random;

  // Statistics of the last computation.
  std::int32_t duplicatePoints = 0;
  std::int32_t removedSegments = 0;
  std::int32_t removedArcs = 0;

  // Cross-reference from each point to the segment ends using it (CSR form:
  // the ends of point i are xrefEnds[xrefStart[i] .. xrefStart[i+1]), each
  // entry 2*segment + (0 for i1, 1 for i2)).
  RecordArray<std::int32_t> xrefStart;
  RecordArray<std::int32_t> xrefEnds;
  // Points whose ends were redirected to a point, as a chain from it:
  // xrefMerged[i] is the next point merged into i's chain (kNone ends it).
  // Redirecting keeps the list valid in place.
  RecordArray<std::int32_t> xrefMerged;
  bool xrefBuilt = false;

  // Scratch lists of one insertion.
  RecordArray<std::int32_t> markedSites;
  RecordArray<std::int32_t> checkedNodes;
  RecordArray<std::int32_t> deletedNodes;
  RecordArray<std::int32_t> boundaryEdges;
  RecordArray<std::int32_t> newNodes;
  RecordArray<std::int32_t> stack;

  NearestPointSearch* search = nullptr;
  bool usedQuadtree = false;  // the search switched to the quadtree (statistics)

  // Segment phase and input repair.
  double tolerance = 0.0;
  bool recoveryMode = false;
  SuspectPair suspect;
  // Whether the point-segment-segment computation orients its lines by the
  // kept end node; reset at the start of every segment insertion.
  bool pssOrientByKeptNode = false;

  // Offsets.
  RecordArray<OffsetCurveRecord> offsetCurves;
  RecordArray<OffsetElementRecord> offsetElements;
  bool offsetNewRequest = true;

  // Test hook: called after every point insertion (null in production).
  void (*insertionObserver)(void* context, std::int32_t point) = nullptr;
  void* insertionObserverContext = nullptr;
};

// The calling thread's engine: created on the thread's first use, never
// destroyed (see core/per_thread.hpp). Threads compute diagrams at once, each
// in its own engine.
inline Engine& Vd() { return PerThread<Engine>::mine(); }

// Internal <-> user coordinates of the current transform.
inline double ToUserX(double x) { return x / Vd().scale + Vd().shiftX; }
inline double ToUserY(double y) { return y / Vd().scale + Vd().shiftY; }

}  // namespace zt::vd
