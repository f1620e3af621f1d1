// The random insertion orders (see insertion_order.hpp).
#include "voronoi/detail/insertion_order.hpp"

#include <algorithm>
#include <cmath>
#include <utility>
#include <vector>

#include "core/points.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {
// How many draws ahead the entries are requested.
constexpr int kDrawPrefetch = 12;
// The first round of a point order: left in random order.
constexpr std::int32_t kFirstRound = 128;
static_assert(kDrawPrefetch <= OrderRandom::kMaxPeek);
// Position of (x, y) on the Hilbert curve through a 2^32 x 2^32 grid.
std::uint64_t HilbertKey(std::uint32_t x, std::uint32_t y) {
  std::uint64_t d = 0;
  for (std::uint32_t s = 1u << 31; s > 0; s >>= 1) {
    const std::uint32_t rx = (x & s) ? 1 : 0, ry = (y & s) ? 1 : 0;
    d += static_cast<std::uint64_t>(s) * s * ((3 * rx) ^ ry);
    if (ry == 0) {  // rotate the quadrant
      if (rx == 1) {
        x = ~x;
        y = ~y;
      }
      std::swap(x, y);
    }
  }
  return d;
}

}  // namespace

namespace {

// Shuffles the order built by BuildOrder and sorts its rounds along the
// Hilbert curve through the box of the sites' positions (at(i) gives the
// position of entry i); the draws then take it front to back. The keys are
// taken in index order, before the shuffle moves them with their entries:
// the records are read one after the other, not scattered.
template <class At>
void PresortRounds(At&& at) {
  Engine& g = Vd();
  std::int32_t* order = g.insertionOrder.data;
  const std::int32_t n = g.insertionOrder.count;
  g.orderPresorted = true;
  std::vector<Point2d> pos(static_cast<std::size_t>(n));
  for (std::int32_t i = 0; i < n; ++i) pos[i] = at(order[i]);
  double minX = pos[0].x, maxX = minX, minY = pos[0].y, maxY = minY;
  for (std::int32_t i = 1; i < n; ++i) {
    minX = std::fmin(minX, pos[i].x), maxX = std::fmax(maxX, pos[i].x);
    minY = std::fmin(minY, pos[i].y), maxY = std::fmax(maxY, pos[i].y);
  }
  const double span = std::fmax(maxX - minX, maxY - minY);
  const double toGrid = span > 0 ? 4294967295.0 / span : 0.0;
  std::vector<std::pair<std::uint64_t, std::int32_t>> keyed(static_cast<std::size_t>(n));
  for (std::int32_t i = 0; i < n; ++i) {
    const auto gx = static_cast<std::uint32_t>(std::fmin((pos[i].x - minX) * toGrid, 4294967295.0));
    const auto gy = static_cast<std::uint32_t>(std::fmin((pos[i].y - minY) * toGrid, 4294967295.0));
    keyed[i] = {HilbertKey(gx, gy), order[i]};
  }
  for (std::int32_t i = n - 1; i > 0; --i) {
    const std::int32_t j = static_cast<std::int32_t>(g.random() % static_cast<std::uint32_t>(i + 1));
    std::swap(keyed[i], keyed[j]);
  }
  // Rounds [n/2, n), [n/4, n/2), ... down to the first, left random.
  for (std::int32_t hi = n; hi >= 2 * kFirstRound; hi /= 2) {
    std::sort(keyed.begin() + hi / 2, keyed.begin() + hi);
  }
  for (std::int32_t i = 0; i < n; ++i) order[i] = keyed[i].second;
}

}  // namespace

void BuildPointOrder(std::int32_t first, std::int32_t end) {
  Engine& g = Vd();
  BuildOrder(first, end);
  // A set as small as the first round is drawn at random, one draw at a time.
  if (!g.presortPointOrder || g.insertionOrder.count < 2 * kFirstRound) return;
  PresortRounds([&](std::int32_t i) { return Point2d{g.points[i].x, g.points[i].y}; });
}

void BuildSegmentOrder(std::int32_t first, std::int32_t end) {
  Engine& g = Vd();
  BuildOrder(first, end);
  if (!g.presortPointOrder || g.insertionOrder.count < 2 * kFirstRound) return;
  PresortRounds([&](std::int32_t s) {
    const PointRecord& a = g.points[g.segments[s].i1];
    const PointRecord& b = g.points[g.segments[s].i2];
    return Point2d{0.5 * (a.x + b.x), 0.5 * (a.y + b.y)};
  });
}

void BuildOrder(std::int32_t first, std::int32_t end) {
  Engine& g = Vd();
  g.orderPresorted = false;
  g.insertionOrder.count = 0;
  g.insertionOrder.Reserve(std::max<std::int64_t>(end - first, 1));
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
