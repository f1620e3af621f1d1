// The subcommands of zonetool. Each lives in its own cmd_<name>.cpp and
// receives the arguments after its name; it returns the process status.
#pragma once

namespace zonetool {

int cmd_dump(int argc, char** argv);
int cmd_make(int argc, char** argv);
int cmd_simplify(int argc, char** argv);
int cmd_boolean(int argc, char** argv);
int cmd_voronoi(int argc, char** argv);
int cmd_offset(int argc, char** argv);
int cmd_svg(int argc, char** argv);
int cmd_dxf(int argc, char** argv);

// Prints "zonetool NAME: MESSAGE" on standard error; returns 2 (usage error).
int usage_error(const char* name, const char* message);

}  // namespace zonetool
