// zonetool boolean: not built yet.
#include "commands.hpp"

int zonetool::cmd_boolean(int, char**) { return usage_error("boolean", "not built yet"); }
