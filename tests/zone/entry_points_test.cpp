// The entry points: the scratch level file, the level range table, the
// placement of stock levels, the zstock.ok distance, a level's failures;
// then the small case whole, on the real engines, against its known answer
// (the zone oracle runs many more against a peer).
#include "zone/entry_points.hpp"

#include <gtest/gtest.h>

#include <filesystem>

#include "zone/level_zone.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

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

class EntryPoints : public ZoneTmpTest {
 protected:
  BoxOffsetEngine engine;
  void SetUp() override {
    ZoneTmpTest::SetUp();
    set_offset_engine(&engine);
    const auto square = rectangle(0, 0, 100, 100);
    write_file("contour.bin", record_file({{10.0f, {square}}, {5.0f, {square}}, {0.0f, {square}}}));
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
  const std::vector<Point2f> rest = stock_points({rectangle(40, 40, 60, 60)});
};

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
  write_file("grid.tmp", "0 0 0 0 0.1 0 2 0");
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

}  // namespace
}  // namespace zt::testing
