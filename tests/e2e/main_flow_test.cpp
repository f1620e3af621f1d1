// restzones run as the suite runs it: the bundled example run again and
// elsewhere, and the guard that removes an interrupted result (interrupted
// writes are in protocol_faults_test.cpp; stops, faults and plain ends are
// rows of data/runs.txt).
#include <gtest/gtest.h>

#include <cstdlib>

#include "driver/detail/result_guard.hpp"
#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

// The bundled example, twice in one directory (the second run finds the
// first one's scratch files and result) and once in a fresh one: the same
// bytes each time.
TEST(MainFlowEnd, ExampleGivesTheSameResultEveryRun) {
  ProgramRun r, fresh;
  copy_example(r);
  copy_example(fresh);
  ASSERT_EQ(r.run(), 0) << r.err;
  ASSERT_FALSE(r.marker_left()) << r.out;
  EXPECT_NE(r.out.find("Calcul des zones de reprise par niveau"), std::string::npos);
  const Bytes result = r.bytes("stock2.bin");
  std::vector<Contour> zones;
  ASSERT_TRUE(read_result(result, zones));
  float previous = 1e30f;
  for (const Contour& c : zones) {
    EXPECT_LE(c.z, previous);  // from the top down
    previous = c.z;
  }
  EXPECT_EQ(zones.front().z, -1.0f);
  EXPECT_EQ(zones.back().z, -20.0f);
  ASSERT_EQ(r.run(), 0) << r.err;
  EXPECT_EQ(r.bytes("stock2.bin"), result);
  ASSERT_EQ(fresh.run(), 0) << fresh.err;
  EXPECT_EQ(fresh.bytes("stock2.bin"), result);
}

// The result guard underneath: a result being written disappears with any
// end of the process (fatal reports exit with statuses 1, 2 and 255), and
// stays once released.
TEST(ResultGuardDeathTest, AnExitWhileWritingRemovesTheResultAReleasedOneStays) {
  for (int status : {1, 2, 255, 0}) {
    const bool released = status == 0;
    test::ScratchDir dir;
    const std::string result = dir.file("stock2.bin");
    test::write_text(result, "K half");
    EXPECT_EXIT(
        {
          detail::guard_result(result);
          if (released) detail::release_result();
          std::exit(status);
        },
        ::testing::ExitedWithCode(status), "");
    EXPECT_EQ(std::filesystem::exists(result), released) << status;
  }
}

}  // namespace
}  // namespace zt::e2e
