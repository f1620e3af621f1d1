// Classification at the shared vertices. The half-edges leaving a shared
// vertex are swept counter-clockwise while the inside/outside status of each
// operand is toggled at its own half-edges; each half-edge is kept or dropped
// from the other operand's status, the verdict is carried along its chain up
// to the next shared vertex, and the kept half-edges are paired as output
// partners.
#include <cmath>
#include <utility>

#include "regions/detail/engine.hpp"

namespace zt::detail {

// Below this many entries a sort range is finished by selection.
inline constexpr std::int32_t kStarSortCutoff = 20;

double pseudo_angle(double c, double s) {
  if (c > 0) {
    if (s > c) return 2.0 - c / s;
    if (s > 0) return s / c;
    if (-c > s) return 6.0 - c / s;
    return s / c + 8.0;
  }
  if (s > -c) return 2.0 - c / s;
  if (c > s) return 6.0 - c / s;
  return s / c + 4.0;
}

namespace {

// Verdict v for h and its twin, carried along the contour up to the next
// shared vertex. A different earlier verdict is an inconsistency.
int propagate(HalfEdge* h0, std::int32_t v) {
  HalfEdge* h = h0;
  for (;;) {
    if (h->keep != kUndecided) return h->keep == v ? 0 : -1;
    h->keep = v;
    HalfEdge* t = h->twin;
    if (t->keep != kUndecided && t->keep != v) return -1;
    t->keep = v;
    if (t->origin->owner == kSharedOwner) return 0;
    h = t->link;
    if (!h || h == h0) return 0;
  }
}

void sort_entries(StarPool& pool, std::int32_t lo, std::int32_t hi) {
  while (hi - lo + 1 >= kStarSortCutoff) {
    const double pivot = pool[lo].angle;
    std::int32_t i = lo - 1, j = hi + 1;
    for (;;) {
      do ++i; while (pool[i].angle < pivot);
      do --j; while (pool[j].angle > pivot);
      if (i >= j) break;
      std::swap(pool[i], pool[j]);
    }
    // Recurse into the smaller side so the depth stays logarithmic.
    if (j - lo < hi - j) {
      sort_entries(pool, lo, j);
      lo = j + 1;
    } else {
      sort_entries(pool, j + 1, hi);
      hi = j;
    }
  }
  for (std::int32_t p = lo; p < hi; ++p) {
    std::int32_t best = p;
    for (std::int32_t q = p + 1; q <= hi; ++q)
      if (pool[q].angle < pool[best].angle) best = q;
    if (best != p) std::swap(pool[p], pool[best]);
  }
}

Vertex* destination(const StarEntry& s) { return s.half->twin->origin; }
std::int32_t operand_of(const StarEntry& s) { return s.half->side < 0 ? -s.half->side : s.half->side; }

int decide(StarEntry& s, bool keep, std::int32_t direction) {
  s.keep = keep ? 1 : 0;
  s.direction = keep ? direction : 0;
  return propagate(s.half, s.keep);
}

int sweep_vertex(BooleanEngine& e, Vertex* vertex, std::int32_t kAB, std::int32_t kBA) {
  StarPool& pool = e.stars;
  pool.reset();
  for (HalfEdge* h = vertex->firstOut; h; h = h->nextOut) {
    h->link = nullptr;
    StarEntry* s = pool.take();
    if (!s) return -1;
    const Vertex* to = h->twin->origin;
    const double dx = to->x - vertex->x, dy = to->y - vertex->y;
    const double len = std::sqrt(dx * dx + dy * dy);
    *s = StarEntry{0, 0, pseudo_angle(dx / len, dy / len), h, nullptr};
  }
  const std::int32_t n = pool.count();
  if (n == 0) return 0;
  sort_entries(pool, 0, n - 1);

  // Start the sweep after the last pair of neighbours of one operand that run
  // along the same piece, so such a pair is never split across the seam.
  std::int32_t z = n - 1;
  for (std::int32_t i = 1; i < n; ++i) {
    if (operand_of(pool[i - 1]) == operand_of(pool[i]) && destination(pool[i - 1]) == destination(pool[i]))
      z = (i + 1) % n;
  }
  StarEntry* headA = nullptr;
  StarEntry* headB = nullptr;
  StarEntry* tailA = nullptr;
  StarEntry* tailB = nullptr;
  for (std::int32_t k = 0; k < n; ++k) {
    StarEntry* s = &pool[(z + 1 + k) % n];
    StarEntry*& head = operand_of(*s) == 1 ? headA : headB;
    StarEntry*& tail = operand_of(*s) == 1 ? tailA : tailB;
    if (tail) {
      tail->next = s;
    } else {
      head = s;
    }
    tail = s;
  }
  // Status of the sector just clockwise of the first entry: inside when that
  // entry runs against its contour (contours bound their region on the left).
  std::int32_t stateA = headA ? (headA->half->side <= 0 ? 1 : 0) : -1;
  std::int32_t stateB = headB ? (headB->half->side <= 0 ? 1 : 0) : -1;
  StarEntry* a = headA;
  StarEntry* b = headB;
  while (a || b) {
    if (a && b && destination(*a) == destination(*b)) {
      const bool keepA = (stateA == kBA && stateB == kAB) || (1 - stateA == kBA && 1 - stateB == kAB);
      if (decide(*a, keepA, stateA != kBA ? 1 : -1) != 0) return -1;
      if (decide(*b, false, 0) != 0) return -1;
      stateA = 1 - stateA;
      stateB = 1 - stateB;
      a = a->next;
      b = b->next;
    } else if (a && (!b || b->angle > a->angle)) {
      if (decide(*a, stateB == kAB, stateA != kBA ? 1 : -1) != 0) return -1;
      stateA = 1 - stateA;
      a = a->next;
    } else {
      if (decide(*b, stateA == kBA, stateB != kAB ? 1 : -1) != 0) return -1;
      stateB = 1 - stateB;
      b = b->next;
    }
  }

  // Pair every kept entry with the next kept one in its direction.
  for (std::int32_t i = 0; i < n; ++i) {
    StarEntry& s = pool[i];
    if (s.keep != 1 || s.direction == kDoneMark) continue;
    if (n < 2) return -1;
    StarEntry* partner = nullptr;
    std::int32_t j = i;
    for (std::int32_t step = 1; step < n; ++step) {
      j = ((j + s.direction) % n + n) % n;
      if (pool[j].keep == 1) {
        partner = &pool[j];
        break;
      }
    }
    if (!partner || partner->direction == kDoneMark) return -1;
    s.half->link = partner->half;
    partner->half->link = s.half;
    s.direction = partner->direction = kDoneMark;
  }
  return 0;
}

}  // namespace

int classify_stars(BooleanEngine& e, std::int32_t keepAInsideB, std::int32_t keepBInsideA) {
  for (Vertex* v = e.grid.sharedHead; v; v = v->nextShared) {
    if (sweep_vertex(e, v, keepAInsideB, keepBInsideA) != 0) return -1;
  }
  return 0;
}

}  // namespace zt::detail
