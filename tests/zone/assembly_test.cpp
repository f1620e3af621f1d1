// The final assembly over levels with a stand-in engine (grown and shrunk
// boxes) and the real Boolean engine: the deepest level with zones, the
// carry-up to levels without zones, the result ranges, the scratch file
// failures, and write_zones' runs and order.
#include "zone/assembly.hpp"

#include <gtest/gtest.h>

#include <filesystem>
#include <map>

#include "zone/parameter_files.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

struct Written {
  float z;
  std::int32_t unit;
  std::vector<Point2f> points;
};
std::vector<Written> g_written;
bool g_refuse = false;

void record_contour(const std::int32_t& n, const Point2f* p, const float& z,
                    const std::int32_t& unit, std::int32_t& ierr) {
  g_written.push_back({z, unit, std::vector<Point2f>(p, p + n)});
  ierr = g_refuse ? -1 : 0;
}

struct Box {
  float x0, y0, x1, y1;
};
Box box_of(const std::vector<Point2f>& pts) {
  Box b{1e9f, 1e9f, -1e9f, -1e9f};
  for (const Point2f& p : pts) {
    if (p.x >= 99990.0f) continue;
    b = {std::min(b.x0, p.x), std::min(b.y0, p.y), std::max(b.x1, p.x), std::max(b.y1, p.y)};
  }
  return b;
}
std::int32_t contours_in(const std::vector<Point2f>& pts) {
  std::int32_t n = 0;
  for (size_t i = 0; i < pts.size(); ++i) {
    if (pts[i].x < 99990.0f && (i == 0 || pts[i - 1].x >= 99990.0f)) ++n;
  }
  return n;
}

class Assembly : public ZoneTmpTest {
 protected:
  BoxOffsetEngine engine;
  std::vector<Point2f> buffer;

  void SetUp() override {
    ZoneTmpTest::SetUp();
    set_offset_engine(&engine);
    write_file("grid.tmp", "0 0 0 0 0.1 0 2 0\n");  // merge radius 2
    g_written.clear();
    g_refuse = false;
  }
  // Contour levels z (top first) and the zones of some of them in temp1.
  void levels(const std::vector<float>& z, const std::map<int, std::vector<Point2f>>& zones) {
    std::int32_t ierr = -1;
    const std::int32_t n = static_cast<std::int32_t>(z.size());
    wf_init_czone(z.data(), n, ierr);
    ASSERT_EQ(ierr, 0);
    ZoneBuilderState& s = zone_builder();
    for (const auto& [k, pts] : zones) {
      const std::int32_t first = s.pointsWritten + 1;
      ASSERT_EQ(write_points(s.levelFile, pts.data(), static_cast<std::int32_t>(pts.size()),
                             s.pointsWritten),
                0);
      s.levelRanges[k] = {first, s.pointsWritten, z[k]};
    }
  }
  std::vector<Point2f> result(std::int32_t entry) {
    const LevelRange r = zone_builder().resultRanges[entry];
    const std::string b = read_file("temp2");
    std::vector<Point2f> p(static_cast<size_t>(r.last - r.first + 1));
    std::memcpy(p.data(), b.data() + 8 * (r.first - 1), p.size() * 8);
    return p;
  }
  std::int32_t write() {
    const std::string name = path("temp2");
    const ZoneBuilderState& s = zone_builder();
    return write_zones(7, name.c_str(), s.resultCount, s.resultRanges.data(), record_contour);
  }
};

TEST_F(Assembly, NoLevelWithZones) {
  levels({0, 1, 2}, {});
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  EXPECT_EQ(::testing::internal::GetCapturedStdout(),
            "\r 10-20-30-40-50-60-70-80-90-100%\n\n");
  EXPECT_EQ(zone_builder().resultCount, 0);
  EXPECT_FALSE(zone_builder().levelFile.isOpen());
  EXPECT_EQ(read_file("temp2"), "");
  EXPECT_EQ(write(), 0);
  EXPECT_TRUE(g_written.empty());
}

