// The point phase's view of its next few insertions.
//
// Point insertion is bound by memory latency: a random insertion order
// scatters the records of neighbouring sites over the arrays, and every
// step of an insertion waits for the one before it. The lookahead draws the
// order a few entries ahead and moves each drawn point through stages, one
// insertion apart, so that its loads are requested long before they are
// needed (slot i is inserted i insertions from now):
//   slot 9: drawn, its point record requested;
//   slot 8: the heads of the grid cells around it requested (with the
//           quadtree: a walk down the path a search for it takes started,
//           which goes on from checkpoints until the search; a quadtree
//           is deep, so the walk starts early);
//   slot 6: the first entries of those cells requested;
//   slot 4: its nearest point looked up (which enters it into the search)
//           and a walk of that point's region started;
//   slots 4..0: the walk goes on from checkpoints of the insertions between.
// The depths were measured (searches two to nine insertions early): four
// was fastest; less leaves the walks too few checkpoints to hide their
// loads, more was slower again.
//
// Promise: the points come out in the order DrawNext gives, each with the
// nearest point a search just before its insertion would find. Searches run
// in draw order, and an insertion changes nothing a search reads short of a
// restart, after which every lookup is made again. On a restart, Abandon
// gives the draws not yet inserted back to the generator, so the sequence
// of draws is that of drawing one at a time. Everything else is hints.
#pragma once

#include <cstdint>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/nearest_search.hpp"
#include "voronoi/detail/region_prefetch.hpp"

namespace zt::vd {

class PointLookahead {
 public:
  // With a presorted order (see insertion_order.hpp) the nearest point
  // comes from a walk through the diagram just before the insertion (see
  // nearest_walk.hpp), and the lookahead only requests the point records;
  // the search structure is then not used. `firstSite` is a point of the
  // diagram the first walk starts from.
  explicit PointLookahead(bool walk = false, std::int32_t firstSite = kNone)
      : walk_(walk), from_(firstSite) {}


  // The next point to insert and its nearest point; -1 when the order is
  // exhausted.
  std::int32_t Next(Nearest& nearest);

  // A checkpoint inside an insertion: one step of one of the walks under
  // way, in turn, so that a walk's next record has time to arrive.
  void Step(Engine& g) {
    // Walks through the diagram need no hints: the last insertion left the
    // records around the next point in cache.
    if (walk_ || count_ == 0) return;
    if (++turn_ >= count_) turn_ = 0;
    Slot& s = At(turn_);
    if (s.pathNode >= 0) s.pathNode = NearestPathStep(s.pathNode, s.x, s.y);
    else s.walk.Step(g);
  }

  // The phase ends on a restart before the points drawn ahead are inserted.
  void Abandon();

 private:
  enum Stage { kDrawn, kCellsRequested, kEntriesRequested, kSearched };
  static constexpr int kSlots = 10;
  static constexpr int kSearchedSlots = 5;  // slots 0..4
  static constexpr int kEntriesSlot = 6;
  static constexpr int kCellsSlot = 8;
  static_assert(kSlots - 1 <= OrderRandom::kMaxGivenBack);

  struct Slot {
    std::int32_t point;
    std::uint32_t value;  // the generator's value that drew it
    Stage stage;
    Nearest nearest;
    RegionPrefetch walk;
    std::int32_t pathNode;  // of a walk down the quadtree, -1 if none
    double x, y;
  };
  Slot& At(int i) { return slots_[(first_ + i) % kSlots]; }
  std::int32_t NextByWalk(Nearest& nearest);

  Slot slots_[kSlots] = {};
  int first_ = 0;
  int count_ = 0;
  int turn_ = 0;
  bool walk_ = false;
  std::int32_t from_ = kNone;  // a site of the diagram near the next point
  std::int32_t last_ = kNone;  // the point given out last
};

}  // namespace zt::vd
