// wf_init_czone and wf_add_level: the scratch level file, the level range
// table, the placement of stock levels, the zstock.ok distance, the engine
// calls of one level and the failures of a level.
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
  EXPECT_EQ(place_level(r, 3, cursor, 5.0f), 1);
  EXPECT_EQ(place_level(r, 3, cursor, 0.0f), 2);
  EXPECT_EQ(cursor, 2);
  cursor = 0;
  EXPECT_EQ(place_level(r, 3, cursor, 7.0f), 1);  // the first level not above 7.0001
  EXPECT_EQ(place_level(r, 3, cursor, 5.00005f), 1);  // within the tolerance, never back
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
    // Finishing contour: the square [0, 100]^2 on three levels.
    write_file("contour.bin", record_file({{10.0f, {rectangle(0, 0, 100, 100)}},
                                           {5.0f, {rectangle(0, 0, 100, 100)}},
                                           {0.0f, {rectangle(0, 0, 100, 100)}}}));
  }
  std::int32_t init(std::vector<float> levels) {
    std::int32_t ierr = 99;
    const std::int32_t n = static_cast<std::int32_t>(levels.size());
    wf_init_czone(levels.data(), n, ierr);
    return ierr;
  }
  std::int32_t add(float z, const std::vector<Point2f>& pts) {
    std::int32_t ierr = 99;
    const std::int32_t n = static_cast<std::int32_t>(pts.size());
    wf_add_level(z, pts.data(), n, ierr);
    return ierr;
  }
  std::vector<Point2f> scratch() {
    const std::string b = read_file("temp1");
    std::vector<Point2f> p(b.size() / 8);
    std::memcpy(p.data(), b.data(), p.size() * 8);
    return p;
  }
};

// Regression: the spare entries were never set.
TEST_F(EntryPoints, InitCreatesAnEmptyScratchFileAndRangesWithoutPoints) {
  write_file("temp1", "old contents");
  ASSERT_EQ(init({10, 5, 0}), 0);
  EXPECT_EQ(read_file("temp1"), "");
  const auto& ranges = zone_builder().levelRanges;
  ASSERT_EQ(ranges.size(), 5u);
  for (const LevelRange& r : ranges) {
    EXPECT_EQ(r.first, -1);
    EXPECT_EQ(r.last, -1);
  }
  EXPECT_EQ(ranges[1].z, 5.0f);
  EXPECT_EQ(ranges[4].z, 0.0f);
  std::int32_t ierr = 0;
  wf_init_czone(nullptr, -1, ierr);
  EXPECT_EQ(ierr, -1);
}

TEST_F(EntryPoints, LevelsGoToTheirRangesInTheScratchFile) {
  ASSERT_EQ(init({10, 5, 0}), 0);
  const auto rest = stock_points({rectangle(40, 40, 60, 60)});
  ASSERT_EQ(add(5.0f, rest), 0);
  const std::int32_t n1 = static_cast<std::int32_t>(zone_builder().context->levelResult.size());
  ASSERT_EQ(add(0.0f, rest), 0);
  const std::int32_t n2 = static_cast<std::int32_t>(zone_builder().context->levelResult.size());
  ASSERT_GE(n1, 5);
  const auto& r = zone_builder().levelRanges;
  EXPECT_EQ(r[0].first, -1);
  EXPECT_EQ(r[1].first, 1);
  EXPECT_EQ(r[1].last, n1);
  EXPECT_EQ(r[2].first, n1 + 1);
  EXPECT_EQ(r[2].last, n1 + n2);
  EXPECT_EQ(zone_builder().pointsWritten, n1 + n2);
  std::fflush(zone_builder().levelFile.stream());
  const auto pts = scratch();
  ASSERT_EQ(static_cast<std::int32_t>(pts.size()), n1 + n2);
  // The rest material grown by 1.0 (the default distance) within the square.
  float xmin = 1e9f, xmax = -1e9f;
  for (const Point2f& p : pts) {
    if (p.x >= 99990.0f) continue;
    xmin = std::min(xmin, p.x);
    xmax = std::max(xmax, p.x);
  }
  EXPECT_EQ(xmin, 39.0f);
  EXPECT_EQ(xmax, 61.0f);
  EXPECT_EQ(pts.back().x, 99999.0f);
  // The engine calls of a level, in order.
  ASSERT_GE(engine.calls.size(), 4u);
  EXPECT_EQ(engine.calls[engine.calls.size() - 3], "reset");
  EXPECT_EQ(engine.calls[engine.calls.size() - 2], "diagram 0 1 0 0 0 0 0 0 1");
  EXPECT_EQ(engine.calls.back(), "offsets 2 1 0");
  EXPECT_EQ(std::count(engine.calls.begin(), engine.calls.end(), "initialize"), 1);
  EXPECT_TRUE(engineReady);
}

