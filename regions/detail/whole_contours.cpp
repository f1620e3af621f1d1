// Contours that meet the other operand nowhere are kept or dropped whole, by
// the parity of the crossings of a ray from their first point towards +x with
// the other operand's edges.
#include <cmath>
#include <limits>

#include "regions/detail/engine.hpp"

namespace zt::detail {

namespace {

bool meets(const Edge& edge, const Vertex* v) {
  if (edge.start == v || edge.end == v) return true;
  for (const SplitPoint* sp = edge.splits; sp; sp = sp->next)
    if (sp->vertex == v) return true;
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
    if (edge.open || (skip && meets(edge, skip))) continue;
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

void classify_whole_contours(BooleanEngine& e, PolygonSet& x, PolygonSet& y, std::int32_t flag) {
  for (std::int32_t ci = 0; ci < x.contours.count(); ++ci) {
    InputContour& c = x.contours[ci];
    if (contour_has_splits(e, c)) {
      c.keepWhole = 0;
      continue;
    }
    const TaggedPoint& p = c.firstBlock->points[0];
    const std::int32_t parity = count_ray_crossings(e, y, p.x, p.y) % 2;
    c.keepWhole = flag == 1 ? parity : 1 - parity;
  }
}

}  // namespace zt::detail
