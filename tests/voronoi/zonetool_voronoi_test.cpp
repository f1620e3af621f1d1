// zonetool voronoi as a subprocess: its text layout and its answers to bad
// input.
#include <gtest/gtest.h>

#include <unistd.h>

#include <fstream>
#include <sstream>
#include <string>

#include "support/subprocess.hpp"

namespace {

using ToolRun = zt::test::CommandRun;

ToolRun Zonetool(const std::string& text) {
  // One file per test and process: ctest runs the cases side by side.
  const std::string file = testing::TempDir() + "zt_voronoi_" +
                           testing::UnitTest::GetInstance()->current_test_info()->name() + "_" +
                           std::to_string(getpid()) + ".txt";
  std::ofstream(file) << text;
  return zt::test::run_command(zt::test::zonetool_path() + " voronoi " + file + " 2>&1");
}

TEST(ZonetoolVoronoi, PrintsNodesEdgesAndFigures) {
  const ToolRun r = Zonetool("# a triangle\np 0 0\np 4 0\n\np 0 3\n");
  ASSERT_EQ(r.status, 0) << r.out;
  std::istringstream in(r.out);
  std::string line;
  int nodes = 0, edges = 0;
  bool circumcentre = false;
  std::string last;
  while (std::getline(in, line)) {
    last = line;
    if (line.rfind("node ", 0) == 0) ++nodes;
    if (line.rfind("edge ", 0) == 0) ++edges;
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

TEST(ZonetoolVoronoi, RestartsAreReported) {
  const ToolRun r = Zonetool("p 0 0\np 1 1\np 0.5 0.5\np 0.5000000000001 0.5\n");
  ASSERT_EQ(r.status, 0) << r.out;
  EXPECT_NE(r.out.find("restarts 1 recovery 0\n"), std::string::npos) << r.out;
}

TEST(ZonetoolVoronoi, BadInputGetsAMessage) {
  struct Case {
    const char* text;
    int status;
    const char* message;
  };
  const Case cases[] = {
      {"p 0 0\np 1 nan\n", 2, ":2: expected \"p x y\""},
      {"p 0 0\np 1\n", 2, ":2: expected \"p x y\""},
      {"p 0 0\np 1 1\ns 0 2\n", 2, ":3: a segment end names no point"},
      {"p 0 0\nq 1 1\n", 2, ":2: a line starts with"},
      {"# nothing\n", 2, "no point in"},
      {"p 0 0\np 2e15 1\n", 1, "could not be computed"},
  };
  for (const Case& c : cases) {
    const ToolRun r = Zonetool(c.text);
    EXPECT_EQ(r.status, c.status) << c.text << r.out;
    EXPECT_NE(r.out.find(c.message), std::string::npos) << c.text << r.out;
  }
}

}  // namespace
