// The progress bar's exact bytes on standard output.
#include "runtime/progress.hpp"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace zt {
namespace {

const std::string kScale = "\r 10-20-30-40-50-60-70-80-90-100%\n\n";

std::string stars(int n) { return std::string(static_cast<std::size_t>(n), '*'); }

std::string captured(std::int32_t total, std::int32_t current) {
  ::testing::internal::CaptureStdout();
  progress(total, current);
  return ::testing::internal::GetCapturedStdout();
}

TEST(ProgressTest, ScaleThenGrowingBar) {
  EXPECT_EQ(captured(5, 0), kScale);
  EXPECT_EQ(captured(5, 1), "\r " + stars(6) + "\r");
  EXPECT_EQ(captured(5, 1), "");  // not grown: nothing
  EXPECT_EQ(captured(5, 3), "\r " + stars(18) + "\r");
  EXPECT_EQ(captured(5, 5), "\r " + stars(30) + "\r\n\n");
  EXPECT_EQ(captured(5, 5), "");  // a full bar stays quiet until a new start
  EXPECT_EQ(captured(5, 4), "");
  EXPECT_EQ(captured(5, 0), kScale);
}

TEST(ProgressTest, TotalsBelowOneAndValuesBeyondTotal) {
  captured(1, 0);
  EXPECT_EQ(captured(0, 1), "\r " + stars(30) + "\r\n\n");
  captured(-4, 0);
  EXPECT_EQ(captured(10, 20), "\r " + stars(30) + "\r\n\n");  // capped, not 60
  captured(10, 0);
  EXPECT_EQ(captured(10, -5), "\r " + stars(15) + "\r");        // |k|
}

TEST(ProgressTest, ShrinkingValueIsRedrawnWhenItGrowsAgain) {
  captured(10, 0);
  EXPECT_EQ(captured(10, 5), "\r " + stars(15) + "\r");
  EXPECT_EQ(captured(10, 5), "");
  EXPECT_EQ(captured(10, 2), "");
  EXPECT_EQ(captured(10, 3), "\r " + stars(9) + "\r");
}

TEST(ProgressTest, ProductWrapsLike32BitInteger) {
  captured(1000, 0);
  // INT_MAX * 30 wraps to -30; -30 / 1000 = 0.
  EXPECT_EQ(captured(1000, INT_MAX), "");
  // INT_MIN * 30 wraps to 0 as well; no overflow of |k|.
  EXPECT_EQ(captured(1, INT_MIN), "");
  // 0x04444445 * 30 wraps to INT_MIN + 22: k = -2147483626, made positive and capped.
  EXPECT_EQ(captured(1, 0x04444445), "\r " + stars(30) + "\r\n\n");
}

TEST(ProgressTest, ByValueFormAndLineFinish) {
  progress_value(3, 0);
  ::testing::internal::CaptureStdout();
  EXPECT_GT(progress_value(3, 1), -1);
  EXPECT_EQ(progress_finish(), 1);
  EXPECT_EQ(::testing::internal::GetCapturedStdout(), "\r " + stars(10) + "\r\n");
}

}  // namespace
}  // namespace zt
