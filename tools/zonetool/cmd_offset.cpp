// zonetool offset: not built yet.
#include "commands.hpp"

int zonetool::cmd_offset(int, char**) { return usage_error("offset", "not built yet"); }
