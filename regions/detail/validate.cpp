// Debug-build checks of the overlay's invariants, cheap enough to run on
// every operation of the test suites: twins, outgoing lists, contour links,
// keep marks, and the pairing of kept half-edges at shared vertices.
#include "regions/detail/engine.hpp"

namespace zt::detail {

bool overlay_is_consistent(BooleanEngine& e, bool afterStars) {
  const std::int32_t n = e.halves.count();
  for (std::int32_t i = 0; i < n; ++i) {
    const HalfEdge& h = e.halves[i];
    const HalfEdge* t = h.twin;
    if (!t || t->twin != &h || t == &h) return false;
    if (t->side != -h.side || t->edge != h.edge || t->origin == h.origin) return false;
    if (h.keep < kUndecided || h.keep > 1) return false;
    if (h.link && h.link->origin != h.origin) return false;
    if (!afterStars) {
      // Contour links pair the two half-edges that leave one vertex along one contour.
      if (h.link && (h.link->link != &h || h.link->side != -h.side)) return false;
      if (h.keep != kUndecided) return false;
    } else if (h.keep != t->keep) {
      return false;  // a verdict covers a piece in both directions
    }
  }
  std::int64_t listed = 0;
  for (std::int32_t i = 0; e.grid.vertices && i < e.grid.vertices->count(); ++i) {
    const Vertex& v = (*e.grid.vertices)[i];
    for (const HalfEdge* h = v.firstOut; h; h = h->nextOut) {
      if (h->origin != &v || ++listed > n) return false;
    }
  }
  if (listed != n) return false;
  if (!afterStars) return true;
  for (const Vertex* v = e.grid.sharedHead; v; v = v->nextShared) {
    if (v->owner != kSharedOwner) return false;
    for (const HalfEdge* h = v->firstOut; h; h = h->nextOut) {
      if (h->keep == kUndecided) return false;
      // A kept piece of an open polyline may end here without a partner.
      if (h->keep == 1 && !h->link && h->edge->open) continue;
      if (h->keep == 1 && (!h->link || h->link->link != h || h->link->keep != 1)) return false;
    }
  }
  return true;
}

}  // namespace zt::detail
