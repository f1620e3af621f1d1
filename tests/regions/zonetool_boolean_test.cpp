// zonetool boolean as a program: exact output bytes for the two squares,
// the failure message and exit status, usage errors.
#include <gtest/gtest.h>

#include <unistd.h>

#include <fstream>
#include <string>

#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"

namespace {

const std::string kTool = zt::test::zonetool_path();
const std::string kData = ZT_TEST_DATA_DIR;

struct ToolRun {
  int status;
  std::string out, err;
};

ToolRun run(const std::string& args) {
  // One file per test process: ctest runs the tests side by side.
  const std::string err = ::testing::TempDir() + "zonetool_boolean_err." + std::to_string(getpid());
  const zt::test::CommandRun r = zt::test::run_command(kTool + " boolean " + args + " 2>" + err);
  return {r.status, r.out, zt::test::read_text(err)};
}

class ZonetoolBoolean : public ::testing::Test {
 protected:
  void SetUp() override {
    if (!std::ifstream(kTool)) GTEST_SKIP() << "zonetool not built";
  }
};

TEST_F(ZonetoolBoolean, TwoSquaresByteForByte) {
  for (const char* op : {"u", "i", "d"}) {
    const ToolRun r = run(kData + "/square_a.txt " + kData + "/square_b.txt " + op);
    EXPECT_EQ(r.status, 0) << op;
    EXPECT_EQ(r.out, zt::test::read_text(kData + "/squares_" + op + ".expected")) << op;
    EXPECT_EQ(r.err, "");
  }
}

TEST_F(ZonetoolBoolean, FailedOperationIsReportedWithStatusOne) {
  const ToolRun r = run(kData + "/single_point.txt " + kData + "/square_b.txt u");
  EXPECT_EQ(r.status, 1);
  EXPECT_EQ(r.out, "");
  EXPECT_EQ(r.err, "boolean operation failed\n");
}

TEST_F(ZonetoolBoolean, UsageErrors) {
  EXPECT_EQ(run(kData + "/square_a.txt " + kData + "/square_b.txt x").status, 2);
  EXPECT_EQ(run(kData + "/square_a.txt u").status, 2);
  EXPECT_EQ(run(kData + "/missing.txt " + kData + "/square_b.txt u").status, 2);
}

}  // namespace
