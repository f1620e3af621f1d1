// zonetool simplify: not built yet.
#include "commands.hpp"

int zonetool::cmd_simplify(int, char**) { return usage_error("simplify", "not built yet"); }
