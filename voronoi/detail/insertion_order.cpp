// The random insertion orders (see insertion_order.hpp).
#include "voronoi/detail/insertion_order.hpp"

#include <algorithm>

#include "voronoi/detail/engine_state.hpp"

namespace zt::vd {

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
  return Draw{v, r};
}

}  // namespace zt::vd
