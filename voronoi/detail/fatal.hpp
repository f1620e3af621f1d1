// Fatal errors of the Voronoi engine.
//
// Every fatal error sets the engine's error flag, prints "\nerror in %s\n"
// with its message on standard output and on standard error (flushing each)
// and ends the process with status 2. There is no error return.
#pragma once

namespace zt::vd {

inline constexpr int kFatalExitStatus = 2;

[[noreturn]] void VdFatal(const char* message);

}  // namespace zt::vd
