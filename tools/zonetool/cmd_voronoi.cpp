// zonetool voronoi: not built yet.
#include "commands.hpp"

int zonetool::cmd_voronoi(int, char**) { return usage_error("voronoi", "not built yet"); }
