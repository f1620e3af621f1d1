// Crossings of a ray towards +x with a set's edges, the parity that anchors
// the inside status at a shared vertex and of a contour kept whole. A ray
// is answered by the set's box tree or, when a set is asked many times in
// one operation, by its rows: horizontal bands of equal height, each
// listing the boxes that reach into it, sorted by their right end. A row
// holds every box the tree would find near the ray and each box is counted
// by the same test, so both give the same count; a row that holds too many
// boxes (a dense piece tiny beside the set's extent) leaves its rays to the
// tree, so no input costs more than the tree alone.
#include <algorithm>
#include <cassert>
#include <cfloat>
#include <cmath>
#include <functional>
#include <limits>
#include <new>

#include "regions/detail/engine.hpp"

namespace zt::detail {

// Rows are built only for a set of at least this many boxes, and only once
// the tree has answered its boxes over kTreeRaysBeforeRows rays into it in
// one operation: the tree has then spent about what the rows cost to build,
// so a set asked a few times never pays for rows and one asked many times
// pays for the tree on a small share of its rays only.
inline constexpr std::int32_t kRowsMinBoxes = 32;
inline constexpr std::int32_t kTreeRaysBeforeRows = 32;
// Rows per box at most, and the budget of row entries per box beyond one
// each, which sets a floor on the row height where boxes are tall.
inline constexpr double kRowsPerBox = 0.5;
inline constexpr double kRowEntriesPerBox = 3.0;
// A ray in a row of more boxes than this goes to the tree; rows that hold
// more than half of it on average are not built.
inline constexpr std::int32_t kRowScanLimit = 64;
// Rows sorted by insertion up to this length, by std::sort beyond.
inline constexpr std::int32_t kRowInsertionSort = 16;

RayRows::~RayRows() {
  delete[] starts;
  delete[] entries;
}

namespace {

bool meets(const Edge& edge, const Vertex* v) {
  if (edge.start == v || edge.end == v) return true;
  for (const SplitPoint* sp = edge.splits; sp; sp = sp->next)
    if (sp->vertex == v) return true;
  return false;
}

// Whether edge is one of the pool's records [first, end): the records of one
// chunk are contiguous, so each chunk the range spans is checked by address.
bool edge_in_range(const EdgePool& pool, const Edge* edge, std::int32_t first, std::int32_t end) {
  constexpr std::int32_t k = EdgePool::kChunkSize;
  const std::less<const Edge*> below;
  for (std::int32_t lo = first; lo < end;) {
    const std::int32_t hi = std::min(end, (lo / k + 1) * k) - 1;
    if (!below(edge, &pool[lo]) && !below(&pool[hi], edge)) return true;
    lo = hi + 1;
  }
  return false;
}

// Adds box b's crossings of the ray set up in the engine's query box and probe.
void count_box(BooleanEngine& e, const EdgeBox& b, const Vertex* skip) {
  const BoxTreeNode& q = e.queryBox;
  if (!boxes_near(q, b)) return;
  const Edge& edge = *b.edge;
  if (edge.open) return;
  IntersectionProbe& pr = e.probe;
  if (skip && meets(edge, skip)) {
    // The pieces of the edge that do not end at skip still count: a split
    // vertex within the tolerance of the ray's line bends the edge there,
    // and the piece beyond it may cross the ray.
    const Vertex* from = edge.start;
    for (const SplitPoint* sp = edge.splits;; sp = sp->next) {
      const Vertex* to = sp ? sp->vertex : edge.end;
      if (from != skip && to != skip) pr.crossingCount += pr.cross(pr.qx, pr.qy, from->x, from->y, to->x, to->y, pr.eps);
      from = to;
      if (!sp) break;
    }
    return;
  }
  if (pr.skipEnd > pr.skipFirst && edge_in_range(e.edges, &edge, pr.skipFirst, pr.skipEnd)) return;
  pr.crossingCount += pr.cross(pr.qx, pr.qy, edge.start->x, edge.start->y, edge.end->x, edge.end->y, pr.eps);
}

void count_in_node(BooleanEngine& e, const BoxTreeNode* node, const Vertex* skip) {
  if (!boxes_near(e.queryBox, *node)) return;
  if (node->low) {
    count_in_node(e, node->low, skip);
    count_in_node(e, node->high, skip);
    return;
  }
  for (std::int32_t i = node->first; i <= node->last; ++i) count_box(e, e.treeBoxes[i], skip);
}

// How far below and above its extent a box is listed: twice the pair
// margin (a box is near a ray within one), plus what rounding of the
// margin's sums may move at that magnitude.
double row_reach(double y) { return 2 * kPairRejectMargin + 4 * DBL_EPSILON * std::fabs(y); }

// Row of ordinate y, clamped to the rows; monotone in y.
std::int32_t row_of(const RayRows& r, double y) {
  const double v = (y - r.y0) * r.rowsPerUnit;
  if (!(v > 0)) return 0;
  if (v >= r.rowCount) return r.rowCount - 1;
  return static_cast<std::int32_t>(v);
}

template <typename T>
bool reserve(T*& data, std::int32_t& capacity, std::int64_t need) {
  if (need <= capacity) return true;
  if (need > std::numeric_limits<std::int32_t>::max() / 2 || !allocationAllowed()) return false;
  const std::int64_t grown = std::max<std::int64_t>(need, 2 * static_cast<std::int64_t>(capacity));
  T* fresh = new (std::nothrow) T[static_cast<std::size_t>(grown)];
  if (!fresh) return false;
  delete[] data;
  data = fresh;
  capacity = static_cast<std::int32_t>(grown);
  return true;
}

bool by_right_end(const RayRowEntry& a, const RayRowEntry& b) { return a.xmax > b.xmax; }

// Builds the set's rows; false (and the tree answers every ray) when they
// would cost more than they save or storage cannot be had.
bool build_rows(BooleanEngine& e, PolygonSet& set) {
  RayRows& r = set.rows;
  const std::int32_t n = set.lastBox - set.firstBox + 1;
  if (n < kRowsMinBoxes) return false;
  double bottom = std::numeric_limits<double>::max(), top = std::numeric_limits<double>::lowest(), heights = 0.0;
  for (std::int32_t i = set.firstBox; i <= set.lastBox; ++i) {
    const EdgeBox& b = e.treeBoxes[i];
    const double lo = b.ymin - row_reach(b.ymin), hi = b.ymax + row_reach(b.ymax);
    bottom = std::min(bottom, lo);
    top = std::max(top, hi);
    heights += hi - lo;
  }
  const double extent = top - bottom;
  if (!(extent > 0) || !(heights > 0)) return false;
  // Entries beyond one per box number about heights / row height.
  const double rows = std::floor(std::min(kRowsPerBox * n, kRowEntriesPerBox * n * extent / heights));
  r.rowCount = static_cast<std::int32_t>(std::max(1.0, rows));
  r.y0 = bottom;
  r.rowsPerUnit = r.rowCount / extent;
  if (!reserve(r.starts, r.startCapacity, static_cast<std::int64_t>(r.rowCount) + 1)) return false;
  // Boxes per row, through the differences between neighbouring rows.
  std::fill(r.starts, r.starts + r.rowCount + 1, 0);
  std::int64_t total = 0;
  for (std::int32_t i = set.firstBox; i <= set.lastBox; ++i) {
    const EdgeBox& b = e.treeBoxes[i];
    const std::int32_t r0 = row_of(r, b.ymin - row_reach(b.ymin)), r1 = row_of(r, b.ymax + row_reach(b.ymax));
    ++r.starts[r0];
    --r.starts[r1 + 1];
    total += r1 - r0 + 1;
  }
  if (total > static_cast<std::int64_t>(2 + kRowEntriesPerBox) * n + r.rowCount) return false;
  if (2 * total > static_cast<std::int64_t>(kRowScanLimit) * r.rowCount) return false;
  if (!reserve(r.entries, r.entryCapacity, total)) return false;
  // Counts, then the first entry of each row, advanced while filling and
  // shifted back after.
  std::int32_t running = 0, offset = 0;
  for (std::int32_t k = 0; k < r.rowCount; ++k) {
    running += r.starts[k];
    r.starts[k] = offset;
    offset += running;
  }
  r.starts[r.rowCount] = offset;
  for (std::int32_t i = set.firstBox; i <= set.lastBox; ++i) {
    const EdgeBox& b = e.treeBoxes[i];
    const std::int32_t r0 = row_of(r, b.ymin - row_reach(b.ymin)), r1 = row_of(r, b.ymax + row_reach(b.ymax));
    for (std::int32_t k = r0; k <= r1; ++k) r.entries[r.starts[k]++] = RayRowEntry{b.xmax, &b};
  }
  for (std::int32_t k = r.rowCount - 1; k > 0; --k) r.starts[k] = r.starts[k - 1];
  r.starts[0] = 0;
  for (std::int32_t k = 0; k < r.rowCount; ++k) {
    RayRowEntry* first = r.entries + r.starts[k];
    RayRowEntry* last = r.entries + r.starts[k + 1];
    if (last - first > kRowInsertionSort) {
      std::sort(first, last, by_right_end);
      continue;
    }
    for (RayRowEntry* p = first + 1; p < last; ++p) {
      const RayRowEntry x = *p;
      RayRowEntry* q = p;
      for (; q > first && by_right_end(x, q[-1]); --q) *q = q[-1];
      *q = x;
    }
  }
  return true;
}

// The ray's crossings counted over its row; false when the row is too full
// and the tree should count them.
bool count_in_row(BooleanEngine& e, const PolygonSet& set, const Vertex* skip) {
  const RayRows& r = set.rows;
  const double px = e.probe.qx;
  const std::int32_t k = row_of(r, e.probe.qy);
  const RayRowEntry* p = r.entries + r.starts[k];
  const RayRowEntry* end = r.entries + r.starts[k + 1];
  if (end - p > kRowScanLimit) return false;
  // Sorted by right end: from the first box ending too far left of the ray
  // to be near it (the test of boxes_near), none of the rest is near.
  for (; p < end && !(px > p->xmax + kPairRejectMargin); ++p) count_box(e, *p->box, skip);
  return true;
}

}  // namespace

std::int32_t count_ray_crossings(BooleanEngine& e, PolygonSet& set, double px, double py, const Vertex* skip) {
  IntersectionProbe& pr = e.probe;
  pr.mode = 0;
  pr.crossingCount = 0;
  pr.qx = px;
  pr.qy = py;
  BoxTreeNode& q = e.queryBox;
  // The ray itself: an edge it crosses reaches below and above py and to
  // the right of px, so its box is near this one.
  q.xmin = px;
  q.xmax = std::numeric_limits<double>::max();
  q.ymin = q.ymax = py;
  RayRows& rows = set.rows;
  if (!rows.built && !rows.refused && !tl_rayRowsOff &&
      ++rows.treeRays * kTreeRaysBeforeRows >= set.lastBox - set.firstBox + 1) {
    rows.built = build_rows(e, set);
    rows.refused = !rows.built;
  }
  if (rows.built && count_in_row(e, set, skip)) {
#ifndef NDEBUG
    const std::int32_t byRows = pr.crossingCount;
    pr.crossingCount = 0;
    if (set.root) count_in_node(e, set.root, skip);
    assert(pr.crossingCount == byRows);
#endif
    return pr.crossingCount;
  }
  if (set.root) count_in_node(e, set.root, skip);
  return pr.crossingCount;
}

}  // namespace zt::detail