TEST_F(Assembly, OnlyTheDeepestLevelHasZonesAndIsCarriedUp) {
  levels({0, 1, 2}, {{2, stock_points({rectangle(40, 40, 60, 60)})}});
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  ::testing::internal::GetCapturedStdout();
  const ZoneBuilderState& s = zone_builder();
  ASSERT_EQ(s.resultCount, 3);
  EXPECT_EQ(s.resultRanges[0].z, 2.0f);
  EXPECT_EQ(s.resultRanges[2].z, 0.0f);
  EXPECT_EQ(s.resultRanges[3].first, -1);  // spare entries never set
  const auto deepest = result(0);
  EXPECT_EQ(result(1).size(), deepest.size());
  EXPECT_EQ(std::memcmp(result(2).data(), deepest.data(), deepest.size() * 8), 0);
  // Grown by 2.04, shrunk by 2.
  const Box b = box_of(deepest);
  EXPECT_NEAR(b.x0, 39.96f, 1e-4);
  EXPECT_NEAR(b.x1, 60.04f, 1e-4);
  EXPECT_EQ(engine.calls.back(), "terminate");
  EXPECT_FALSE(engineReady);
  // Top level first, every contour closed.
  ASSERT_EQ(write(), 0);
  ASSERT_EQ(g_written.size(), 3u);
  EXPECT_EQ(g_written[0].z, 0.0f);
  EXPECT_EQ(g_written[2].z, 2.0f);
  EXPECT_EQ(g_written[0].unit, 7);
  EXPECT_EQ(g_written[0].points.front().x, g_written[0].points.back().x);
  EXPECT_EQ(g_written[0].points.front().y, g_written[0].points.back().y);
}

TEST_F(Assembly, OnlyTheTopLevelHasZones) {
  levels({0, 1, 2}, {{0, stock_points({rectangle(40, 40, 60, 60)})}});
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  ::testing::internal::GetCapturedStdout();
  EXPECT_EQ(zone_builder().resultCount, 1);
  ASSERT_EQ(write(), 0);
  ASSERT_EQ(g_written.size(), 1u);
  EXPECT_EQ(g_written[0].z, 0.0f);
}

TEST_F(Assembly, ZonesOfLowerLevelsAreUnitedIntoUpperLevels) {
  levels({0, 1, 2, 3}, {{3, stock_points({rectangle(0, 0, 10, 10)})},
                        {1, stock_points({rectangle(20, 0, 30, 10)})}});
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  ::testing::internal::GetCapturedStdout();
  ASSERT_EQ(zone_builder().resultCount, 4);
  EXPECT_EQ(contours_in(result(0)), 1);
  EXPECT_EQ(contours_in(result(1)), 1);  // carried up from level 3
  EXPECT_EQ(contours_in(result(2)), 2);  // level 1: its own and level 3's
  EXPECT_EQ(contours_in(result(3)), 2);  // carried up from level 1
  const Box b = box_of(result(3));
  EXPECT_NEAR(b.x0, -0.04f, 1e-4);
  EXPECT_NEAR(b.x1, 30.04f, 1e-4);
  ASSERT_EQ(write(), 0);
  EXPECT_EQ(g_written.size(), 6u);
}

// Regression: a level whose zones grew into nothing failed the whole run on
// an empty operand of the union instead of keeping what was carried up.
TEST_F(Assembly, ALevelWhoseZonesGrowIntoNothingKeepsTheCarriedUnion) {
  levels({0, 1}, {{1, stock_points({rectangle(0, 0, 10, 10)})},
                  {0, stock_points({{{50, 50}, {50.0005f, 50}, {50, 50}}})}});
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  ::testing::internal::GetCapturedStdout();
  ASSERT_EQ(zone_builder().resultCount, 2);
  const Box b = box_of(result(1));
  EXPECT_NEAR(b.x1, 10.04f, 1e-4);
  EXPECT_EQ(result(1).size(), result(0).size());
}

// Regression: the search for the deepest level looked at the spare entries.
TEST_F(Assembly, SpareRangesAreNotLevels) {
  levels({0}, {{0, stock_points({rectangle(0, 0, 10, 10)})}});
  zone_builder().levelRanges[1] = {1, 6, 5.0f};
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  ::testing::internal::GetCapturedStdout();
  EXPECT_EQ(zone_builder().resultCount, 1);
}

// Regression: reopening temp1 truncated it, so every level read nothing.
TEST_F(Assembly, ReopeningTheLevelFileKeepsItsPoints) {
  const auto zones = stock_points({rectangle(40, 40, 60, 60)});
  levels({0}, {{0, zones}});
  ::testing::internal::CaptureStdout();
  ASSERT_EQ(assemble_zones(buffer), 0);
  ::testing::internal::GetCapturedStdout();
  EXPECT_EQ(read_file("temp1").size(), zones.size() * 8);
  EXPECT_GE(buffer.size(), zones.size());  // the lent buffer grew to the level
}

