// Level tables: scanning with the 0.0001 tolerance, lookup, and reading each
// level's own record range in any order.
#include <gtest/gtest.h>

#include "driver/level_tables.hpp"
#include "driver/logical_units.hpp"
#include "test_files.hpp"

namespace zt {
namespace {

using test::Bytes;

class LevelTables : public ::testing::Test {
 protected:
  // Writes the records, opens them on a unit and scans them.
  void open(const std::vector<Bytes>& records) {
    test::write_bytes(dir.file("f.bin"), test::record_file(records));
    unit = free_unit();
    attach_record_input(unit, dir.file("f.bin"));
    scan_levels(unit, table);
    rewind_unit(unit);
  }
  void TearDown() override { close_unit(unit); }

  std::vector<float> xs(std::int32_t first, std::int32_t last) {
    read_level_points(unit, first, last, points);
    std::vector<float> out;
    for (const Point2f& p : points) out.push_back(p.x);
    return out;
  }

  test::ScratchDir dir;
  std::int32_t unit = 0;
  LevelTable table;
  std::vector<Point2f> points;
};

TEST_F(LevelTables, ToleranceIsMeasuredFromTheLevelsFirstZ) {
  open({test::separator(), test::separator(), test::point(99998.5f, 0, 1)});
  EXPECT_EQ(table.count(), 0);  // only separators
  close_unit(unit);
  open({test::separator(), test::point(1, 0, 10.0f), test::point(2, 0, 10.00005f),
        test::point(3, 0, 10.00012f), test::point(4, 0, 10.0002f)});
  ASSERT_EQ(table.count(), 2);
  EXPECT_EQ(table.z[0], 10.0f);
  EXPECT_EQ(table.range[0].first, 2);
  EXPECT_EQ(table.range[0].last, 3);
  EXPECT_EQ(table.z[1], 10.00012f);
  EXPECT_EQ(table.range[1].first, 4);
  EXPECT_EQ(table.range[1].last, 5);
}

// A range encloses the separators between the contours of its level, and
// they are read as points with x = 99999.
TEST_F(LevelTables, SeparatorsInsideALevelAreHandedOn) {
  open({test::separator(12), test::point(1, 0, 5, 12), test::point(2, 0, 5, 16), test::separator(16),
        test::point(3, 0, 5), test::separator(), test::point(4, 0, 2)});  // records of 12, 16, 18 bytes
  ASSERT_EQ(table.count(), 2);
  EXPECT_EQ(table.range[0].first, 2);
  EXPECT_EQ(table.range[0].last, 5);
  EXPECT_EQ(xs(2, 5), (std::vector<float>{1, 2, 99999, 3}));
  EXPECT_EQ(xs(7, 7), (std::vector<float>{4}));
}

// The scan starts with 99999 as the previous z; a first point record at that
// height still opens level 1 instead of being recorded into no level.
TEST_F(LevelTables, RegressionFirstPointAtSeparatorHeightOpensALevel) {
  open({test::point(1, 0, 99999.0f), test::point(2, 0, 99999.0f), test::point(3, 0, 7)});
  ASSERT_EQ(table.count(), 2);
  EXPECT_EQ(table.range[0].first, 1);
  EXPECT_EQ(table.range[0].last, 2);
  EXPECT_EQ(table.range[1].first, 3);
}

TEST_F(LevelTables, FindLevel) {
  open({test::point(1, 0, 30), test::point(2, 0, 20), test::point(3, 0, 20.5f), test::point(4, 0, 20),
        test::point(5, 0, 10)});
  ASSERT_EQ(table.count(), 5);
  std::int32_t first = 0, last = 0;
  ASSERT_TRUE(find_level(20.00009f, table, first, last));
  EXPECT_EQ(first, 2);  // the first level of a repeated z wins
  ASSERT_TRUE(find_level(10.0f, table, first, last));
  EXPECT_EQ(first, 5);
  first = last = -7;
  EXPECT_FALSE(find_level(25.0f, table, first, last));  // level 30 is not within, 20 is below
  EXPECT_FALSE(find_level(5.0f, table, first, last));
  EXPECT_FALSE(find_level(40.0f, table, first, last));
  EXPECT_EQ(first, -7);
  // A lookup with no match reads nothing: the cursor stays.
  read_level_points(unit, 2, 2, points);
  EXPECT_FALSE(find_level(25.0f, table, first, last));
  EXPECT_EQ(record_position(unit), 3);
}

// Regression: a z that repeats or rises must never shift later levels onto
// other records. Every level, read by its own range in table order, then in
// reverse order, gets exactly its own points.
TEST_F(LevelTables, RegressionOwnRangeWithRepeatedAndRisingZ) {
  const float zs[] = {5, 3, 5, 8, 1, 8};
  std::vector<Bytes> records;
  float x = 0;
  std::vector<std::vector<float>> expected;
  for (float z : zs) {
    records.push_back(test::separator());
    expected.emplace_back();
    for (int i = 0; i < 3; ++i) {
      records.push_back(test::point(++x, 0, z));
      expected.back().push_back(x);
    }
  }
  open(records);
  ASSERT_EQ(table.count(), 6);
  for (std::int32_t i = 0; i < table.count(); ++i) {
    EXPECT_EQ(xs(table.range[i].first, table.range[i].last), expected[i]) << "level " << i + 1;
  }
  for (std::int32_t i = table.count() - 1; i >= 0; --i) {
    EXPECT_EQ(xs(table.range[i].first, table.range[i].last), expected[i]) << "level " << i + 1;
  }
}

TEST_F(LevelTables, RangesBeyondTheFile) {
  open({test::point(1, 0, 3), test::point(2, 0, 3), test::point(3, 0, 3)});
  EXPECT_EQ(xs(2, 9), (std::vector<float>{2, 3}));  // file ends inside the range
  EXPECT_EQ(xs(7, 9), std::vector<float>{});        // file ends before it
  EXPECT_EQ(xs(3, 2), std::vector<float>{});        // inverted
  EXPECT_EQ(xs(0, 1), std::vector<float>{});
}

// Neither the tables nor the point buffer have a fixed size.
TEST_F(LevelTables, RegressionMoreThanFiveThousandLevelsAndLargeLevels) {
  std::vector<Bytes> records;
  for (int i = 0; i < 6000; ++i) records.push_back(test::point(1, 2, 10000.0f - i));
  for (int i = 0; i < 70000; ++i) records.push_back(test::point(static_cast<float>(i), 0, -5));
  open(records);
  ASSERT_EQ(table.count(), 6001);
  EXPECT_EQ(table.z[5999], 4001.0f);
  const RecordRange big = table.range[6000];
  EXPECT_EQ(big.last - big.first + 1, 70000);
  read_level_points(unit, big.first, big.last, points);
  ASSERT_EQ(points.size(), 70000u);
  EXPECT_EQ(points.back().x, 69999.0f);
}

}  // namespace
}  // namespace zt
