// The final assembly with a stand-in engine (grown and shrunk boxes) and the
// real Boolean engine: the deepest level with zones, the carry-up, the union
// over levels, the scratch file failures, and write_zones' runs and order.
#include "zone/assembly.hpp"

#include <gtest/gtest.h>

#include <filesystem>

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
  // Contour levels (top first) and, in temp1, the zones of some of them.
  void levels(const std::vector<float>& z, const std::map<int, std::vector<Point2f>>& zones) {
    std::int32_t ierr = -1;
    wf_init_czone(z.data(), static_cast<std::int32_t>(z.size()), ierr);
    ASSERT_EQ(ierr, 0);
    ZoneBuilderState& s = zone_builder();
    for (const auto& [k, pts] : zones) {
      const std::int32_t first = s.pointsWritten + 1;
      const std::int32_t n = static_cast<std::int32_t>(pts.size());
      ASSERT_EQ(write_points(s.levelFile, pts.data(), n, s.pointsWritten), 0);
      s.levelRanges[k] = {first, s.pointsWritten, z[k]};
    }
  }
  std::int32_t assemble() {
    ::testing::internal::CaptureStdout();
    const std::int32_t r = assemble_zones(buffer);
    progress_ = ::testing::internal::GetCapturedStdout();
    return r;
  }
  std::vector<Point2f> result(std::int32_t entry) {
    const LevelRange r = zone_builder().resultRanges[entry];
    const std::string b = read_file("temp2");
    std::vector<Point2f> p(static_cast<size_t>(r.last - r.first + 1));
    std::memcpy(p.data(), b.data() + 8 * (r.first - 1), p.size() * 8);
    return p;
  }
  std::int32_t write() {
    const ZoneBuilderState& s = zone_builder();
    return write_zones(7, path("temp2").c_str(), s.resultCount, s.resultRanges.data(), record_contour);
  }
  std::string progress_;
};

std::int32_t contours_in(const std::vector<Point2f>& pts) {
  std::int32_t n = 0;
  for (size_t i = 0; i < pts.size(); ++i) n += pts[i].x < 99990.0f && (i == 0 || pts[i - 1].x >= 99990.0f);
  return n;
}

TEST_F(Assembly, NoLevelWithZones) {
  levels({0, 1, 2}, {});
  ASSERT_EQ(assemble(), 0);
  EXPECT_EQ(progress_, "\r 10-20-30-40-50-60-70-80-90-100%\n\n");
  EXPECT_EQ(zone_builder().resultCount, 0);
  EXPECT_FALSE(zone_builder().levelFile.isOpen());
  EXPECT_EQ(read_file("temp2"), "");
  EXPECT_EQ(write(), 0);
  EXPECT_TRUE(g_written.empty());
}

TEST_F(Assembly, OnlyTheDeepestLevelHasZonesAndIsCarriedUp) {
  levels({0, 1, 2}, {{2, stock_points({rectangle(40, 40, 60, 60)})}});
  ASSERT_EQ(assemble(), 0);
  const ZoneBuilderState& s = zone_builder();
  ASSERT_EQ(s.resultCount, 3);
  EXPECT_EQ(s.resultRanges[0].z, 2.0f);
  EXPECT_EQ(s.resultRanges[2].z, 0.0f);
  EXPECT_EQ(s.resultRanges[3].first, -1);  // the spare entries stay unset
  const auto deepest = result(0);
  ASSERT_EQ(result(2).size(), deepest.size());
  EXPECT_EQ(std::memcmp(result(2).data(), deepest.data(), deepest.size() * 8), 0);
  const auto b = box_of(deepest);  // grown by 2.04, shrunk by 2
  EXPECT_NEAR(b[0], 39.96f, 1e-4);
  EXPECT_NEAR(b[2], 60.04f, 1e-4);
  ASSERT_EQ(write(), 0);  // top level first, every contour closed
  ASSERT_EQ(g_written.size(), 3u);
  EXPECT_EQ(g_written[0].z, 0.0f);
  EXPECT_EQ(g_written[2].z, 2.0f);
  EXPECT_EQ(g_written[0].unit, 7);
  EXPECT_EQ(g_written[0].points.front().y, g_written[0].points.back().y);
}

TEST_F(Assembly, OnlyTheTopLevelHasZones) {
  levels({0, 1, 2}, {{0, stock_points({rectangle(40, 40, 60, 60)})}});
  ASSERT_EQ(assemble(), 0);
  EXPECT_EQ(zone_builder().resultCount, 1);
  ASSERT_EQ(write(), 0);
  ASSERT_EQ(g_written.size(), 1u);
}

TEST_F(Assembly, ZonesOfLowerLevelsAreUnitedIntoUpperLevels) {
  levels({0, 1, 2, 3}, {{3, stock_points({rectangle(0, 0, 10, 10)})},
                        {1, stock_points({rectangle(20, 0, 30, 10)})}});
  ASSERT_EQ(assemble(), 0);
  ASSERT_EQ(zone_builder().resultCount, 4);
  EXPECT_EQ(contours_in(result(1)), 1);  // carried up from level 3
  EXPECT_EQ(contours_in(result(2)), 2);  // level 1: its own and level 3's
  EXPECT_EQ(contours_in(result(3)), 2);
  const auto b = box_of(result(3));
  EXPECT_NEAR(b[0], -0.04f, 1e-4);
  EXPECT_NEAR(b[2], 30.04f, 1e-4);
}