TEST_F(Assembly, FailuresEndTheAssembly) {
  // A range beyond the end of temp1: a failed read, not a short contour.
  levels({0}, {{0, stock_points({rectangle(0, 0, 10, 10)})}});
  zone_builder().levelRanges[0].last += 3;
  ::testing::internal::CaptureStdout();
  EXPECT_EQ(assemble_zones(buffer), -1);
  ::testing::internal::GetCapturedStdout();
  // No grid.tmp.
  reset_zone_builder();
  std::filesystem::remove(path("grid.tmp"));
  levels({0}, {{0, stock_points({rectangle(0, 0, 10, 10)})}});
  EXPECT_EQ(assemble_zones(buffer), -1);
  // The offset of a level fails.
  reset_zone_builder();
  write_file("grid.tmp", "0 0 0 0 0.1 0 2 0\n");
  levels({0}, {{0, stock_points({rectangle(0, 0, 10, 10)})}});
  engine.offsetsOk = false;
  ::testing::internal::CaptureStdout();
  EXPECT_EQ(assemble_zones(buffer), -1);
  ::testing::internal::GetCapturedStdout();
}

// Regression: a write to temp2 that the disk refused only ended the level's
// range early, and the result file got shortened contours.
TEST_F(Assembly, AFullDiskForTheResultScratchFileFails) {
  if (!std::filesystem::exists("/dev/full")) GTEST_SKIP() << "no /dev/full";
  std::filesystem::create_symlink("/dev/full", path("temp2"));
  levels({0}, {{0, stock_points({rectangle(0, 0, 10, 10)})}});
  ::testing::internal::CaptureStdout();
  EXPECT_EQ(assemble_zones(buffer), -1);
  ::testing::internal::GetCapturedStdout();
}

TEST(SplitRuns, SeparatorThresholds) {
  const std::vector<Point2f> p = {{99999, 99999}, {90000, 0}, {1, 1}, {90000, 2}, {2, 2},
                                  {90000.01f, 0}, {3, 3},     {4, 4}, {95000, 0}};
  const auto runs = split_runs(p.data(), static_cast<std::int32_t>(p.size()));
  ASSERT_EQ(runs.size(), 2u);
  EXPECT_EQ(runs[0], std::make_pair(2, 5));
  EXPECT_EQ(runs[1], std::make_pair(6, 8));
}

class WriteZones : public ZoneTmpTest {
 protected:
  void SetUp() override {
    ZoneTmpTest::SetUp();
    g_written.clear();
    g_refuse = false;
  }
  std::int32_t write(const std::vector<Point2f>& pts, std::vector<LevelRange> ranges) {
    ScratchFile f;
    std::int32_t written = 0;
    EXPECT_EQ(f.create(path("temp2").c_str()), 0);
    EXPECT_EQ(write_points(f, pts.data(), static_cast<std::int32_t>(pts.size()), written), 0);
    EXPECT_EQ(f.close(), 0);
    return write_zones(3, path("temp2").c_str(), static_cast<std::int32_t>(ranges.size()),
                       ranges.data(), record_contour);
  }
};

TEST_F(WriteZones, RunsOfFewerThanFourAreDroppedAndRunsAreClosed) {
  const std::vector<Point2f> p = {{99999, 99999}, {0, 0}, {1, 0}, {1, 1}, {99999, 99999},
                                  {5, 5},         {6, 5}, {6, 6}, {5.5f, 6.5f}, {99999, 99999}};
  ASSERT_EQ(write(p, {{1, 10, 4.0f}, {1, 0, 3.0f}, {-1, -1, 2.0f}}), 0);
  ASSERT_EQ(g_written.size(), 1u);
  EXPECT_EQ(g_written[0].z, 4.0f);
  ASSERT_EQ(g_written[0].points.size(), 4u);
  EXPECT_EQ(g_written[0].points[3].x, 5.0f);  // the last point made the first
  EXPECT_EQ(g_written[0].points[3].y, 5.0f);
}

TEST_F(WriteZones, RefusedContourOrUnreadableRangeFails) {
  const std::vector<Point2f> p = {{0, 0}, {1, 0}, {1, 1}, {0, 0}};
  g_refuse = true;
  EXPECT_EQ(write(p, {{1, 4, 0.0f}}), -1);
  g_refuse = false;
  EXPECT_EQ(write(p, {{1, 5, 0.0f}}), -1);
  EXPECT_EQ(write_zones(3, path("absent").c_str(), 0, nullptr, record_contour), -1);
}

}  // namespace
}  // namespace zt::testing
