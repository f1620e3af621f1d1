// The result file of a run while it is being written.
//
// Between guard_result and release_result, any end of the process (a fatal
// report of the engines or of the arrays, a runtime fatal text, a record
// fault) removes the file, so the calling suite never finds a result that
// was not completely written. A normal return from the program after
// release_result keeps it.
#pragma once

#include <string>

namespace zt::detail {

void guard_result(const std::string& path);
void release_result();

}  // namespace zt::detail
