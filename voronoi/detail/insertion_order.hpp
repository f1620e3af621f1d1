// The random insertion orders of the point and segment phases.
//
// An order holds the indices still to insert; a draw takes the entry at a
// uniformly drawn position (the generator gives 32 bits a draw, so every
// position of any order can be drawn) and moves the last remaining entry
// into its place. The generator is seeded at the start of each new
// computation, so a computation repeated on the same input draws the same
// sequence.
#pragma once

#include <cstdint>

namespace zt::vd {

// The order of the indices first .. end-1.
void BuildOrder(std::int32_t first, std::int32_t end);

struct Draw {
  std::int32_t entry;   // -1 when the order is exhausted
  std::uint32_t value;  // the generator's value behind it
};
Draw DrawNext();

}  // namespace zt::vd
