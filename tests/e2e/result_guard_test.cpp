// The result guard: a result being written disappears with any end of the
// process (fatal reports exit with statuses 1, 2 and 255), and stays once
// released.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>

#include "driver/detail/result_guard.hpp"
#include "driver/test_files.hpp"

namespace zt::e2e {
namespace {

TEST(ResultGuardDeathTest, AnExitWhileWritingRemovesTheResult) {
  for (int status : {1, 2, 255}) {
    test::ScratchDir dir;
    const std::string result = dir.file("stock2.bin");
    test::write_text(result, "K half");
    EXPECT_EXIT(
        {
          detail::guard_result(result);
          std::exit(status);
        },
        ::testing::ExitedWithCode(status), "");
    EXPECT_FALSE(std::filesystem::exists(result)) << status;
  }
}

TEST(ResultGuardDeathTest, AReleasedResultStays) {
  test::ScratchDir dir;
  const std::string result = dir.file("stock2.bin");
  test::write_text(result, "K whole");
  EXPECT_EXIT(
      {
        detail::guard_result(result);
        detail::release_result();
        std::exit(0);
      },
      ::testing::ExitedWithCode(0), "");
  EXPECT_TRUE(std::filesystem::exists(result));
}

}  // namespace
}  // namespace zt::e2e
