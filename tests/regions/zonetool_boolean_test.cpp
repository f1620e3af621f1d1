// zonetool boolean as a program: exact output bytes for the two squares,
// the failure message and exit status, usage errors.
#include <gtest/gtest.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>

namespace {

const std::string kTool = std::string(ZT_BINARY_DIR) + "/tools/zonetool/zonetool";
const std::string kData = ZT_TEST_DATA_DIR;

struct ToolRun {
  int status;
  std::string out, err;
};

std::string slurp(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream s;
  s << in.rdbuf();
  return s.str();
}

ToolRun run(const std::string& args) {
  // One file per test process: ctest runs the tests side by side.
  const std::string err = ::testing::TempDir() + "zonetool_boolean_err." + std::to_string(getpid());
  FILE* p = popen((kTool + " boolean " + args + " 2>" + err).c_str(), "r");
  ToolRun r{-1, "", ""};
  if (!p) return r;
  char buf[4096];
  std::size_t n;
  while ((n = fread(buf, 1, sizeof buf, p)) > 0) r.out.append(buf, n);
  const int st = pclose(p);
  r.status = WIFEXITED(st) ? WEXITSTATUS(st) : -1;
  r.err = slurp(err);
  return r;
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
    EXPECT_EQ(r.out, slurp(kData + "/squares_" + op + ".expected")) << op;
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
