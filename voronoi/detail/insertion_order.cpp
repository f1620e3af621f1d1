// The random insertion orders (see insertion_order.hpp).
#include "voronoi/detail/insertion_order.hpp"

#include <algorithm>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

namespace {
// How many draws ahead the entries are requested.
constexpr int kDrawPrefetch = 12;
static_assert(kDrawPrefetch <= OrderRandom::kMaxPeek);
}  // namespace

void BuildOrder(std::int32_t first, std::int32_t end) {
  Engine& g = Vd();
  g.insertionOrder.count = 0;
  g.insertionOrder.Reserve(std::max<std::int64_t>(end - first, 1));
  for (std::int32_t i = first; i < end; ++i) g.insertionOrder.data[g.insertionOrder.count++] = i;
  g.orderRemaining = g.insertionOrder.count;
}

Draw DrawNext() {
  Engine& g = Vd();
  if (g.orderRemaining == 0) return Draw{kNone, 0};
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
