// The offset distance of zstock.ok and the merge radius of grid.tmp, with
// the values that must change nothing: the rows of data/parameter_files.txt.
#include "zone/parameter_files.hpp"

#include <gtest/gtest.h>

#include "support/data_table.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

class ParameterFiles : public ZoneTmpTest, public ::testing::WithParamInterface<test::Row> {};

TEST_P(ParameterFiles, ValueAsListed) {
  const test::Row& row = GetParam();
  write_file(row[1], test::unescape(row[2]));
  if (row[1] == "zstock.ok") {
    double d = 1.0;
    read_offset_distance(path(row[1]).c_str(), d);
    EXPECT_EQ(d, std::strtod(row[3].c_str(), nullptr));
  } else {
    float r = 10.0f;
    EXPECT_EQ(read_merge_radius(path(row[1]).c_str(), r), 0);
    EXPECT_EQ(r, std::strtof(row[3].c_str(), nullptr));
  }
}

INSTANTIATE_TEST_SUITE_P(Rows, ParameterFiles,
                         ::testing::ValuesIn(test::read_table("parameter_files.txt", 4)), test::row_name);

TEST_F(ZoneTmpTest, MissingParameterFilesChangeNothing) {
  double d = 1.0;
  read_offset_distance(path("missing").c_str(), d);
  EXPECT_EQ(d, 1.0);
  float r = 10.0f;
  EXPECT_EQ(read_merge_radius(path("missing").c_str(), r), -1);
  EXPECT_EQ(r, 10.0f);
}

}  // namespace
}  // namespace zt::testing
