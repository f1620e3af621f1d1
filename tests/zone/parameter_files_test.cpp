// The offset distance of zstock.ok and the merge radius of grid.tmp, with
// the values that must change nothing: the rows of data/parameter_files.txt.
#include "zone/parameter_files.hpp"

#include <gtest/gtest.h>

#include "support/case_rows.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

class ParameterFiles : public ZoneTmpTest, public ::testing::WithParamInterface<test::Row> {};

TEST_P(ParameterFiles, ValueAsListed) {
  ASSERT_EQ(GetParam().error, "");
  const std::string file = GetParam().field(0), value = GetParam().field(2);
  write_file(file, test::Unescape(GetParam().field(1)));
  if (file == "zstock.ok") {
    double d = 1.0;
    read_offset_distance(path(file).c_str(), d);
    EXPECT_EQ(d, std::strtod(value.c_str(), nullptr));
  } else {
    float r = 10.0f;
    EXPECT_EQ(read_merge_radius(path(file).c_str(), r), 0);
    EXPECT_EQ(r, std::strtof(value.c_str(), nullptr));
  }
}

INSTANTIATE_TEST_SUITE_P(Rows, ParameterFiles, test::RowsOf("parameter_files.txt"), test::RowName);

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
