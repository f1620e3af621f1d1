// zonetool dump: not built yet.
#include "commands.hpp"

int zonetool::cmd_dump(int, char**) { return usage_error("dump", "not built yet"); }
