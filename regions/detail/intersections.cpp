// Finding the meeting points of the edges: a dual walk of the two operands'
// box trees reaches every pair of edges (one of each operand) whose extents
// lie within kPairRejectMargin of each other, and a walk of each tree against
// itself every such pair of one operand, so that a contour crossing itself or
// another contour of its operand is cut there too. Each meeting point becomes
// a shared vertex and a split point on both edges (split_lists.cpp); the star
// sweep then reads the operand there by the even-odd rule, and a result
// contour through it turns no direction.
#include <algorithm>
#include <cmath>
#include <new>
#include <initializer_list>

#include "regions/detail/engine.hpp"
#include "regions/detail/geometry.hpp"

namespace zt::detail {

namespace {

// The endpoint of either edge that lies exactly at R, if any. Vertices are
// pairwise at least the tolerance apart, so a lookup of an endpoint's own
// coordinates could only return that endpoint: meeting points at shared
// corners and along coincident edges (most of them, where the operands
// share a boundary) need no lookup.
Vertex* endpoint_at(const Edge& a, const Edge& b, const Point2d& R) {
  for (Vertex* v : {a.start, a.end, b.start, b.end})
    if (v->x == R.x && v->y == R.y) return v;
  return nullptr;
}

// Collinear overlaps found by the walk, to share their split points later.
bool remember_overlap(BooleanEngine& e, Edge& a, Edge& b) {
  if (e.overlapCount == e.overlapCapacity) {
    if (!allocationAllowed()) return false;
    const std::int32_t grown = e.overlapCapacity < 64 ? 64 : 2 * e.overlapCapacity;
    EdgeOverlap* bigger = new (std::nothrow) EdgeOverlap[static_cast<std::size_t>(grown)];
    if (!bigger) return false;
    for (std::int32_t i = 0; i < e.overlapCount; ++i) bigger[i] = e.overlaps[i];
    delete[] e.overlaps;
    e.overlaps = bigger;
    e.overlapCapacity = grown;
  }
  e.overlaps[e.overlapCount++] = EdgeOverlap{&a, &b};
  return true;
}

// Where edges of both operands run along each other, a vertex that cuts one
// of them inside the overlap (a corner of a third contour lying there) cuts
// the other too: a piece must end wherever another piece along it ends, or
// the sweep at that vertex misses it. Returns whether a split was added.
int share_splits(BooleanEngine& e, const Edge& from, Edge& to, bool& added) {
  const double dx = to.end->x - to.start->x, dy = to.end->y - to.start->y;
  const double len2 = dx * dx + dy * dy;
  const double len = std::sqrt(len2);
  for (const SplitPoint* sp = from.splits; sp; sp = sp->next) {
    Vertex* v = sp->vertex;
    if (v == to.start || v == to.end) continue;
    const double rx = v->x - to.start->x, ry = v->y - to.start->y;
    const double t = (rx * dx + ry * dy) / len2;
    if (!(t * len > e.eps && (1.0 - t) * len > e.eps)) continue;
    if (std::fabs(rx * dy - ry * dx) >= e.eps * len) continue;
    bool known = false;
    for (const SplitPoint* q = to.splits; q && !known; q = q->next) known = q->vertex == v;
    if (known) continue;
    if (record_split(e.splits, to, t, v) != 0) return -1;
    added = true;
  }
  return 0;
}

int share_overlap_splits(BooleanEngine& e) {
  // Two rounds carry a cut across a chain of three overlapping edges.
  for (int round = 0; round < 2; ++round) {
    for (std::int32_t i = 0; i < e.overlapCount; ++i) {
      Edge& a = *e.overlaps[i].a;
      Edge& b = *e.overlaps[i].b;
      bool toA = false, toB = false;
      if (share_splits(e, a, b, toB) != 0 || share_splits(e, b, a, toA) != 0) return -1;
      if (toA && settle_splits(e, a, e.eps) != 0) return -1;
      if (toB && settle_splits(e, b, e.eps) != 0) return -1;
    }
  }
  return 0;
}

// Whether a split of edge at v is worth recording. A meeting point exactly
// at one of the edge's ends has the same t whichever pair finds it (t
// follows from the end's coordinates and the edge alone); of such repeats,
// where boundaries run along each other or many edges meet at a corner, only
// the first is recorded: settling would keep or drop the later ones with it
// (same t, found later), and nothing else depends on them.
bool first_at_end(Edge& edge, const Vertex* v, bool exact) {
  if (!exact) return true;
  const std::uint16_t bit = v == edge.start ? 1 : v == edge.end ? 2 : 0;
  if (bit == 0) return true;
  if (edge.endsSplit & bit) return false;
  edge.endsSplit |= bit;
  return true;
}

int test_edge_pair(BooleanEngine& e, Edge& first, Edge& second) {
  IntersectionProbe& pr = e.probe;
  pr.retryReversed = 0;
  pr.p0 = {first.start->x, first.start->y};
  pr.p1 = {first.end->x, first.end->y};
  pr.q0 = {second.start->x, second.start->y};
  pr.q1 = {second.end->x, second.end->y};
  const int k = pr.intersect(pr.p0, pr.p1, pr.q0, pr.q1, pr.r1, pr.r2, pr.dirA, pr.dirB, pr.eps);
  if (k == kRetryReversed) {
    pr.retryReversed = 1;
    return 0;
  }
  if (k < 1) return 0;
  if (k == 2 && !remember_overlap(e, first, second)) return -1;
  const double uAx = pr.dirA.dx / pr.dirA.length, uAy = pr.dirA.dy / pr.dirA.length;
  const double uBx = pr.dirB.dx / pr.dirB.length, uBy = pr.dirB.dy / pr.dirB.length;
  for (int r = 0; r < k; ++r) {
    const Point2d& R = r == 0 ? pr.r1 : pr.r2;
    Vertex* v = endpoint_at(first, second, R);
    if (v) {
      grid_share(*pr.grid, v);
    } else {
      v = grid_lookup(*pr.grid, R.x, R.y, kSharedOwner);
      if (!v) return -1;
    }
    const double tA = ((R.x - pr.p0.x) * uAx + (R.y - pr.p0.y) * uAy) / pr.dirA.length;
    const double tB = ((R.x - pr.q0.x) * uBx + (R.y - pr.q0.y) * uBy) / pr.dirB.length;
    const bool exact = v->x == R.x && v->y == R.y;
    if (first_at_end(first, v, exact) && record_split(*pr.splits, first, tA, v) != 0) return -1;
    if (first_at_end(second, v, exact) && record_split(*pr.splits, second, tB, v) != 0) return -1;
  }
  return 0;
}

// Two edges of one operand that share an end meet nowhere else (reading
// dropped the points where a contour turns straight back), so they are
// tested only where more than two edge ends meet (contours of the operand
// touching, or one passing twice), for the touching point to cut them.
// Consecutive edges of a contour are most of the pairs a walk of one tree
// meets, so this spares the intersection routine on nearly all of them.
bool worth_testing_same_operand(const Edge& a, const Edge& b, std::int32_t owner) {
  // Open polylines bound nothing: where they cross their own operand does
  // not matter, and they are not cut there.
  if (a.open || b.open) return false;
  const Vertex* shared = a.start == b.start || a.start == b.end ? a.start
                         : a.end == b.start || a.end == b.end   ? a.end
                                                                : nullptr;
  return !shared || shared->ends[owner - 1] > 2;
}

// sameOwner: the operand both boxes belong to, or 0 when they belong to
// different operands.
int test_boxes(BooleanEngine& e, const EdgeBox& bi, const EdgeBox& bj, std::int32_t sameOwner) {
  if (!boxes_near(bi, bj)) return 0;
  if (sameOwner != 0 && !worth_testing_same_operand(*bi.edge, *bj.edge, sameOwner)) return 0;
  if (test_edge_pair(e, *bi.edge, *bj.edge) != 0) return -1;
  if (e.probe.retryReversed && test_edge_pair(e, *bj.edge, *bi.edge) != 0) return -1;
  return 0;
}

// Every pair of boxes, one under a and one under b, that are near; a and b
// are disjoint subtrees (of two operands, or of one when sameOwner).
int walk(BooleanEngine& e, const BoxTreeNode* a, const BoxTreeNode* b, std::int32_t sameOwner) {
  if (!boxes_near(*a, *b)) return 0;
  // Pairs within one run are never worth a test (box_tree.cpp).
  if (sameOwner != 0 && a->run >= 0 && a->run == b->run) return 0;
  if (a->low && b->low) {
    if (walk(e, a->low, b->low, sameOwner) || walk(e, a->low, b->high, sameOwner) ||
        walk(e, a->high, b->low, sameOwner) || walk(e, a->high, b->high, sameOwner))
      return -1;
    return 0;
  }
  if (a->low) return (walk(e, a->low, b, sameOwner) || walk(e, a->high, b, sameOwner)) ? -1 : 0;
  if (b->low) return (walk(e, a, b->low, sameOwner) || walk(e, a, b->high, sameOwner)) ? -1 : 0;
  e.leafPairTests += std::int64_t{a->last - a->first + 1} * (b->last - b->first + 1);
  // A box far from the other leaf's extent is near none of its boxes: each
  // side is sifted against the other leaf once, and only the pairs left are
  // tested, in the order the full double loop would take them.
  std::int32_t bNearA[kLeafSpan + 1];
  std::int32_t bNearCount = 0;
  for (std::int32_t j = b->first; j <= b->last; ++j)
    if (boxes_near(e.treeBoxes[j], *a)) bNearA[bNearCount++] = j;
  if (bNearCount == 0) return 0;
  for (std::int32_t i = a->first; i <= a->last; ++i) {
    const EdgeBox& bi = e.treeBoxes[i];
    if (!boxes_near(bi, *b)) continue;
    for (std::int32_t k = 0; k < bNearCount; ++k)
      if (test_boxes(e, bi, e.treeBoxes[bNearA[k]], sameOwner) != 0) return -1;
  }
  return 0;
}

// Every pair of distinct boxes under one node that are near.
int walk_self(BooleanEngine& e, const BoxTreeNode* n, std::int32_t owner) {
  if (n->run >= 0) return 0;
  if (n->low) {
    if (walk_self(e, n->low, owner) || walk_self(e, n->high, owner) || walk(e, n->low, n->high, owner)) return -1;
    return 0;
  }
  for (std::int32_t i = n->first; i <= n->last; ++i)
    for (std::int32_t j = i + 1; j <= n->last; ++j)
      if (test_boxes(e, e.treeBoxes[i], e.treeBoxes[j], owner) != 0) return -1;
  return 0;
}

}  // namespace

int find_intersections(BooleanEngine& e) {
  e.probe.mode = 1;
  if (!e.a.root || !e.b.root) return -1;
  e.overlapCount = 0;
  e.leafPairTests = 0;
  int rc = walk(e, e.a.root, e.b.root, 0);
  if (rc == 0) rc = walk_self(e, e.a.root, e.a.owner);
  if (rc == 0) rc = walk_self(e, e.b.root, e.b.owner);
  for (std::int32_t i = 0; rc == 0 && i < e.edges.count(); ++i) rc = settle_splits(e, e.edges[i], e.eps);
  if (rc == 0 && e.overlapCount > 0) rc = share_overlap_splits(e);
  e.halves.reset();
  e.stars.reset();
  return rc;
}

}  // namespace zt::detail
