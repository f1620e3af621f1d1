// The insertion orders of the point and segment phases.
//
// An order holds the indices still to insert; a draw (in a random order)
// takes the entry at a uniformly drawn position (the generator gives 32 bits a draw, so every
// position of any order can be drawn) and moves the last remaining entry
// into its place. The generator is seeded at the start of each new
// computation, so a computation repeated on the same input draws the same
// sequence.
#pragma once

#include <cstdint>

namespace zt::vd {

// The order of the indices first .. end-1.
void BuildOrder(std::int32_t first, std::int32_t end);

// The point phase's order of the point indices first .. end-1: a partly
// sorted random order. The indices are shuffled with the generator, then
// cut into rounds that double in size (the last holds half of them), and
// each round but the first is sorted along a Hilbert curve over the points'
// box. A round is as random as the whole order, so the diagram grows as in
// a random order; within a round, consecutive points lie close together, so
// their searches and insertions find the records they need in cache. Draws
// then take the entries front to back; their value is 0 and nothing may be
// given back to the generator for them. Fewer than two first rounds of
// points are drawn as a random order.
void BuildPointOrder(std::int32_t first, std::int32_t end);

struct Draw {
  std::int32_t entry;   // -1 when the order is exhausted
  std::uint32_t value;  // the generator's value behind it
};
Draw DrawNext();

}  // namespace zt::vd
