// Opening a text file of the suite (a message file, a parameter file) for
// reading. Only a regular file is opened: a FIFO would wait for a writer and
// a device might never end, so any other kind of file is refused at once,
// without blocking, as if it could not be opened.
#pragma once

#include <cstdio>

namespace zt {

// The open stream, or null when the name cannot be opened or is not a
// regular file.
std::FILE* open_regular_for_reading(const char* path);

}  // namespace zt
