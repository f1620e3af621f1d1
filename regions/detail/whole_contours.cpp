// Contours that meet the other operand nowhere are kept or dropped whole, by
// the parity of the crossings of a ray from their first point towards +x with
// the other operand's edges. Where the result must lie on the left of its
// contours, a kept contour is turned when its own operand's region lies on
// its right: an outer boundary given clockwise, or a hole given
// counter-clockwise.
#include "regions/detail/engine.hpp"

namespace zt::detail {

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
