// The Boolean engine's state and the stages that work on it, in the order an
// operation runs them:
//   operands      bounding box, normalisation, snapping, reading contours
//   vertex_grid   merging of points closer than the engine tolerance
//   box_tree      edges, integer boxes and the median-split box trees
//   intersections dual box-tree walk (with geometry.hpp)
//   split_lists   the crossings on each edge, settled into sorted lists
//   half_edges    cut contours as twin half-edges with contour links
//   stars         angular sweep at shared vertices, keep propagation, pairing
//   whole_contours ray parity of contours that meet the other operand nowhere
//   emission      kept pieces chained into contours for the OutputCollector
// One engine per thread; it keeps its storage from one operation to the next.
#pragma once

#include <cstdint>

#include "regions/detail/pool.hpp"
#include "regions/detail/records.hpp"
#include "core/points.hpp"

namespace zt::detail {

// Coordinates are snapped to multiples of this quantum before normalisation.
inline constexpr double kSnapQuantum = 0x1p-48;
// Engine tolerance: points closer than this (normalised, per coordinate)
// are one vertex; also the closing-duplicate tolerance in input units.
inline constexpr double kEngineEpsilon = 2 * kSnapQuantum;
// A record with x above this ends a contour; one at or above it never starts one.
inline constexpr double kSeparatorThreshold = 99990.0;
// Grid cell of the vertex grid's tie rule: 1/1000 of the normalised square.
inline constexpr double kGridCell = 0.001;
// Edges whose exact extents are farther apart than this cannot meet: every
// point the intersection routine returns lies within the tolerance of both
// segments. Box trees compare extents with this margin (boxes_near).
inline constexpr double kPairRejectMargin = 4 * kEngineEpsilon;
// Cells of the vertex index proper, 2^-shift wide: they start at
// 2^-kCoarsestFineShift, fine enough that densely sampled contours put only a
// few points in one, and are laid onto the bucket table in tiles of
// 2^kFineTileBits cells a side so that neighbours share cache lines. A lookup
// that walks more than kMaxLookupVisits vertices makes the cells finer by
// kFineShiftStep bits (down to 2^-kFinestFineShift, twice the tolerance,
// where a cell holds at most nine vertices), so a piece that is tiny beside
// the joint box cannot pile its points into one cell.
inline constexpr std::int32_t kCoarsestFineShift = 14;
inline constexpr std::int32_t kFinestFineShift = 46;
inline constexpr std::int32_t kFineShiftStep = 4;
inline constexpr std::int32_t kMaxLookupVisits = 24;
inline constexpr std::uint64_t kFineTileBits = 9;
inline constexpr std::int32_t kMinFineBuckets = 1024;
// Fine cell indexes are clamped to this magnitude (far outside the square
// at every shift).
inline constexpr double kFineIndexClamp = 0x1p62;
// Cell indexes and box bounds are clamped to this magnitude so that points far
// outside the normalised square (read, but not counted by the bounding box)
// still give well-defined integer keys.
inline constexpr double kIndexClamp = 1073741824.0;  // 2^30
// A box-tree node holding at most this many boxes beyond its first is a leaf.
inline constexpr std::int32_t kLeafSpan = 8;
// Inputs beyond this magnitude (or not finite) are refused.
inline constexpr double kMaxInputMagnitude = 1e15;

using EdgePool = ChunkPool<Edge>;
using BoxPool = ChunkPool<EdgeBox>;
using NodePool = ChunkPool<BoxTreeNode>;
using HalfEdgePool = ChunkPool<HalfEdge>;
using SplitPool = ChunkPool<SplitPoint>;
using StarPool = ChunkPool<StarEntry, 10, 10>;
using VertexPool = ChunkPool<Vertex>;
using ContourPool = ChunkPool<InputContour>;

// Vertices are found through a hash of fine cells, so a lookup costs about
// the same however densely the contours are sampled. Which vertex a lookup
// returns when several lie within the tolerance is ruled by the 1/1000
// grid: the first grid cell, column by column and row by row, that holds
// one, and within it the vertex created last.
struct VertexGrid {
  std::int32_t bucketMask = 0;  // bucket count - 1, a power of two
  std::int32_t fineShift = kCoarsestFineShift;
  double fineScale = 0x1p14;  // 2^fineShift, fine cells per unit
  VertexPool* vertices = nullptr;  // created at the first sizing
  Vertex** buckets = nullptr;
  Vertex* sharedHead = nullptr;
  double originX = 0.0, originY = 0.0;
  double cell = kGridCell;
  double eps = kEngineEpsilon;
  std::int64_t visits = 0;
};

// Direction of a segment: its vector and length.
struct SegmentDirection {
  double dx = 0.0, dy = 0.0, length = 0.0;
};

struct IntersectionProbe {
  std::int32_t crossingCount = 0;
  std::int32_t mode = 1;  // 1 intersect, 0 count crossings
  double qx = 0.0, qy = 0.0;
  double eps = kEngineEpsilon;
  SegmentDirection dirA, dirB;
  Point2d p0, p1, q0, q1, r1, r2;
  int (*intersect)(const Point2d&, const Point2d&, const Point2d&, const Point2d&, Point2d&,
                   Point2d&, SegmentDirection&, SegmentDirection&, double) = nullptr;
  int (*cross)(double, double, double, double, double, double, double) = nullptr;
  VertexGrid* grid = nullptr;
  SplitPool* splits = nullptr;
  std::int32_t retryReversed = 0;
  // Edges [skipFirst, skipEnd) (one contour's) are left out of a ray count.
  std::int32_t skipFirst = 0, skipEnd = 0;
};

struct SplitCandidate {
  double t = 0.0;
  std::int32_t order = 0;  // place in the order the crossings were found
  std::int32_t accepted = 0;
  SplitPoint* split = nullptr;
};

struct EdgeOverlap {
  Edge* a = nullptr;
  Edge* b = nullptr;
};

// A set's boxes by horizontal rows, for many rays in one operation
// (ray_count.cpp): the boxes reaching into row k are entries
// [starts[k], starts[k + 1]), by descending right end.
struct RayRowEntry {
  double xmax = 0.0;
  const EdgeBox* box = nullptr;
};
struct RayRows {
  bool built = false;
  bool refused = false;  // not worth building, or no storage: the tree answers
  std::int32_t treeRays = 0;  // rays answered by the tree so far
  std::int32_t rowCount = 0;
  double y0 = 0.0, rowsPerUnit = 0.0;
  std::int32_t* starts = nullptr;
  std::int32_t startCapacity = 0;
  RayRowEntry* entries = nullptr;
  std::int32_t entryCapacity = 0;
  RayRows() = default;
  RayRows(const RayRows&) = delete;
  RayRows& operator=(const RayRows&) = delete;
  ~RayRows();
};

struct PolygonSet {
  std::int32_t owner = 0;
  ContourPool contours;
  BoxTreeNode* root = nullptr;
  std::int32_t firstBox = 0;
  std::int32_t lastBox = -1;
  bool cancelled = false;  // some contour of it bounded nothing and was dropped
  RayRows rows;
};

struct BooleanEngine {
  PolygonSet a, b;
  EdgePool edges;
  BoxPool boxes;
  NodePool nodes;
  HalfEdgePool halves;
  SplitPool splits;
  StarPool stars;
  // The points of both sets' contours as read, each contour's contiguous.
  TaggedPoint* points = nullptr;
  std::int32_t pointCount = 0;
  std::int32_t pointCapacity = 0;
  BoxTreeNode queryBox;
  IntersectionProbe probe;
  VertexGrid grid;
  // Both sets' boxes in their trees' order, contiguous, indexed like the
  // box pool (the trees' ranges index it; the walks read it).
  EdgeBox* treeBoxes = nullptr;
  std::int32_t treeBoxCapacity = 0;
  // The crossings found on one edge while its split list is settled.
  SplitCandidate* splitScratch = nullptr;
  std::int32_t splitScratchCapacity = 0;
  // Pairs of edges found running along each other.
  EdgeOverlap* overlaps = nullptr;
  std::int32_t overlapCount = 0;
  std::int32_t overlapCapacity = 0;
  // Shared vertices waiting for their sweep.
  Vertex** pending = nullptr;
  std::int32_t pendingCapacity = 0;
  // One contour's points while the parts that bound nothing are dropped.
  TaggedPoint* pointScratch = nullptr;
  std::int32_t pointScratchCapacity = 0;
  // The result while it is written, when the caller's list is an operand.
  TaggedPointList output;
  double eps = kEngineEpsilon;
  double offsetX = 0.0, offsetY = 0.0, scaleX = 1.0, scaleY = 1.0;
  // Runs numbered so far (box_tree.cpp), over both sets.
  std::int32_t runCount = 0;
  // Box pairs compared at leaf pairs by the last intersection walk.
  std::int64_t leafPairTests = 0;

