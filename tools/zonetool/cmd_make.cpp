// zonetool make: not built yet.
#include "commands.hpp"

int zonetool::cmd_make(int, char**) { return usage_error("make", "not built yet"); }