TEST_F(EntryPoints, ZstockDistanceIsReadOnceOnTheFirstLevel) {
  write_file("zstock.ok", "0.5 3\n");
  ASSERT_EQ(init({10, 5, 0}), 0);
  ASSERT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60)})), 0);
  EXPECT_EQ(zone_builder().context->offsetDistance, 3.0);
  EXPECT_EQ(engine.requestT, 3.0);
  write_file("zstock.ok", "9\n");
  ASSERT_EQ(add(5.0f, stock_points({rectangle(40, 40, 60, 60)})), 0);
  EXPECT_EQ(engine.requestT, 3.0);
}

TEST_F(EntryPoints, FailuresOfALevel) {
  ASSERT_EQ(init({10, 5}), 0);
  const auto rest = stock_points({rectangle(40, 40, 60, 60)});
  // Nothing to feed: no zone region, the intersection refuses it.
  EXPECT_EQ(add(10.0f, stock_points({{{1, 1}, {1.0005f, 1}}})), -1);
  // Disjoint from the finishing region: no zones, no failure, nothing stored.
  EXPECT_EQ(add(10.0f, stock_points({rectangle(200, 200, 220, 220)})), 0);
  EXPECT_EQ(zone_builder().pointsWritten, 0);
  // No finishing level at 7; the lookup's cursor moves on to level 5.
  EXPECT_EQ(add(7.0f, rest), -1);
  // Level 0 is in contour.bin but below every level given to wf_init_czone.
  EXPECT_EQ(add(0.0f, rest), -1);
  // The cursor has passed 10: that level cannot come back.
  EXPECT_EQ(add(10.0f, rest), -1);
}

TEST_F(EntryPoints, WithoutContourLevelsAnyStoredLevelFails) {
  ASSERT_EQ(init({}), 0);
  EXPECT_EQ(read_file("temp1"), "");
  EXPECT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60)})), -1);
}

TEST_F(EntryPoints, MissingContourFileFailsEveryLevel) {
  std::filesystem::remove(path("contour.bin"));
  ASSERT_EQ(init({10}), 0);
  EXPECT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60)})), -1);
  EXPECT_NE(zone_builder().context, nullptr);
  EXPECT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60)})), -1);
}

// When the engine cannot offset, the rest material itself is intersected.
TEST_F(EntryPoints, EngineFailureFallsBackToTheRestMaterial) {
  engine.diagramOk = false;
  ASSERT_EQ(init({10}), 0);
  ASSERT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60), rectangle(90, 90, 120, 120)})), 0);
  float xmax = 0;
  for (const Point2f& p : zone_builder().context->levelResult) {
    if (p.x < 99990.0f) xmax = std::max(xmax, p.x);
  }
  EXPECT_EQ(xmax, 100.0f);
  EXPECT_EQ(zone_builder().context->zonePoints[0].tag, kSeparatorTag);
  EXPECT_EQ(zone_builder().context->zonePoints[1].tag, kRestPointTag);
}

// Regression: a write the disk refused was a silently shortened level.
TEST_F(EntryPoints, AFullDiskFailsTheLevel) {
  if (!std::filesystem::exists("/dev/full")) GTEST_SKIP() << "no /dev/full";
  std::filesystem::create_symlink("/dev/full", path("temp1"));
  ASSERT_EQ(init({10}), 0);
  EXPECT_EQ(add(10.0f, stock_points({rectangle(40, 40, 60, 60)})), -1);
}

}  // namespace
}  // namespace zt::testing
