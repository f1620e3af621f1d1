// zonetool offset as a subprocess: the collected curves, the raw store, and
// its answers to bad arguments and input.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>

#include "support/subprocess.hpp"

namespace {

using ToolRun = zt::test::CommandRun;

ToolRun Offset(const std::string& text, const std::string& args) {
  // ctest runs the cases as parallel processes: one input file each.
  const std::string file = testing::TempDir() + "zt_offset_" +
                           testing::UnitTest::GetInstance()->current_test_info()->name() + ".txt";
  std::ofstream(file) << text;
  return zt::test::run_command(zt::test::zonetool_path() + " offset " + file + " " + args + " 2>&1");
}

const char* kSquare = "0 0\n1 0\n1 1\n0 1\n0 0\n";

TEST(ZonetoolOffset, SquareInsideIsPrintedAsOneClosedCurve) {
  const ToolRun r = Offset(kSquare, "--distance 0.1 --side 1");
  ASSERT_EQ(r.status, 0) << r.out;
  // Four corners; the start point first, second and last.
  EXPECT_EQ(r.out, "0.9 0.9\n0.9 0.9\n0.9 0.1\n0.1 0.1\n0.1 0.9\n0.9 0.9\n");
}

TEST(ZonetoolOffset, RawStoreListsCurvesAndElements) {
  const ToolRun r = Offset(kSquare, "--side 2 --distance 0.1 --raw");
  ASSERT_EQ(r.status, 0) << r.out;
  std::istringstream in(r.out);
  std::string line;
  std::getline(in, line);
  EXPECT_EQ(line, "curve 0.1");
  int lines = 0, arcs = 0;
  while (std::getline(in, line)) {
    std::istringstream w(line);
    int kind, site;
    double x, y;
    ASSERT_TRUE(w >> kind >> site >> x >> y) << line;
    (kind == 0 ? lines : arcs)++;
  }
  EXPECT_EQ(lines, 4);
  EXPECT_EQ(arcs, 4);
}

TEST(ZonetoolOffset, TwoContoursAreSeparatedByABlankLine) {
  const ToolRun r = Offset("0 0\n1 0\n1 1\n0 1\n0 0\n\n5 0\n6 0\n6 1\n5 1\n5 0\n", "--distance 0.1 --side 1");
  ASSERT_EQ(r.status, 0) << r.out;
  EXPECT_NE(r.out.find("\n\n"), std::string::npos);
  EXPECT_EQ(r.out.find("\n\n"), r.out.rfind("\n\n"));
}

TEST(ZonetoolOffset, BadArgumentsAndInputAreUsageErrors) {
  EXPECT_EQ(Offset(kSquare, "--distance 0.1").status, 2);
  EXPECT_EQ(Offset(kSquare, "--distance -1 --side 1").status, 2);
  EXPECT_EQ(Offset(kSquare, "--distance nan --side 1").status, 2);
  EXPECT_EQ(Offset(kSquare, "--distance 0.1 --side 4").status, 2);
  EXPECT_EQ(Offset("0 0 0\n1 0 0\n", "--distance 0.1 --side 1").status, 2);
  EXPECT_EQ(Offset("0 zero\n", "--distance 0.1 --side 1").status, 2);
  // Nothing to feed: no curve, success.
  const ToolRun empty = Offset("0 0\n", "--distance 0.1 --side 3");
  EXPECT_EQ(empty.status, 0);
  EXPECT_EQ(empty.out, "");
}

}  // namespace
