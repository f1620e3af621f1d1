// Scratch files: byte layout, round trips, positions past 4 GB, and every
// failure reported (reads past the end, a full disk, a failed close).
#include "zone/scratch_file.hpp"

#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>

#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

class ScratchFiles : public ZoneTmpTest {};

TEST_F(ScratchFiles, LayoutRoundTripAndReopenKeepsTheContents) {
  ScratchFile f;
  ASSERT_EQ(f.create(path("t").c_str()), 0);
  const Point2f pts[2] = {{1.0f, -2.0f}, {99999.0f, 99999.0f}};
  std::int32_t written = 0;
  ASSERT_EQ(write_points(f, pts, 2, written), 0);
  EXPECT_EQ(written, 2);
  ASSERT_EQ(f.close(), 0);
  const std::string bytes = read_file("t");
  ASSERT_EQ(bytes.size(), 16u);
  EXPECT_EQ(bytes.substr(0, 8), std::string("\x00\x00\x80\x3f\x00\x00\x00\xc0", 8));
  ASSERT_EQ(f.reopen(path("t").c_str()), 0);
  Point2f back[2];
  ASSERT_EQ(read_points(f, back, 1, 1), 0);
  EXPECT_EQ(back[0].x, 99999.0f);
  // Appends go after point `written`, wherever reads left the position.
  ASSERT_EQ(read_points(f, back, 1, 0), 0);
  ASSERT_EQ(write_points(f, pts, 1, written), 0);
  ASSERT_EQ(f.close(), 0);
  EXPECT_EQ(read_file("t").size(), 24u);
  EXPECT_EQ(f.reopen(path("absent").c_str()), -1);
}

TEST_F(ScratchFiles, ReadsPastTheEndAndBadCallsFail) {
  ScratchFile f;
  Point2f p[4];
  EXPECT_EQ(read_points(f, p, 1, 0), -1);  // not open
  EXPECT_EQ(read_points(f, p, 0, 0), 0);   // nothing asked
  ASSERT_EQ(f.create(path("t").c_str()), 0);
  std::int32_t written = 0;
  ASSERT_EQ(write_points(f, p, 3, written), 0);
  EXPECT_EQ(read_points(f, p, 4, 0), -1);
  EXPECT_EQ(read_points(f, p, 1, 3), -1);
  EXPECT_EQ(read_points(f, p, 1, -1), -1);
}

// Regression: positions were formed in 32 bits, so a point beyond 4 GB was
// read from the wrong place.
TEST_F(ScratchFiles, PositionsBeyondFourGigabytes) {
  ScratchFile f;
  ASSERT_EQ(f.create(path("big").c_str()), 0);
  const std::int64_t start = (std::int64_t{1} << 32) / kScratchPointBytes + 3;
  ASSERT_EQ(::ftruncate(::fileno(f.stream()), start * kScratchPointBytes), 0);
  std::int32_t written = static_cast<std::int32_t>(start);
  const Point2f p{7.0f, 8.0f};
  ASSERT_EQ(write_points(f, &p, 1, written), 0);
  Point2f back{};
  ASSERT_EQ(read_points(f, &back, 1, start), 0);
  EXPECT_EQ(back.y, 8.0f);
  EXPECT_EQ(std::filesystem::file_size(path("big")), static_cast<std::uintmax_t>(start + 1) * 8);
}

// Regression: a write the disk refused went unnoticed.
TEST_F(ScratchFiles, AFullDiskIsAFailure) {
  if (!std::filesystem::exists("/dev/full")) GTEST_SKIP() << "no /dev/full";
  ScratchFile f;
  ASSERT_EQ(f.create("/dev/full"), 0);
  const Point2f p[3] = {};
  std::int32_t written = 0;
  EXPECT_EQ(write_points(f, p, 3, written), -1);
  ASSERT_EQ(f.create("/dev/full"), 0);
  std::fwrite("x", 1, 1, f.stream());
  EXPECT_EQ(f.close(), -1);
  EXPECT_FALSE(f.isOpen());
}

}  // namespace
}  // namespace zt::testing
