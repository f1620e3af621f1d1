// The progress bar by value and its line finish (the bar itself:
// data/progress.cases).
#include "runtime/progress.hpp"

#include <gtest/gtest.h>

#include <string>

namespace zt {
namespace {

TEST(ProgressTest, ByValueFormAndLineFinish) {
  progress_value(3, 0);
  ::testing::internal::CaptureStdout();
  EXPECT_GT(progress_value(3, 1), -1);
  EXPECT_EQ(progress_finish(), 1);
  EXPECT_EQ(::testing::internal::GetCapturedStdout(), "\r " + std::string(10, '*') + "\r\n");
}

}  // namespace
}  // namespace zt
