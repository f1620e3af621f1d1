// Classification at the shared vertices. The half-edges leaving a shared
// vertex are swept counter-clockwise while the inside/outside status of each
// operand (even-odd) is toggled at its own pieces: half-edges running along
// one piece form a group that toggles only when it holds an odd number of
// them, so doubled segments and spikes bound nothing. Each operand's status
// is anchored on a piece of the other operand decided at its far end, or on
// a ray parity, never on the direction of one half-edge. A group is kept
// (one half-edge of it) where the result changes across it; the verdict, the
// other operand's status and the side the result lies on are carried along
// the chain to the next shared vertex, which is swept next, and the kept
// half-edges are paired as output partners.
#include <cmath>
#include <new>
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

// Result of the operation at a point inside (1) or outside (0) each operand.
std::int32_t result_of(const StarRule& r, std::int32_t a, std::int32_t b) {
  if (r.keepAInsideB == 0 && r.keepBInsideA == 0) return a | b;
  if (r.keepAInsideB == 1 && r.keepBInsideA == 1) return a & b;
  return a & (1 - b);
}

// The other operand's status is the same all along a chain, as every
// meeting of the operands is a shared vertex. The side the result lies on
// is not: where a contour crosses itself between two shared vertices, the
// chain passes from one side of its own operand's region to the other, so
// the first verdict on it stands.
bool agrees(const HalfEdge* h, std::int32_t keep, std::int32_t other) {
  if (h->keep != keep) return false;
  return other < 0 || h->otherState < 0 || h->otherState == other;
}

void mark(HalfEdge* h, std::int32_t keep, std::int32_t other, std::int32_t left) {
  h->keep = keep;
  if (other >= 0) h->otherState = other;
  if (keep == 1 && left >= 0 && h->resultLeft < 0) h->resultLeft = left;
}

// Verdict for h and its twin, carried along the contour up to the next
// shared vertex (returned in far), with the other operand's status along
// the chain and the side the result lies on. A different earlier verdict is
// an inconsistency.
int propagate(HalfEdge* h0, std::int32_t keep, std::int32_t other, std::int32_t left, Vertex*& far) {
  far = nullptr;
  const std::int32_t twinLeft = left < 0 ? -1 : 1 - left;
  HalfEdge* h = h0;
  for (;;) {
    if (h->keep != kUndecided) return agrees(h, keep, other) ? 0 : -1;
    mark(h, keep, other, left);
    HalfEdge* t = h->twin;
    if (t->keep != kUndecided && !agrees(t, keep, other)) return -1;
    mark(t, keep, other, twinLeft);
    if (t->origin->owner == kSharedOwner) {
      far = t->origin;
      return 0;
    }
    h = t->link;
    if (!h || h == h0) return 0;
  }
}

Vertex* destination(const StarEntry& s) { return s.to; }
std::int32_t operand_of(const StarEntry& s) { return s.operand; }

bool before(const StarEntry& a, const StarEntry& b) {
  return a.angle < b.angle || (a.angle == b.angle && destination(a)->serial < destination(b)->serial);
}

