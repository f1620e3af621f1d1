// What the record layer does to the open units before the program ends on a
// record fault.
#pragma once

namespace zt::detail {

// Closes and removes every record file still being written on a unit: a
// run that stops on a fault leaves no incomplete result behind.
void abandon_record_outputs();

}  // namespace zt::detail
