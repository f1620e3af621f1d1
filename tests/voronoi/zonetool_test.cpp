// zonetool voronoi as a subprocess: the figures of a printed diagram (its
// statuses, messages and the offset subcommand are rows of the end-to-end
// data/zonetool.txt).
#include <gtest/gtest.h>

#include <sstream>
#include <string>

#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"

namespace zt::test {
namespace {

TEST(ZonetoolVoronoi, PrintsNodesEdgesAndFigures) {
  const ScratchDir dir;
  write_text(dir.file("in.txt"), "# a triangle\np 0 0\np 4 0\n\np 0 3\n");
  const CommandRun r = run_command(zonetool_path() + " voronoi " + dir.file("in.txt") + " 2>&1");
  ASSERT_EQ(r.status, 0) << r.out;
  std::istringstream in(r.out);
  int nodes = 0, edges = 0;
  bool circumcentre = false;
  std::string line, last;
  while (std::getline(in, line)) {
    last = line;
    nodes += line.rfind("node ", 0) == 0;
    edges += line.rfind("edge ", 0) == 0;
    // The circumcentre of the right triangle: the hypotenuse's midpoint.
    circumcentre |= line.find(" 2 1.5 2.5") != std::string::npos;
  }
  EXPECT_TRUE(circumcentre) << r.out;
  EXPECT_EQ(last, "restarts 0 recovery 0");
  // Euler with 7 sites (three points, four corners) and the outer face.
  EXPECT_EQ(nodes - edges + 8, 2);
  // An edge between points 0 and 1, in one direction or the other.
  EXPECT_TRUE(r.out.find(" 0 2 1 2\n") != std::string::npos || r.out.find(" 1 2 0 2\n") != std::string::npos)
      << r.out;
}

}  // namespace
}  // namespace zt::test