void sort_entries(StarPool& pool, std::int32_t lo, std::int32_t hi) {
  while (hi - lo + 1 >= kStarSortCutoff) {
    const StarEntry pivot = pool[lo];
    std::int32_t i = lo - 1, j = hi + 1;
    for (;;) {
      do ++i; while (before(pool[i], pivot));
      do --j; while (before(pivot, pool[j]));
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
      if (before(pool[q], pool[best])) best = q;
    if (best != p) std::swap(pool[p], pool[best]);
  }
}

// End (exclusive) of the group of entries from i that run along the same
// piece: same destination, so the same angle.
std::int32_t group_end(StarPool& pool, std::int32_t i, std::int32_t n) {
  std::int32_t j = i + 1;
  while (j < n && destination(pool[j]) == destination(pool[i])) ++j;
  return j;
}

// Inside status of operand x (1 or 2) in the sector just clockwise of the
// first entry. A group toggles it when it holds an odd number of x's
// entries: a piece run along twice (a doubled segment, a spike, a
// there-and-back contour) bounds nothing. Taken from a piece of the other
// operand already decided from its far end when there is one, else from the
// crossings of a ray towards +x with x's edges that do not meet the vertex:
// the ray runs just below the +x axis.
std::int32_t anchor_state(BooleanEngine& e, Vertex* v, std::int32_t x, std::int32_t n) {
  StarPool& pool = e.stars;
  std::int32_t toggles = 0;
  for (std::int32_t i = 0; i < n;) {
    const std::int32_t j = group_end(pool, i, n);
    std::int32_t count = 0;
    for (std::int32_t k = i; k < j; ++k) count += operand_of(pool[k]) == x && !pool[k].open;
    if (count == 0) {
      for (std::int32_t k = i; k < j; ++k)
        if (operand_of(pool[k]) != x && pool[k].half->otherState >= 0) return pool[k].half->otherState ^ toggles;
    }
    toggles ^= count & 1;
    i = j;
  }
  // The ray takes every point within eps of its line as lying above it, so
  // the entries towards +x that end within eps of that line (the last ones
  // in order) lie above it too.
  std::int32_t rayAt = n;
  while (rayAt > 0) {
    const Vertex* to = destination(pool[rayAt - 1]);
    if (!(to->x > v->x && std::fabs(to->y - v->y) <= e.eps)) break;
    --rayAt;
  }
  std::int32_t togglesAtRay = 0;
  for (std::int32_t k = 0; k < rayAt; ++k) togglesAtRay ^= operand_of(pool[k]) == x && !pool[k].open;
  PolygonSet& set = x == 1 ? e.a : e.b;
  return (count_ray_crossings(e, set, v->x, v->y, v) & 1) ^ togglesAtRay;
}

bool push_pending(BooleanEngine& e, std::int32_t& top, Vertex* v) {
  if (top == e.pendingCapacity) {
    if (!allocationAllowed()) return false;
    const std::int32_t grown = e.pendingCapacity < 64 ? 64 : 2 * e.pendingCapacity;
    Vertex** bigger = new (std::nothrow) Vertex*[static_cast<std::size_t>(grown)];
    if (!bigger) return false;
    for (std::int32_t i = 0; i < top; ++i) bigger[i] = e.pending[i];
    delete[] e.pending;
    e.pending = bigger;
    e.pendingCapacity = grown;
  }
  v->sweepMark = 1;
  e.pending[top++] = v;
  return true;
}

int sweep_vertex(BooleanEngine& e, Vertex* vertex, const StarRule& rule, std::int32_t& pending) {
  StarPool& pool = e.stars;
  pool.reset();
  for (HalfEdge* h = vertex->firstOut; h; h = h->nextOut) {
    h->link = nullptr;
    StarEntry* s = pool.take();
    if (!s) return -1;
    const Vertex* to = h->twin->origin;
    const double dx = to->x - vertex->x, dy = to->y - vertex->y;
    const double len = std::sqrt(dx * dx + dy * dy);
    *s = StarEntry{0, 0, pseudo_angle(dx / len, dy / len), h, h->twin->origin, h->side < 0 ? -h->side : h->side,
                   h->edge->open};
  }
  const std::int32_t n = pool.count();
  if (n == 0) return 0;
  sort_entries(pool, 0, n - 1);

  std::int32_t stateA = anchor_state(e, vertex, 1, n);
  std::int32_t stateB = anchor_state(e, vertex, 2, n);
  // Kept entries pair with the next kept one on the side where the result
  // is outside (union) or inside (intersection, difference).
  const std::int32_t pairSide = rule.keepAInsideB == 0 && rule.keepBInsideA == 0 ? 0 : 1;
  for (std::int32_t i = 0; i < n;) {
    const std::int32_t j = group_end(pool, i, n);
    std::int32_t countA = 0, countB = 0, open = 0;
    for (std::int32_t k = i; k < j; ++k) {
      if (pool[k].open) {
        ++open;
      } else {
        (operand_of(pool[k]) == 1 ? countA : countB) += 1;
      }
    }
    const std::int32_t afterA = stateA ^ (countA & 1), afterB = stateB ^ (countB & 1);
    const std::int32_t resultBefore = result_of(rule, stateA, stateB), resultAfter = result_of(rule, afterA, afterB);
    // One entry of the group carries a change of the result: A's copy when
    // both operands' boundaries run along the piece; of several, the one
    // already kept from its far end, else one not yet decided.
    std::int32_t kept = -1;
    if (resultBefore != resultAfter) {
      const std::int32_t from = countA & 1 ? 1 : 2;
      std::int32_t best = -1;
      for (std::int32_t k = i; k < j; ++k) {
        const HalfEdge* h = pool[k].half;
        if (operand_of(pool[k]) != from || pool[k].open) continue;
        const std::int32_t score = h->keep == 1 ? 2 : h->keep == kUndecided ? 1 : 0;
        if (score > best) best = score, kept = k;
      }
    }
    for (std::int32_t k = i; k < j; ++k) {
      StarEntry& s = pool[k];
      const bool ofA = operand_of(s) == 1;
      const std::int32_t other = ofA ? (countB == 0 ? stateB : -1) : (countA == 0 ? stateA : -1);
      if (s.open && kept < 0 && countA + countB == 0 && open == 1) {
        // A lone piece of an open polyline is kept where the other
        // operand's status is the one its operand keeps.
        const std::int32_t flag = ofA ? rule.keepAInsideB : rule.keepBInsideA;
        if ((ofA ? stateB : stateA) == flag) kept = k;
      }
      s.keep = k == kept ? 1 : 0;
      s.direction = k == kept ? (resultAfter == pairSide ? 1 : -1) : 0;
      Vertex* far = nullptr;
      const std::int32_t left = k == kept && !s.open ? resultAfter : -1;
      if (propagate(s.half, s.keep, other, left, far) != 0) return -1;
      if (far && far->sweepMark == 0 && !push_pending(e, pending, far)) return -1;
    }
    stateA = afterA;
    stateB = afterB;
    i = j;
  }

  // Kept pieces of open polylines continue into each other when two meet
  // here, and end here otherwise.
  StarEntry* openEnds[2] = {nullptr, nullptr};
  std::int32_t openKept = 0;
  for (std::int32_t i = 0; i < n; ++i) {
    StarEntry& s = pool[i];
    if (s.keep != 1 || !s.open) continue;
    if (openKept < 2) openEnds[openKept] = &s;
    ++openKept;
    s.direction = kDoneMark;
  }
  if (openKept == 2) {
    openEnds[0]->half->link = openEnds[1]->half;
    openEnds[1]->half->link = openEnds[0]->half;
  }
  // Pair every other kept entry with the next kept one in its direction.
  for (std::int32_t i = 0; i < n; ++i) {
    StarEntry& s = pool[i];
    if (s.keep != 1 || s.direction == kDoneMark) continue;
    if (n < 2) return -1;
    StarEntry* partner = nullptr;
    std::int32_t j = i;
    for (std::int32_t step = 1; step < n; ++step) {
      j = ((j + s.direction) % n + n) % n;
      if (pool[j].keep == 1 && !pool[j].open) {
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
  const StarRule rule{keepAInsideB, keepBInsideA};
  // Vertices are swept in the order their chains reach them, so that most
  // take their anchor from a piece decided at its other end.
  for (Vertex* v = e.grid.sharedHead; v; v = v->nextShared) {
    if (v->sweepMark != 0) continue;
    std::int32_t top = 0;
    if (!push_pending(e, top, v)) return -1;
    while (top > 0) {
      if (sweep_vertex(e, e.pending[--top], rule, top) != 0) return -1;
    }
  }
  return 0;
}

}  // namespace zt::detail
