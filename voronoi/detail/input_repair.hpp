// Input repair: when a geometric step fails, look for the defect of the
// input behind it near the failing site, mend the input and request a
// restart of the computation.
//
// This file holds the tests that the diagram of points needs (point-point);
// the segment tests extend it.
#pragma once

#include <cstdint>

namespace zt::vd {

// Points this close (internal units) are merged into their midpoint.
inline constexpr double kRepairPointDistance = 1e-6;

// True when the input was changed (a restart is then pending).
bool RepairInput(std::int32_t site, std::int32_t kind, bool checkAllAllowed);

// Tests the suspect pair a failing computation recorded, if any, and
// clears it. True when the input was changed.
bool RepairSuspectPair();

// Appends a point made by a repair (tag -1) and returns its index. The
// corner points stay in the last two slots.
std::int32_t AppendRepairPoint(double x, double y);

// Moves points a and b to their common midpoint.
void MergePointsToMidpoint(std::int32_t a, std::int32_t b);

}  // namespace zt::vd
