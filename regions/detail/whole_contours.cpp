// Contours that meet the other operand nowhere are kept or dropped whole, by
// the parity of the crossings of a ray from their first point towards +x with
// the other operand's edges. Where the result must lie on the left of its
// contours, a kept contour is turned when its own operand's region lies on
// its right: an outer boundary given clockwise, or a hole given
// counter-clockwise.
#include <algorithm>
#include <cmath>
#include <limits>
#include <functional>

#include "regions/detail/engine.hpp"

namespace zt::detail {

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

void count_in_node(BooleanEngine& e, const BoxTreeNode* node, const Vertex* skip) {
  const BoxTreeNode& q = e.queryBox;
  if (!boxes_near(q, *node)) return;
  if (node->low) {
    count_in_node(e, node->low, skip);
    count_in_node(e, node->high, skip);
    return;
  }
  IntersectionProbe& pr = e.probe;
  for (std::int32_t i = node->first; i <= node->last; ++i) {
    const EdgeBox& b = e.treeBoxes[i];
    if (!boxes_near(q, b)) continue;
    const Edge& edge = *b.edge;
    if (edge.open) continue;
    if (skip && meets(edge, skip)) {
      // The pieces of the edge that do not end at skip still count: a split
      // vertex within the tolerance of the ray's line bends the edge there,
      // and the piece beyond it may cross the ray.
      const Vertex* from = edge.start;
      for (const SplitPoint* sp = edge.splits;; sp = sp->next) {
        const Vertex* to = sp ? sp->vertex : edge.end;
        if (from != skip && to != skip)
          pr.crossingCount += pr.cross(pr.qx, pr.qy, from->x, from->y, to->x, to->y, pr.eps);
        from = to;
        if (!sp) break;
      }
      continue;
    }
    if (pr.skipEnd > pr.skipFirst && edge_in_range(e.edges, &edge, pr.skipFirst, pr.skipEnd)) continue;
    pr.crossingCount += pr.cross(pr.qx, pr.qy, edge.start->x, edge.start->y, edge.end->x, edge.end->y, pr.eps);
  }
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
  if (set.root) count_in_node(e, set.root, skip);
  return pr.crossingCount;
}

namespace {

// Whether the set's region (even-odd) lies on the left of closed contour c,
// which crosses nothing: c runs counter-clockwise exactly when its inside is
// on its left, and the other contours around it, counted by a ray from the
// middle of its first edge that leaves c's own edges out, say whether that
// inside is the set's region or a hole in it.
bool region_on_left(BooleanEngine& e, PolygonSet& set, const InputContour& c) {
  const Vertex* o = e.edges[c.firstEdge].start;
  double twiceArea = 0.0;
  for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) {
    const Edge& edge = e.edges[k];
    twiceArea += (edge.start->x - o->x) * (edge.end->y - o->y) - (edge.end->x - o->x) * (edge.start->y - o->y);
  }
  const Edge& first = e.edges[c.firstEdge];
  IntersectionProbe& pr = e.probe;
  pr.skipFirst = c.firstEdge;
  pr.skipEnd = c.endEdge;
  const std::int32_t enclosing = count_ray_crossings(e, set, 0.5 * (first.start->x + first.end->x),
                                                     0.5 * (first.start->y + first.end->y));
  pr.skipFirst = pr.skipEnd = 0;
  return ((enclosing & 1) == 1) != (twiceArea > 0.0);
}

}  // namespace

void classify_whole_contours(BooleanEngine& e, PolygonSet& x, PolygonSet& y, std::int32_t flag,
                             bool resultOnLeft) {
  for (std::int32_t ci = 0; ci < x.contours.count(); ++ci) {
    InputContour& c = x.contours[ci];
    c.reversed = 0;
    if (contour_has_splits(e, c)) {
      c.keepWhole = 0;
      continue;
    }
    const TaggedPoint& p = contour_points(e, c)[0];
    const std::int32_t parity = count_ray_crossings(e, y, p.x, p.y) % 2;
    c.keepWhole = flag == 1 ? parity : 1 - parity;
    if (resultOnLeft && c.keepWhole == 1 && c.closed && c.endEdge > c.firstEdge)
      c.reversed = region_on_left(e, x, c) ? 0 : 1;
  }
}

}  // namespace zt::detail
