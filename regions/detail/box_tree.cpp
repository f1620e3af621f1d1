// Finishing a polygon set: its contours' points become grid vertices, its
// consecutive distinct vertices edges with their exact extents as boxes, and
// the boxes are indexed by a box tree split at the median of the longer side.
// Exact extents keep the tree as fine as the data however far apart its
// pieces lie: no rounding to a fixed fraction of the joint box can put a
// dense contour's boxes on top of each other.
#include <algorithm>
#include <cmath>
#include <initializer_list>
#include <new>
#include <utility>

#include "regions/detail/engine.hpp"

namespace zt::detail {

namespace {

// How many points ahead of a lookup its bucket, then its first vertex, are fetched.
constexpr std::int32_t kBucketPrefetch = 8;
constexpr std::int32_t kVertexPrefetch = 4;

int append_edge(BooleanEngine& e, Vertex* from, Vertex* to, std::int32_t tag) {
  Edge* edge = e.edges.take();
  if (!edge) return -1;
  *edge = Edge{from, to, nullptr, static_cast<std::uint32_t>(tag)};
  EdgeBox* box = e.boxes.take();
  if (!box) return -1;
  box->xmin = std::min(from->x, to->x);
  box->xmax = std::max(from->x, to->x);
  box->ymin = std::min(from->y, to->y);
  box->ymax = std::max(from->y, to->y);
  box->edge = edge;
  return 0;
}

template <bool kByX>
double key_of(const EdgeBox& b) {
  return kByX ? b.xmin : b.ymin;
}

template <bool kByX>
std::int64_t select_on_axis(EdgeBox* boxes, std::int32_t lo, std::int32_t hi, std::int32_t m) {
  std::int64_t comparisons = 0;
  // Hoare partitions around the key at m; both scans stop on keys equal to
  // the pivot and swap them, so runs of equal keys split evenly instead of
  // degrading into one-element steps.
  while (hi - lo >= kLeafSpan) {
    const double pivot = key_of<kByX>(boxes[m]);
    std::int32_t i = lo, j = hi;
    while (i <= j) {
      while (++comparisons, key_of<kByX>(boxes[i]) < pivot) ++i;
      while (++comparisons, key_of<kByX>(boxes[j]) > pivot) --j;
      if (i <= j) {
        std::swap(boxes[i], boxes[j]);
        ++i;
        --j;
      }
    }
    if (m <= j) {
      hi = j;
    } else if (m >= i) {
      lo = i;
    } else {
      return comparisons;  // m lies in a run equal to the pivot
    }
  }
  for (std::int32_t p = lo; p <= m; ++p) {
    std::int32_t best = p;
    for (std::int32_t q = p + 1; q <= hi; ++q) {
      ++comparisons;
      if (key_of<kByX>(boxes[q]) < key_of<kByX>(boxes[best])) best = q;
    }
    if (best != p) std::swap(boxes[p], boxes[best]);
  }
  return comparisons;
}

// Builds the node over boxes[first..last] of the tree copy.
BoxTreeNode* build_node(BooleanEngine& e, EdgeBox* boxes, std::int32_t first, std::int32_t last) {
  BoxTreeNode* node = e.nodes.take();
  if (!node) return nullptr;
  *node = BoxTreeNode{};
  node->first = first;
  node->last = last;
  const EdgeBox& b0 = boxes[first];
  double xmin = b0.xmin, ymin = b0.ymin, xmax = b0.xmax, ymax = b0.ymax;
  for (std::int32_t i = first + 1; i <= last; ++i) {
    const EdgeBox& b = boxes[i];
    xmin = std::min(xmin, b.xmin);
    ymin = std::min(ymin, b.ymin);
    xmax = std::max(xmax, b.xmax);
    ymax = std::max(ymax, b.ymax);
  }
  node->xmin = xmin, node->ymin = ymin, node->xmax = xmax, node->ymax = ymax;
  if (last - first <= kLeafSpan) {
    node->run = boxes[first].edge->run;
    for (std::int32_t i = first + 1; i <= last && node->run >= 0; ++i)
      if (boxes[i].edge->run != node->run) node->run = -1;
    return node;
  }
  const bool byX = node->xmax - node->xmin > node->ymax - node->ymin;
  const std::int32_t m = first + (last - first) / 2;
  select_median(boxes, first, last, m, byX);
  node->low = build_node(e, boxes, first, m);
  if (!node->low) return nullptr;
  node->high = build_node(e, boxes, m + 1, last);
  if (!node->high) return nullptr;
  if (node->low->run == node->high->run) node->run = node->low->run;
  return node;
}

// The tree is built on a contiguous copy of the set's boxes (the selection
// moves them a lot), which the walks then read: the copy holds both sets'
// boxes, indexed like the pool.
int build_tree(BooleanEngine& e, PolygonSet& set) {
  const std::int32_t need = set.lastBox + 1;
  if (need > e.treeBoxCapacity) {
    if (!allocationAllowed()) return -1;
    const std::int32_t capacity = std::max(need, 2 * e.treeBoxCapacity);
    EdgeBox* grown = new (std::nothrow) EdgeBox[static_cast<std::size_t>(capacity)];
    if (!grown) return -1;
    std::copy(e.treeBoxes, e.treeBoxes + set.firstBox, grown);
    delete[] e.treeBoxes;
    e.treeBoxes = grown;
    e.treeBoxCapacity = capacity;
  }
  for (std::int32_t i = set.firstBox; i <= set.lastBox; ++i) e.treeBoxes[i] = e.boxes[i];
  set.root = build_node(e, e.treeBoxes, set.firstBox, set.lastBox);
  return set.root ? 0 : -1;
}

// Runs: stretches of consecutive edges of one contour that the walk of
// their operand against itself may skip. In a closed contour, edges that
// each advance by more than kPairRejectMargin in one direction of one axis
// cannot be near unless consecutive (the edge between keeps them apart),
// and consecutive ones are tested only where more than two of their
// operand's edge ends meet, which no run passes. An open contour is one run:
// no pair of its edges is tested.
bool advances(const Edge& edge, int direction) {
  const double m = kPairRejectMargin;
  switch (direction) {
    case 0: return edge.end->x > edge.start->x + m;
    case 1: return edge.start->x > edge.end->x + m;
    case 2: return edge.end->y > edge.start->y + m;
    default: return edge.start->y > edge.end->y + m;
  }
}

void mark_runs(BooleanEngine& e, const InputContour& c, std::int32_t owner) {
  if (!c.closed) {
    const std::int32_t run = e.runCount++;
    for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) e.edges[k].run = run;
    return;
  }
  std::int32_t k = c.firstEdge;
  while (k < c.endEdge) {
    Edge& first = e.edges[k];
    const double dx = first.end->x - first.start->x, dy = first.end->y - first.start->y;
    const int direction = std::fabs(dx) >= std::fabs(dy) ? (dx > 0 ? 0 : 1) : (dy > 0 ? 2 : 3);
    const std::int32_t run = e.runCount++;
    first.run = run;
    ++k;
    if (!advances(first, direction)) continue;
    while (k < c.endEdge && advances(e.edges[k], direction) && e.edges[k].start->ends[owner - 1] <= 2) {
      e.edges[k].run = run;
      ++k;
    }
  }
}

}  // namespace

