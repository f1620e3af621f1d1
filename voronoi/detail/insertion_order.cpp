// The random insertion orders (see insertion_order.hpp).
#include "voronoi/detail/insertion_order.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <utility>
#include <vector>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {
// How many draws ahead the entries are requested.
constexpr int kDrawPrefetch = 12;
// The first round of a point order: left in random order.
constexpr std::int32_t kFirstRound = 128;
static_assert(kDrawPrefetch <= OrderRandom::kMaxPeek);
// Ahead of this many entries, the key of a shuffled entry is requested.
constexpr std::int32_t kKeyPrefetch = 16;

// Hilbert curve digits four levels at a time: indexed by the orientation
// state (2 bits) and a nibble of x and y, an entry holds the next state
// (bits 8-9) and the eight bits of curve position of those four levels.
// A level is the usual step: the quadrant's digit, and below a lower
// quadrant the remaining bits swapped (and complemented on the right); as
// both act on all lower bits at once, the state is just those two flags.
constexpr std::array<std::uint16_t, 1024> MakeHilbertTable() {
  std::array<std::uint16_t, 1024> t{};
  for (unsigned state = 0; state < 4; ++state)
    for (unsigned xn = 0; xn < 16; ++xn)
      for (unsigned yn = 0; yn < 16; ++yn) {
        unsigned complemented = state & 1, swapped = state >> 1, digits = 0;
        for (int b = 3; b >= 0; --b) {
          unsigned bx = (xn >> b) & 1, by = (yn >> b) & 1;
          if (complemented) bx ^= 1, by ^= 1;
          if (swapped) std::swap(bx, by);
          digits = digits << 2 | ((3 * bx) ^ by);
          if (by == 0) complemented ^= bx, swapped ^= 1;
        }
        t[state << 8 | xn << 4 | yn] = static_cast<std::uint16_t>((swapped << 1 | complemented) << 8 | digits);
      }
  return t;
}
constexpr std::array<std::uint16_t, 1024> kHilbertTable = MakeHilbertTable();

// Position of (x, y) on the Hilbert curve through a 2^32 x 2^32 grid. A
// table, not a loop over the 32 levels: that loop's branches on the bits
// of random points are mispredicted half the time.
std::uint64_t HilbertKey(std::uint32_t x, std::uint32_t y) {
  std::uint64_t d = 0;
  unsigned state = 0;
  for (int shift = 28; shift >= 0; shift -= 4) {
    const std::uint16_t t = kHilbertTable[state << 8 | ((x >> shift) & 15) << 4 | ((y >> shift) & 15)];
    d = d << 8 | (t & 0xff);
    state = t >> 8;
  }
  return d;
}

}  // namespace

void BuildPointOrder(std::int32_t first, std::int32_t end) {
  Engine& g = Vd();
  BuildOrder(first, end);
  std::int32_t* order = g.insertionOrder.data;
  const std::int32_t n = g.insertionOrder.count;
  // A set as small as the first round is drawn at random, one draw at a time.
  if (!g.presortPointOrder || n < 2 * kFirstRound) return;
  for (std::int32_t i = n - 1; i > 0; --i) {
    const std::int32_t j = static_cast<std::int32_t>(g.random() % static_cast<std::uint32_t>(i + 1));
    std::swap(order[i], order[j]);
  }
  g.orderPresorted = true;
  // Box and keys in index order: the points are read front to back, not
  // at the shuffled order's random places.
  double minX = g.points[first].x, maxX = minX, minY = g.points[first].y, maxY = minY;
  for (std::int32_t i = first + 1; i < end; ++i) {
    const PointRecord& p = g.points[i];
    minX = std::fmin(minX, p.x), maxX = std::fmax(maxX, p.x);
    minY = std::fmin(minY, p.y), maxY = std::fmax(maxY, p.y);
  }
  const double span = std::fmax(maxX - minX, maxY - minY);
  const double toGrid = span > 0 ? 4294967295.0 / span : 0.0;
  std::vector<std::uint64_t> key(static_cast<std::size_t>(n));
  for (std::int32_t i = 0; i < n; ++i) {
    const PointRecord& p = g.points[first + i];
    const auto gx = static_cast<std::uint32_t>(std::fmin((p.x - minX) * toGrid, 4294967295.0));
    const auto gy = static_cast<std::uint32_t>(std::fmin((p.y - minY) * toGrid, 4294967295.0));
    key[i] = HilbertKey(gx, gy);
  }
  std::vector<std::pair<std::uint64_t, std::int32_t>> keyed(static_cast<std::size_t>(n));
  for (std::int32_t i = 0; i < n; ++i) {
    if (i + kKeyPrefetch < n) __builtin_prefetch(key.data() + (order[i + kKeyPrefetch] - first));
    keyed[i] = {key[order[i] - first], order[i]};
  }
  // Rounds [n/2, n), [n/4, n/2), ... down to the first, left random.
  for (std::int32_t hi = n; hi >= 2 * kFirstRound; hi /= 2) {
    std::sort(keyed.begin() + hi / 2, keyed.begin() + hi);
  }
  for (std::int32_t i = 0; i < n; ++i) order[i] = keyed[i].second;
}

void BuildOrder(std::int32_t first, std::int32_t end) {
  Engine& g = Vd();
  g.orderPresorted = false;
  g.insertionOrder.count = 0;
  g.insertionOrder.ReserveEmpty(std::max<std::int64_t>(end - first, 1));
  for (std::int32_t i = first; i < end; ++i) g.insertionOrder.data[g.insertionOrder.count++] = i;
  g.orderRemaining = g.insertionOrder.count;
}

Draw DrawNext() {
  Engine& g = Vd();
  if (g.orderRemaining == 0) return Draw{kNone, 0};
  if (g.orderPresorted) return Draw{g.insertionOrder[g.insertionOrder.count - g.orderRemaining--], 0};
  const std::uint32_t r = g.random();
  const std::int32_t at = static_cast<std::int32_t>(r % static_cast<std::uint32_t>(g.orderRemaining));
  const std::int32_t v = g.insertionOrder[at];
  g.insertionOrder[at] = g.insertionOrder[--g.orderRemaining];
  // The entry a draw this far ahead takes lies in a large array at a
  // random place: request it now (a swap before then may change what it
  // holds, not where it is).
  if (g.orderRemaining > kDrawPrefetch) {
    const std::uint32_t later = g.random.Peek(kDrawPrefetch - 1);
    g.insertionOrder.Prefetch(
        static_cast<std::int32_t>(later % static_cast<std::uint32_t>(g.orderRemaining - (kDrawPrefetch - 1))));
  }
  return Draw{v, r};
}

}  // namespace zt::vd
