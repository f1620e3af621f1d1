// The input repair of a whole input at once. A restart follows every
// repair; before it, every defect of the kinds the local repair mends is
// mended in one pass (points closer than kRepairPointDistance, a point on a
// segment, repeated or crossing segments), by the same rules, so that
// ordinary dirt costs a handful of restarts instead of one each.
//
// Promises: the rules are those of the local repair (merges to midpoints,
// splits at points, crossings appended as points with tag -1, the repeated
// segment of higher index removed); candidates are found through a uniform
// grid, so a pass costs about linear time in the sites and the defects.
// Works in internal coordinates, on the caller points and the segments.
#pragma once

namespace zt::vd {

// True when the input was changed.
bool RepairWholeInput();

}  // namespace zt::vd