std::int64_t select_median(EdgeBox* boxes, std::int32_t lo, std::int32_t hi, std::int32_t m, bool byX) {
  return byX ? select_on_axis<true>(boxes, lo, hi, m) : select_on_axis<false>(boxes, lo, hi, m);
}

int finish_set(BooleanEngine& e, PolygonSet& set) {
  set.firstBox = e.boxes.count();
  for (std::int32_t ci = 0; ci < set.contours.count(); ++ci) {
    InputContour& c = set.contours[ci];
    c.firstEdge = e.edges.count();
    Vertex* firstVertex = nullptr;
    Vertex* prev = nullptr;
    std::int32_t prevTag = 0;
    bool failed = false;
    const TaggedPoint* pts = contour_points(e, c);
    std::int32_t at = 0;
    for_each_stored_point(e, c, [&](const TaggedPoint& p) {
      if (failed) return;
      // Lookups go to scattered buckets: the later points' buckets and
      // first vertices are fetched while this one is looked up.
      if (at + kBucketPrefetch < c.pointCount) grid_prefetch(e.grid, pts[at + kBucketPrefetch].x, pts[at + kBucketPrefetch].y, false);
      if (at + kVertexPrefetch < c.pointCount) grid_prefetch(e.grid, pts[at + kVertexPrefetch].x, pts[at + kVertexPrefetch].y, true);
      ++at;
      Vertex* v = grid_lookup(e.grid, p.x, p.y, set.owner);
      if (!v) {
        failed = true;
        return;
      }
      if (!firstVertex) {
        firstVertex = v;
      } else if (v != prev && append_edge(e, prev, v, prevTag) != 0) {
        failed = true;
        return;
      }
      prev = v;
      prevTag = p.tag;
    });
    if (failed) return -1;
    if (c.closed && prev != firstVertex && append_edge(e, prev, firstVertex, prevTag) != 0) return -1;
    c.endEdge = e.edges.count();
    if (c.closed) {
      for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) {
        for (Vertex* v : {e.edges[k].start, e.edges[k].end}) {
          std::int16_t& ends = v->ends[set.owner - 1];
          if (ends < kManyEnds) ++ends;
        }
      }
    }
  }
  set.lastBox = e.boxes.count() - 1;
  if (set.lastBox < set.firstBox) return -1;
  // Every end is counted now, so runs can stop where contours touch.
  for (std::int32_t ci = 0; ci < set.contours.count(); ++ci) mark_runs(e, set.contours[ci], set.owner);
  return build_tree(e, set);
}

}  // namespace zt::detail
