// The half-edge graph of the cut contours: every piece of an edge between
// consecutive split vertices becomes a pair of twin half-edges, and the
// half-edges leaving one vertex along one contour are linked to each other,
// so that h -> h.twin.link walks a contour piece by piece.
#include "regions/detail/engine.hpp"

namespace zt::detail {

bool contour_has_splits(BooleanEngine& e, InputContour& c) {
  if (c.hasSplits < 0) {
    c.hasSplits = 0;
    for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) {
      if (e.edges[k].splits) {
        c.hasSplits = 1;
        break;
      }
    }
  }
  return c.hasSplits == 1;
}

namespace {

struct ContourCursor {
  HalfEdge* previousReverse = nullptr;
  HalfEdge* firstForward = nullptr;
};

void link_pair(HalfEdge* a, HalfEdge* b) {
  a->link = b;
  b->link = a;
}

// A vertex where more than two half-edges of one operand meet (a contour
// touching itself or another contour of its operand, the ends of a doubled
// segment) becomes a shared vertex, so that the pieces meeting there are
// classified by a sweep rather than followed along one contour.
void note_branching(BooleanEngine& e, Vertex* v) {
  if (v->owner == kSharedOwner || !v->firstOut || !v->firstOut->nextOut) return;
  v->owner = kSharedOwner;
  v->nextShared = e.grid.sharedHead;
  e.grid.sharedHead = v;
}

int make_pair(BooleanEngine& e, ContourCursor& cur, Vertex* u, Vertex* v, Edge* edge, std::int32_t owner) {
  HalfEdge* f = e.halves.take();
  if (!f) return -1;
  HalfEdge* r = e.halves.take();
  if (!r) return -1;
  note_branching(e, u);
  note_branching(e, v);
  *f = HalfEdge{owner, kUndecided, -1, -1, u, r, u->firstOut, nullptr, edge};
  *r = HalfEdge{-owner, kUndecided, -1, -1, v, f, v->firstOut, nullptr, edge};
  u->firstOut = f;
  v->firstOut = r;
  if (cur.previousReverse) link_pair(cur.previousReverse, f);
  cur.previousReverse = r;
  if (!cur.firstForward) cur.firstForward = f;
  return 0;
}

}  // namespace

int build_half_edges(BooleanEngine& e, PolygonSet& set) {
  for (std::int32_t ci = 0; ci < set.contours.count(); ++ci) {
    InputContour& c = set.contours[ci];
    if (!contour_has_splits(e, c)) continue;
    ContourCursor cur;
    for (std::int32_t k = c.firstEdge; k < c.endEdge; ++k) {
      Edge& edge = e.edges[k];
      Vertex* at = edge.start;
      for (SplitPoint* sp = edge.splits; sp; sp = sp->next) {
        if (sp->vertex == at) continue;
        if (make_pair(e, cur, at, sp->vertex, &edge, set.owner) != 0) return -1;
        at = sp->vertex;
      }
      if (at != edge.end && make_pair(e, cur, at, edge.end, &edge, set.owner) != 0) return -1;
    }
    if (cur.firstForward && cur.previousReverse &&
        cur.firstForward->origin == cur.previousReverse->origin)
      link_pair(cur.firstForward, cur.previousReverse);
    c.firstHalf = cur.firstForward;
    c.lastHalf = cur.previousReverse;
  }
  return 0;
}

}  // namespace zt::detail
