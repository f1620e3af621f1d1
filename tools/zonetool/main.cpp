// zonetool: a companion program that shows what each stage of the system
// does, on text or record files. See README.md for every subcommand and its
// text formats, which are kept stable.
#include <cstdio>
#include <cstring>

#include "commands.hpp"

namespace {

struct Command {
  const char* name;
  int (*run)(int, char**);
  const char* synopsis;
};

const Command kCommands[] = {
    {"dump", zonetool::cmd_dump, "dump [--points] FILE     record file (or scratch point file) as text"},
    {"make", zonetool::cmd_make, "make OUT                 text on standard input to a record file"},
    {"simplify", zonetool::cmd_simplify, "simplify --tolerance T   simplify polylines read on standard input"},
    {"boolean", zonetool::cmd_boolean, "boolean A B u|i|d        union, intersection or difference of two regions"},
    {"voronoi", zonetool::cmd_voronoi, "voronoi FILE             Voronoi diagram of points and segments"},
    {"offset", zonetool::cmd_offset, "offset FILE --distance T --side 1|2|3 [--raw]   offset curves of contours"},
    {"svg", zonetool::cmd_svg, "svg IN... -o OUT.svg [--level Z]   draw record and text files"},
    {"dxf", zonetool::cmd_dxf, "dxf IN... -o OUT.dxf     record and text files as a DXF drawing"},
};

int usage() {
  std::fputs("usage: zonetool COMMAND [ARGS]\n", stderr);
  for (const Command& c : kCommands) std::fprintf(stderr, "  zonetool %s\n", c.synopsis);
  return 2;
}

}  // namespace

int zonetool::usage_error(const char* name, const char* message) {
  std::fprintf(stderr, "zonetool %s: %s\n", name, message);
  return 2;
}

int main(int argc, char** argv) {
  if (argc < 2) return usage();
  for (const Command& c : kCommands) {
    if (std::strcmp(argv[1], c.name) == 0) return c.run(argc - 2, argv + 2);
  }
  return usage();
}
