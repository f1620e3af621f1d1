// The entry points and the final assembly, with a stand-in engine (grown and
// shrunk boxes) and the real Boolean engine: the scratch level file, the
// level range table, the placement of stock levels, the zstock.ok distance,
// a level's failures; the deepest level with zones, the carry-up, the union
// over levels, the scratch file failures, and write_zones' runs and order;
// then the small case whole, on the real engines, against its known answer
// (the zone oracle runs many more against a peer).
#include "zone/entry_points.hpp"

#include <gtest/gtest.h>

#include <filesystem>

#include "zone/assembly.hpp"
#include "zone/level_zone.hpp"
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


TEST(PlaceLevel, CursorPassesOnlyLevelsAboveTheStockLevel) {
  LevelRange r[5] = {{-1, -1, 10.0f}, {-1, -1, 5.0f}, {-1, -1, 0.0f}};
  std::int32_t cursor = 0;
  EXPECT_EQ(place_level(r, 3, cursor, 5.0f), 1);  // 10 > 5.0001
  EXPECT_EQ(place_level(r, 3, cursor, 0.0f), 2);
  cursor = 0;
  EXPECT_EQ(place_level(r, 3, cursor, 7.0f), 1);  // the first level not above 7.0001
  EXPECT_EQ(place_level(r, 3, cursor, 5.00005f), 1);
  EXPECT_EQ(place_level(r, 3, cursor, 4.99995f), 1);  // within the tolerance below level 5
  EXPECT_EQ(place_level(r, 3, cursor, -1.0f), -1);
  EXPECT_EQ(cursor, 3);
  cursor = 0;
  EXPECT_EQ(place_level(r, 0, cursor, 5.0f), -1);
}

// A fresh directory with contour.bin (the square [0, 100]^2 at 10, 5 and 0)
// and grid.tmp (merge radius 2), and the stand-in engine.
class ZoneBuilder : public ZoneTmpTest {
 protected:
  BoxOffsetEngine engine;
  std::vector<Point2f> buffer;
  std::string progress_;
  const std::vector<Point2f> rest = stock_points({rectangle(40, 40, 60, 60)});

  void SetUp() override {
    ZoneTmpTest::SetUp();
    set_offset_engine(&engine);
    const auto square = rectangle(0, 0, 100, 100);
    write_file("contour.bin", record_file({{10.0f, {square}}, {5.0f, {square}}, {0.0f, {square}}}));
    write_file("grid.tmp", "0 0 0 0 0.1 0 2 0\n");  // merge radius 2
    g_written.clear();
    g_refuse = false;
  }
  std::int32_t init(std::vector<float> levels) {
    std::int32_t ierr = 99;
    wf_init_czone(levels.data(), static_cast<std::int32_t>(levels.size()), ierr);
    return ierr;
  }
  std::int32_t add(float z, const std::vector<Point2f>& pts) {
    std::int32_t ierr = 99;
    wf_add_level(z, pts.data(), static_cast<std::int32_t>(pts.size()), ierr);
    return ierr;
  }
  const std::vector<Point2f>& result() { return zone_builder().context->levelResult; }
  // Contour levels (top first) and, in temp1, the zones of some of them.
  void levels(const std::vector<float>& z, const std::map<int, std::vector<Point2f>>& zones) {
    ASSERT_EQ(init(z), 0);
    ZoneBuilderState& s = zone_builder();
    for (const auto& [k, pts] : zones) {
      const std::int32_t first = s.pointsWritten + 1;
      ASSERT_EQ(write_points(s.levelFile, pts.data(), static_cast<std::int32_t>(pts.size()), s.pointsWritten), 0);
      s.levelRanges[k] = {first, s.pointsWritten, z[k]};
    }
  }
  std::int32_t assemble() {
    ::testing::internal::CaptureStdout();
    const std::int32_t r = assemble_zones(buffer);
    progress_ = ::testing::internal::GetCapturedStdout();
    return r;
  }
  // The points of a result entry in temp2.
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
};
class Assembly : public ZoneBuilder {};
class EntryPoints : public ZoneBuilder {};

// Regression: the spare entries of the range table were never set.
TEST_F(EntryPoints, InitCreatesAnEmptyScratchFileAndRangesWithoutPoints) {
  write_file("temp1", "old contents");
  ASSERT_EQ(init({10, 5, 0}), 0);
  EXPECT_EQ(read_file("temp1"), "");
  const auto& ranges = zone_builder().levelRanges;
  ASSERT_EQ(ranges.size(), 5u);
  for (const LevelRange& r : ranges) EXPECT_EQ(r.first + r.last, -2);
  EXPECT_EQ(ranges[1].z, 5.0f);
  std::int32_t ierr = 0;
  wf_init_czone(nullptr, -1, ierr);
  EXPECT_EQ(ierr, -1);
}

TEST_F(EntryPoints, LevelsGoToTheirRangesInTheScratchFile) {
  ASSERT_EQ(init({10, 5, 0}), 0);
  ASSERT_EQ(add(5.0f, rest), 0);
  const std::int32_t n1 = static_cast<std::int32_t>(result().size());
  EXPECT_EQ(box_of(result()), (std::array<float, 4>{39, 39, 61, 61}));  // grown by 1.0
  ASSERT_EQ(add(0.0f, rest), 0);
  const std::int32_t n2 = static_cast<std::int32_t>(result().size());
  ASSERT_GE(n1, 5);
  const auto& r = zone_builder().levelRanges;
  EXPECT_EQ(r[0].first, -1);
  EXPECT_EQ(r[1].first, 1);
  EXPECT_EQ(r[1].last, n1);
  EXPECT_EQ(r[2].first, n1 + 1);
  EXPECT_EQ(r[2].last, n1 + n2);
  EXPECT_EQ(read_file("temp1").size(), 8u * (n1 + n2));
  EXPECT_EQ(read_file("temp1").substr(8 * n1 - 8, 4), std::string("\x80\x4f\xc3\x47", 4));  // 99999
}

