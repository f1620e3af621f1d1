// Emission of the result: contours kept whole first (A's, then B's, in
// reading order, with the kept pieces of open contours), then the chains of
// kept half-edges that start at the shared vertices. Every written half-edge
// and its twin are marked so that no piece is written twice.
#include <initializer_list>

#include "regions/detail/engine.hpp"
#include "regions/detail/output_collector.hpp"

namespace zt::detail {

namespace {

void mark_written(HalfEdge* h) { h->emitted = h->twin->emitted = kDoneMark; }

void emit_half_edge(const HalfEdge* h, std::int32_t tag) {
  emit_point(h->origin->x, h->origin->y, tag);
  emit_point(h->twin->origin->x, h->twin->origin->y, tag);
}

// Follows h -> h.twin.link until the chain closes on h or ends. The links
// form a one-to-one map, so a chain cannot enter a loop that avoids h; the
// step bound only guards the claim.
int write_chain(BooleanEngine& e, HalfEdge* h) {
  emit_half_edge(h, static_cast<std::int32_t>(h->edge->tag));
  mark_written(h);
  std::int32_t budget = e.halves.count();
  for (HalfEdge* g = h->twin->link; g && g != h; g = g->twin->link) {
    if (--budget < 0) return -1;
    mark_written(g);
    emit_half_edge(g, g->keep == 1 ? static_cast<std::int32_t>(g->edge->tag) : 0);
  }
  emit_separator();
  return 0;
}

void emit_whole(const BooleanEngine& e, const InputContour& c) {
  const TaggedPoint* first = nullptr;
  const TaggedPoint* last = nullptr;
  for_each_stored_point(e, c, [&](const TaggedPoint& p) {
    if (!first) first = &p;
    last = &p;
    emit_point(p.x, p.y, p.tag);
  });
  if (c.closed && first) {
    if (last->tag != first->tag) emit_point(first->x, first->y, last->tag);
    emit_point(first->x, first->y, first->tag);
  }
  emit_separator();
}

// A closed contour kept whole, written from its first point against its
// input direction; each edge keeps its tag (that of the point it starts
// from as read).
void emit_whole_reversed(const BooleanEngine& e, const InputContour& c) {
  const TaggedPoint* pts = contour_points(e, c);
  const TaggedPoint* to = &pts[0];  // the edge n-1 -> 0 comes first
  for (std::int32_t i = c.pointCount - 1; i >= 0; --i) {
    const TaggedPoint& from = pts[i];
    emit_point(to->x, to->y, from.tag);
    emit_point(from.x, from.y, from.tag);
    to = &from;
  }
  emit_separator();
}

int emit_piece(BooleanEngine& e, Vertex* u, Vertex* v) {
  HalfEdge* h = u->firstOut;
  while (h && h->twin->origin != v) h = h->nextOut;
  if (!h) return -1;
  if (h->keep == 1 && h->emitted != kDoneMark) return write_chain(e, h);
  return 0;
}

int emit_open_contour(BooleanEngine& e, const InputContour& c) {
  for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) {
    Edge& edge = e.edges[k];
    Vertex* at = edge.start;
    for (SplitPoint* sp = edge.splits; sp; sp = sp->next) {
      if (sp->vertex == at) continue;
      if (emit_piece(e, at, sp->vertex) != 0) return -1;
      at = sp->vertex;
    }
    if (at != edge.end && emit_piece(e, at, edge.end) != 0) return -1;
  }
  return 0;
}

}  // namespace

void emit_whole_contours(const BooleanEngine& e, const PolygonSet& set) {
  for (std::int32_t ci = 0; ci < set.contours.count(); ++ci) emit_whole(e, set.contours[ci]);
}

int emit_result(BooleanEngine& e, bool resultOnLeft) {
  for (PolygonSet* set : {&e.a, &e.b}) {
    for (std::int32_t ci = 0; ci < set->contours.count(); ++ci) {
      const InputContour& c = set->contours[ci];
      if (c.keepWhole == 1) {
        if (c.reversed == 1) {
          emit_whole_reversed(e, c);
        } else {
          emit_whole(e, c);
        }
      } else if (!c.closed && c.hasSplits == 1) {
        // An open polyline without splits that is not kept has no pieces.
        if (emit_open_contour(e, c) != 0) return -1;
      }
    }
  }
  for (Vertex* v = e.grid.sharedHead; v; v = v->nextShared) {
    for (HalfEdge* h = v->firstOut; h; h = h->nextOut) {
      if (h->keep != 1 || h->emitted == kDoneMark) continue;
      if (!(resultOnLeft ? h->resultLeft == 1 : h->side >= 1)) continue;
      if (write_chain(e, h) != 0) return -1;
    }
  }
  return 0;
}

}  // namespace zt::detail
