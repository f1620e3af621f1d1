// Splitting of the bisectors between two points at their clearance minimum,
// so that the clearance is monotone along every such edge. Needs plain
// (not squared) node radii.
#pragma once

namespace zt::vd {

// Once per diagram (the bisectors-split flag).
void SplitPointBisectors();

}  // namespace zt::vd
