// zonetool voronoi and zonetool offset as subprocesses: the cases of
// data/zonetool.txt (exit status, exact or partial output: curves, the raw
// offset store, messages) and the figures of a printed diagram.
#include <gtest/gtest.h>

#include <sstream>
#include <string>

#include "support/case_rows.hpp"
#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"

namespace zt::test {
namespace {

using ToolRun = test::CommandRun;

// Runs `zonetool <subcommand> <input file> <args>` on an input file of its own.
ToolRun Zonetool(const std::string& subcommand, const std::string& text, const std::string& args = "") {
  test::ScratchDir dir;
  test::write_text(dir.file("in.txt"), text);
  return test::run_command(test::zonetool_path() + " " + subcommand + " " + dir.file("in.txt") + " " + args + " 2>&1");
}

class ZonetoolCases : public CaseRows {};

TEST_P(ZonetoolCases, AnswerWithTheirStatusAndOutput) {
  const std::string command = row().field(0), want = row().field(3);
  const std::string subcommand = command.substr(0, command.find(' '));
  const ToolRun r = Zonetool(subcommand, Unescape(row().field(1)), command.substr(subcommand.size()));
  EXPECT_EQ(r.status, std::stoi(row().field(2))) << r.out;
  const std::string text = want.empty() ? "" : Unescape(Trim(want.substr(1)));
  EXPECT_TRUE(want.empty() || want[0] != '=' || r.out == text) << r.out;
  EXPECT_TRUE(want.empty() || want[0] != '~' || r.out.find(text) != std::string::npos) << r.out;
}

INSTANTIATE_TEST_SUITE_P(Data, ZonetoolCases, RowsOf("zonetool.txt"), RowName);

TEST(ZonetoolVoronoi, PrintsNodesEdgesAndFigures) {
  const ToolRun r = Zonetool("voronoi", "# a triangle\np 0 0\np 4 0\n\np 0 3\n");
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
