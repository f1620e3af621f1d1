// zonetool svg: not built yet.
#include "commands.hpp"

int zonetool::cmd_svg(int, char**) { return usage_error("svg", "not built yet"); }
