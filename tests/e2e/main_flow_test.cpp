// The guard that removes an interrupted result (the bundled example run
// again and elsewhere: thread_count_test.cpp; interrupted writes:
// protocol_faults_test.cpp; stops, faults and plain ends: data/runs.txt).
#include <gtest/gtest.h>

#include <cstdlib>

#include "driver/detail/result_guard.hpp"
#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

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
