// Level tables beyond the cases of data/levels.cases: tables and point
// buffers of no fixed size.
#include <gtest/gtest.h>

#include "driver/level_tables.hpp"
#include "driver/logical_units.hpp"
#include "test_files.hpp"

namespace zt {
namespace {

// Regression: more than 5000 levels, and levels of many points.
TEST(LevelTables, RegressionMoreThanFiveThousandLevelsAndLargeLevels) {
  std::vector<test::Bytes> records;
  for (int i = 0; i < 6000; ++i) records.push_back(test::point(1, 2, 10000.0f - i));
  for (int i = 0; i < 70000; ++i) records.push_back(test::point(static_cast<float>(i), 0, -5));
  test::ScratchDir dir;
  test::write_bytes(dir.file("f.bin"), test::record_file(records));
  const std::int32_t unit = free_unit();
  attach_record_input(unit, dir.file("f.bin"));
  LevelTable table;
  scan_levels(unit, table);
  rewind_unit(unit);
  ASSERT_EQ(table.count(), 6001);
  EXPECT_EQ(table.z[5999], 4001.0f);
  const RecordRange big = table.range[6000];
  EXPECT_EQ(big.last - big.first + 1, 70000);
  std::vector<Point2f> points;
  read_level_points(unit, big.first, big.last, points);
  close_unit(unit);
  ASSERT_EQ(points.size(), 70000u);
  EXPECT_EQ(points.back().x, 69999.0f);
}

}  // namespace
}  // namespace zt
