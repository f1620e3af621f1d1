// The point phase's lookahead (see point_lookahead.hpp).
#include "voronoi/detail/point_lookahead.hpp"

#include "voronoi/detail/insertion_order.hpp"
#include "voronoi/detail/nearest_walk.hpp"

namespace zt::vd {

std::int32_t PointLookahead::Next(Nearest& nearest) {
  Engine& g = Vd();
  if (walk_) return NextByWalk(nearest);
  while (count_ < kSlots) {
    const Draw d = DrawNext();
    if (d.entry < 0) break;
    At(count_++) = Slot{d.entry, d.value, kDrawn, Nearest{}, RegionPrefetch{}, kNone, 0.0, 0.0};
    g.points.Prefetch(d.entry);
  }
  if (count_ == 0) return kNone;
  // Slots advance in order, so the searches run in draw order.
  for (int i = 0; i < count_; ++i) {
    Slot& s = At(i);
    if (s.stage == kDrawn && i >= kSearchedSlots && i <= kCellsSlot) {
      // Its record was requested an insertion ago (or, on the first call,
      // just now).
      s.x = g.points[s.point].x;
      s.y = g.points[s.point].y;
    }
    if (i < kSearchedSlots) {
      if (s.stage == kSearched) continue;
      s.nearest = FindAndInsertNearest(s.point);
      s.walk.Start(g, s.nearest.point);
      s.pathNode = kNone;
      s.stage = kSearched;
    } else if (i <= kEntriesSlot && s.stage < kEntriesRequested) {
      PrefetchNearestEntries(s.x, s.y);
      s.stage = kEntriesRequested;
    } else if (i <= kCellsSlot && s.stage < kCellsRequested) {
      PrefetchNearestCells(s.x, s.y);
      s.pathNode = NearestPathStart();
      s.stage = kCellsRequested;
    }
  }
  const Slot& front = At(0);
  nearest = front.nearest;
  const std::int32_t p = front.point;
  first_ = (first_ + 1) % kSlots;
  --count_;
  return p;
}

std::int32_t PointLookahead::NextByWalk(Nearest& nearest) {
  Engine& g = Vd();
  // The walk starts at the point inserted last; a point merged away has no
  // region, and then the site its own walk ended at is as close.
  if (last_ >= 0 && g.points[last_].vd >= 0 && !g.points[last_].deleted) from_ = last_;
  const std::int32_t p = DrawNext().entry;
  if (p < 0) return kNone;
  // A presorted order is drawn front to back: the record of the point
  // kSlots - 1 draws ahead is requested now.
  const std::int32_t ahead = g.insertionOrder.count - g.orderRemaining + kSlots - 2;
  if (ahead < g.insertionOrder.count) g.points.Prefetch(g.insertionOrder[ahead]);
  nearest = g.points[p].deleted ? Nearest{} : WalkToNearest(from_, p);
  if (nearest.point >= 0) from_ = nearest.point;
  last_ = p;
  return p;
}

void PointLookahead::Abandon() {
  // A presorted order was built with the generator's values before its
  // first draw; its draws took none.
  if (!Vd().orderPresorted)
    for (int i = count_ - 1; i >= 0; --i) Vd().random.GiveBack(At(i).value);
  count_ = 0;
}

}  // namespace zt::vd