  BooleanEngine();
  ~BooleanEngine();
  BooleanEngine(const BooleanEngine&) = delete;
  BooleanEngine& operator=(const BooleanEngine&) = delete;
};

// ---- engine (engine.cpp)
// The calling thread's engine, created on first use and reset for a new
// operation (sets, pools, grid contents); null if it cannot be created.
BooleanEngine* prepare_thread_engine();
// The calling thread's engine as it is, created on first use; null if it
// cannot be created.
BooleanEngine* thread_engine();
// The calling thread's engine as its last operation left it (null before
// the first), for the checks that count an operation's work.
BooleanEngine* last_thread_engine();
void reset_set(BooleanEngine& e, PolygonSet& set);

// ---- operands (operands.cpp)
struct BoundingBox {
  double minX = 99999.0, minY = 99999.0, maxX = -99999.0, maxY = -99999.0;
  std::int32_t count = 0;
};
bool is_separator_record(const TaggedPoint& p);
// False when a coordinate is not finite or beyond kMaxInputMagnitude.
bool operand_is_sane(const TaggedPointList& list);
BoundingBox scan_bounding_box(const TaggedPointList& a, const TaggedPointList& b);
void set_normalisation(BooleanEngine& e, const BoundingBox& box);
double snap_coordinate(double v);
// Reads one operand into its set and finishes the set (vertices, edges, tree).
// Points are normalised, and with coarseGrid rounded to a coarser grid (the
// retry). Returns 0, -1 on failure, or kEmptyOperand when every contour
// bounded nothing (an empty region, not an error).
inline constexpr int kEmptyOperand = 1;
int read_operand(BooleanEngine& e, PolygonSet& set, const TaggedPointList& list, std::int32_t owner,
                 bool coarseGrid = false);
// Stores n points as contour c's, after those stored before; false when
// storage cannot be had.
bool contour_store(BooleanEngine& e, InputContour& c, const TaggedPoint* pts, std::int32_t n);
inline const TaggedPoint* contour_points(const BooleanEngine& e, const InputContour& c) {
  return e.points + c.firstPoint;
}
template <typename F>
void for_each_stored_point(const BooleanEngine& e, const InputContour& c, F&& f) {
  const TaggedPoint* p = contour_points(e, c);
  for (std::int32_t i = 0; i < c.pointCount; ++i) f(p[i]);
}

// ---- vertex grid (vertex_grid.cpp)
std::int32_t grid_bucket_count_for(std::int32_t pointCount);
int size_grid(VertexGrid& g, std::int32_t pointCount);
void clear_grid(VertexGrid& g);
// The vertex within eps of (x, y), made shared when met by another owner, or a
// new one; null on storage failure.
Vertex* grid_lookup(VertexGrid& g, double x, double y, std::int32_t owner);
// A hint that (x, y) will be looked up soon: loads its bucket, or with head
// the bucket's first vertex, into the cache.
void grid_prefetch(const VertexGrid& g, double x, double y, bool head);
// What a lookup of v's own coordinates by a crossing does: v becomes shared.
void grid_share(VertexGrid& g, Vertex* v);
// Bucket of a fine cell, never outside the table whatever the cell's sign.
std::int32_t grid_bucket_of(const VertexGrid& g, std::int64_t row, std::int64_t column);
// Vertices walked by the lookups since the grid was sized (the cost that the
// refinement of the fine cells keeps linear).
std::int64_t grid_visit_count(const VertexGrid& g);
// Cell of a coordinate, clamped to +-kIndexClamp.
std::int64_t grid_cell_index(double v, double origin, double cell);

// ---- edges and box trees (box_tree.cpp)
int finish_set(BooleanEngine& e, PolygonSet& set);
// Reorders boxes[lo..hi] so that position m holds the key of rank m; returns
// the number of key comparisons made (for the linear-time checks).
std::int64_t select_median(EdgeBox* boxes, std::int32_t lo, std::int32_t hi, std::int32_t m, bool byX);
// Extents within kPairRejectMargin of each other on both axes (works for
// edge boxes, tree nodes and the ray query alike).
template <typename A, typename B>
inline bool boxes_near(const A& a, const B& b) {
  const double m = kPairRejectMargin;
  return !(a.xmin > b.xmax + m || b.xmin > a.xmax + m || a.ymin > b.ymax + m || b.ymin > a.ymax + m);
}

// ---- overlay (intersections.cpp, half_edges.cpp)
int find_intersections(BooleanEngine& e);
// Crossings are recorded on their edges as they are found, then each edge's
// list is settled: taken in the order found, a crossing is kept unless one
// kept before lies within eps in t; the kept ones sorted by ascending t.
int record_split(SplitPool& pool, Edge& edge, double t, Vertex* v);
int settle_splits(BooleanEngine& e, Edge& edge, double eps);
int build_half_edges(BooleanEngine& e, PolygonSet& set);
bool contour_has_splits(BooleanEngine& e, InputContour& c);

// ---- classification (stars.cpp, whole_contours.cpp, ray_count.cpp)
double pseudo_angle(double c, double s);
struct StarRule {
  std::int32_t keepAInsideB;
  std::int32_t keepBInsideA;
};
int classify_stars(BooleanEngine& e, std::int32_t keepAInsideB, std::int32_t keepBInsideA);
// With resultOnLeft (union, intersection), a closed contour kept whole is
// also marked to be written reversed when its operand's region lies on its
// right, so that it too has the result on its left.
void classify_whole_contours(BooleanEngine& e, PolygonSet& x, PolygonSet& y, std::int32_t flag,
                             bool resultOnLeft);
// Crossings of the ray from (px, py) towards +x with the set's edges,
// leaving out the edges that start, end or are split at `skip`; by the
// set's box tree, or by its rows once it has been asked many times (the
// counts are the same either way).
std::int32_t count_ray_crossings(BooleanEngine& e, PolygonSet& set, double px, double py,
                                 const Vertex* skip = nullptr);
// Test hook: when set, the calling thread's operations count every ray by
// the tree, so that a test can compare the results with and without rows.
inline thread_local bool tl_rayRowsOff = false;

// ---- emission (emission.cpp)
// resultOnLeft: contours start from kept half-edges with the result on
// their left (union, intersection), else from those along their contour.
int emit_result(BooleanEngine& e, bool resultOnLeft);
// Every contour of the set as read, closed ones closed on their first point.
void emit_whole_contours(const BooleanEngine& e, const PolygonSet& set);

// ---- debug validator (validate.cpp)
// Checks the overlay's invariants that are cheap to check; after the star
// classification also that kept half-edges at shared vertices are paired.
bool overlay_is_consistent(BooleanEngine& e, bool afterStars);

}  // namespace zt::detail