// Regression: a level whose zones grew into nothing failed the whole run on
// an empty operand of the union instead of keeping what was carried up.
TEST_F(Assembly, ALevelWhoseZonesGrowIntoNothingKeepsTheCarriedUnion) {
  levels({0, 1}, {{1, stock_points({rectangle(0, 0, 10, 10)})},
                  {0, stock_points({{{50, 50}, {50.0005f, 50}, {50, 50}}})}});
  ASSERT_EQ(assemble(), 0);
  ASSERT_EQ(zone_builder().resultCount, 2);
  EXPECT_NEAR(box_of(result(1))[2], 10.04f, 1e-4);
}

// Regressions: the search for the deepest level looked at the spare entries;
// reopening temp1 truncated it.
TEST_F(Assembly, SpareRangesAreNotLevelsAndTheLevelFileKeepsItsPoints) {
  const auto zones = stock_points({rectangle(0, 0, 10, 10)});
  levels({0}, {{0, zones}});
  zone_builder().levelRanges[1] = {1, 6, 5.0f};
  ASSERT_EQ(assemble(), 0);
  EXPECT_EQ(zone_builder().resultCount, 1);
  EXPECT_EQ(read_file("temp1").size(), zones.size() * 8);
  EXPECT_GE(buffer.size(), zones.size());  // the lent buffer grew to the level
}

// Regressions: a failed read of temp1 gave a short contour, and a write to
// temp2 that the disk refused only ended the level's range early.
TEST_F(Assembly, FailuresEndTheAssembly) {
  const auto oneLevel = [&] {
    reset_zone_builder();
    levels({0}, {{0, stock_points({rectangle(0, 0, 10, 10)})}});
  };
  oneLevel();
  zone_builder().levelRanges[0].last += 3;  // beyond the end of temp1
  EXPECT_EQ(assemble(), -1);
  std::filesystem::remove(path("grid.tmp"));
  oneLevel();
  EXPECT_EQ(assemble(), -1);
  write_file("grid.tmp", "0 0 0 0 0.1 0 2 0\n");
  oneLevel();
  engine.offsetsOk = false;
  EXPECT_EQ(assemble(), -1);
  if (!std::filesystem::exists("/dev/full")) return;
  engine.offsetsOk = true;
  std::filesystem::remove(path("temp2"));
  std::filesystem::create_symlink("/dev/full", path("temp2"));
  oneLevel();
  EXPECT_EQ(assemble(), -1);
}

TEST(SplitRuns, SeparatorThresholds) {
  const std::vector<Point2f> p = {{99999, 99999}, {90000, 0}, {1, 1}, {90000, 2}, {2, 2},
                                  {90000.01f, 0}, {3, 3},     {4, 4}, {95000, 0}};
  EXPECT_EQ(split_runs(p.data(), static_cast<std::int32_t>(p.size())),
            (std::vector<std::pair<std::int32_t, std::int32_t>>{{2, 5}, {6, 8}}));
}

TEST_F(Assembly, WriteZonesDropsShortRunsClosesRunsAndFailsOnRefusal) {
  const std::vector<Point2f> p = {{99999, 99999}, {0, 0}, {1, 0}, {1, 1}, {99999, 99999},
                                  {5, 5},         {6, 5}, {6, 6}, {5.5f, 6.5f}, {99999, 99999}};
  ScratchFile f;
  std::int32_t written = 0;
  ASSERT_EQ(f.create(path("temp2").c_str()), 0);
  ASSERT_EQ(write_points(f, p.data(), 10, written), 0);
  ASSERT_EQ(f.close(), 0);
  const std::vector<LevelRange> ranges = {{1, 10, 4.0f}, {1, 0, 3.0f}, {-1, -1, 2.0f}};
  ASSERT_EQ(write_zones(3, path("temp2").c_str(), 3, ranges.data(), record_contour), 0);
  ASSERT_EQ(g_written.size(), 1u);
  ASSERT_EQ(g_written[0].points.size(), 4u);
  EXPECT_EQ(g_written[0].points[3].x, 5.0f);  // the last point made the first
  EXPECT_EQ(g_written[0].points[3].y, 5.0f);
  g_refuse = true;
  EXPECT_EQ(write_zones(3, path("temp2").c_str(), 3, ranges.data(), record_contour), -1);
  const LevelRange beyond = {1, 11, 0.0f};
  EXPECT_EQ(write_zones(3, path("temp2").c_str(), 1, &beyond, record_contour), -1);
  EXPECT_EQ(write_zones(3, path("absent").c_str(), 0, nullptr, record_contour), -1);
}

}  // namespace
}  // namespace zt::testing
