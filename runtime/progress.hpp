// The console progress bar: 30 asterisks under a fixed percentage scale,
// written to standard output with exact bytes.
//
// (Interface fixed in the project skeleton; implemented in progress.cpp.)
#pragma once

#include <cstdint>

namespace zt {

void progress(const std::int32_t& total, const std::int32_t& current);

}  // namespace zt