TEST_F(EntryPoints, ZstockDistanceIsReadOnceOnTheFirstLevel) {
  write_file("zstock.ok", "0.5 3\n");
  ASSERT_EQ(init({10, 5, 0}), 0);
  ASSERT_EQ(add(10.0f, rest), 0);
  EXPECT_EQ(engine.requestT, 3.0);
  write_file("zstock.ok", "9\n");
  ASSERT_EQ(add(5.0f, rest), 0);
  EXPECT_EQ(engine.requestT, 3.0);
}

TEST_F(EntryPoints, FailuresOfALevel) {
  ASSERT_EQ(init({10, 5}), 0);
  // Nothing to feed: no zone region, no zones, no failure.
  EXPECT_EQ(add(10.0f, stock_points({{{1, 1}, {1.0005f, 1}}})), 0);
  EXPECT_TRUE(result().empty());
  // Disjoint from the finishing region: nothing stored, no failure.
  EXPECT_EQ(add(10.0f, stock_points({rectangle(200, 200, 220, 220)})), 0);
  EXPECT_EQ(zone_builder().pointsWritten, 0);
  // No finishing level at 7; the lookup moves on to level 5.
  EXPECT_EQ(add(7.0f, rest), -1);
  // Level 0 is in contour.bin but below every level of the range table.
  EXPECT_EQ(add(0.0f, rest), -1);
  // The lookup has passed 10.
  EXPECT_EQ(add(10.0f, rest), -1);
}

TEST_F(EntryPoints, WithoutContourLevelsOrContourFileEveryLevelFails) {
  ASSERT_EQ(init({}), 0);
  EXPECT_EQ(add(10.0f, rest), -1);
  reset_zone_builder();
  std::filesystem::remove(path("contour.bin"));
  ASSERT_EQ(init({10}), 0);
  EXPECT_EQ(add(10.0f, rest), -1);
  EXPECT_NE(zone_builder().context, nullptr);
  EXPECT_EQ(add(10.0f, rest), -1);
}

TEST_F(EntryPoints, EngineFailureFallsBackToTheRestMaterial) {
  engine.diagramOk = false;
  ASSERT_EQ(init({10}), 0);
  ASSERT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60), rectangle(90, 90, 120, 120)})), 0);
  EXPECT_EQ(box_of(result()), (std::array<float, 4>{40, 40, 100, 100}));
  EXPECT_EQ(zone_builder().context->zonePoints[0].tag, kSeparatorTag);
  EXPECT_EQ(zone_builder().context->zonePoints[1].tag, kRestPointTag);
}

// Regression: a write the disk refused was a silently shortened level.
TEST_F(EntryPoints, AFullDiskFailsTheLevel) {
  if (!std::filesystem::exists("/dev/full")) GTEST_SKIP() << "no /dev/full";
  std::filesystem::create_symlink("/dev/full", path("temp1"));
  ASSERT_EQ(init({10}), 0);
  EXPECT_EQ(add(10.0f, rest), -1);
}

// On the real engines: a sliver that the feed's thinning collapses to a
// there-and-back contour grows into its stroke; rest material that grows
// into no curve gives its level no zones, and the level does not fail.
TEST_F(EntryPoints, DegenerateRestMaterialGivesItsStrokeOrNoZones) {
  set_offset_engine(nullptr);
  ASSERT_EQ(init({10, 5}), 0);
  ASSERT_EQ(add(10.0f, stock_points({{{10, 50}, {20, 50.0004f}, {30, 50}, {20, 49.9996f}, {10, 50}}})), 0);
  const std::array<float, 4> stroke{9, 49, 31, 51};
  for (int i = 0; i < 4; ++i) EXPECT_NEAR(box_of(result())[i], stroke[i], 0.01) << i;
  ASSERT_EQ(add(5.0f, stock_points({{{1, 1}, {1.0005f, 1}, {1, 1.0005f}, {1, 1}}})), 0);
  EXPECT_TRUE(result().empty());
}

// The pocket [0, 100]^2 with rest material [40, 60]^2, offset distance 1,
// merge radius 2, on the real engines: one closed contour whose box is
// [38.96, 61.04]^2 within 0.01.
TEST_F(EntryPoints, WholeRunOfTheSmallCase) {
  set_offset_engine(nullptr);
  write_file("contour.bin", record_file({{0.0f, {rectangle(0, 0, 100, 100)}}}));
  ASSERT_EQ(init({0.0f}), 0);
  ASSERT_EQ(add(0.0f, rest), 0);
  std::int32_t ierr = -1;
  const WrittenZones zones = finish_zones(5, ierr, std::vector<Point2f>(16));
  ASSERT_EQ(ierr, 0);
  ASSERT_EQ(zones.size(), 1u);
  ASSERT_EQ(zones.begin()->second.size(), 1u);
  const auto& c = zones.begin()->second[0];
  EXPECT_EQ(c.front().x, c.back().x);
  EXPECT_EQ(c.front().y, c.back().y);
  for (int i = 0; i < 4; ++i) EXPECT_NEAR(box_of(c)[i], i < 2 ? 38.96 : 61.04, 0.01) << i;
}

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
  levels({0, 1, 2}, {{2, rest}});
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
  levels({0, 1, 2}, {{0, rest}});
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
