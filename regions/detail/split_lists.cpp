// Split lists: the crossings on one edge, in ascending t, any two at least
// eps apart. Crossings are recorded as the box-tree walk finds them and
// settled once the walk is over: in the order found, a crossing is kept
// unless one kept before lies within eps, so of two crossings closer than
// eps the first found stays. Settling sorts instead of inserting one by one,
// so an edge crossed k times costs O(k log k), not O(k^2).
#include <algorithm>
#include <cmath>
#include <new>

#include "regions/detail/engine.hpp"

namespace zt::detail {

int record_split(SplitPool& pool, Edge& edge, double t, Vertex* v) {
  SplitPoint* sp = pool.take();
  if (!sp) return -1;
  *sp = SplitPoint{t, v, edge.splits};  // newest first until settled
  edge.splits = sp;
  return 0;
}

namespace {

bool by_t(const SplitCandidate& a, const SplitCandidate& b) {
  return a.t < b.t || (a.t == b.t && a.order < b.order);
}
bool by_order(const SplitCandidate& a, const SplitCandidate& b) { return a.order < b.order; }

// A kept crossing at `kept` stops one found later at t: within eps of it,
// unless already more than eps beyond t as a walk along the sorted list
// compares them (the two tests differ only in the last bit).
bool clashes(double kept, double t, double eps) { return std::fabs(kept - t) < eps && !(kept - eps > t); }

bool grow_scratch(BooleanEngine& e, std::int32_t n) {
  if (n <= e.splitScratchCapacity) return true;
  delete[] e.splitScratch;
  e.splitScratch = nullptr;
  e.splitScratchCapacity = 0;
  if (!allocationAllowed()) return false;
  e.splitScratch = new (std::nothrow) SplitCandidate[static_cast<std::size_t>(n)];
  if (!e.splitScratch) return false;
  e.splitScratchCapacity = n;
  return true;
}

}  // namespace

int settle_splits(BooleanEngine& e, Edge& edge, double eps) {
  if (!edge.splits || !edge.splits->next) return 0;
  std::int32_t n = 0;
  for (const SplitPoint* sp = edge.splits; sp; sp = sp->next) ++n;
  if (!grow_scratch(e, n)) return -1;
  SplitCandidate* c = e.splitScratch;
  std::int32_t k = n;
  for (SplitPoint* sp = edge.splits; sp; sp = sp->next) {
    --k;
    c[k] = SplitCandidate{sp->t, k, 0, sp};
  }
  std::sort(c, c + n, by_t);
  // Runs of neighbours closer than eps: crossings of different runs are at
  // least eps apart, so each run is decided on its own, in the order found.
  for (std::int32_t lo = 0; lo < n;) {
    std::int32_t hi = lo + 1;
    while (hi < n && std::fabs(c[hi].t - c[hi - 1].t) < eps) ++hi;
    if (hi - lo == 1) {
      c[lo].accepted = 1;
    } else {
      std::sort(c + lo, c + hi, by_order);
      for (std::int32_t i = lo; i < hi; ++i) {
        bool clash = false;
        for (std::int32_t j = lo; j < i && !clash; ++j) clash = c[j].accepted && clashes(c[j].t, c[i].t, eps);
        c[i].accepted = clash ? 0 : 1;
      }
      std::sort(c + lo, c + hi, by_t);
    }
    lo = hi;
  }
  SplitPoint* head = nullptr;
  for (std::int32_t i = n - 1; i >= 0; --i) {
    if (!c[i].accepted) continue;
    c[i].split->next = head;
    head = c[i].split;
  }
  edge.splits = head;
  return 0;
}

}  // namespace zt::detail
