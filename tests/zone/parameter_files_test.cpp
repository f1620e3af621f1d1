// The offset distance of zstock.ok and the merge radius of grid.tmp,
// including the values that must change nothing.
#include "zone/parameter_files.hpp"

#include <gtest/gtest.h>

#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

class ParameterFiles : public ZoneTmpTest {
 protected:
  double distance(const std::string& content) {
    write_file("zstock.ok", content);
    double d = 1.0;
    read_offset_distance(path("zstock.ok").c_str(), d);
    return d;
  }
  float radius(const std::string& content) {
    write_file("grid.tmp", content);
    float r = 10.0f;
    EXPECT_EQ(read_merge_radius(path("grid.tmp").c_str(), r), 0);
    return r;
  }
};

TEST_F(ParameterFiles, OffsetDistanceIsTheLastOfTwoNumbersAndOnlyRaises) {
  EXPECT_EQ(distance("0.5 2.5\n"), 2.5);
  EXPECT_EQ(distance("0.5\n"), 1.0);
  EXPECT_EQ(distance("3"), 3.0);
  EXPECT_EQ(distance("4\r\n5\r\n6\r\n"), 5.0);
  EXPECT_EQ(distance(""), 1.0);
  EXPECT_EQ(distance("abc 7"), 1.0);
  double d = 1.0;
  read_offset_distance(path("missing").c_str(), d);
  EXPECT_EQ(d, 1.0);
}

// Regression: infinite, NaN and negative values replaced the distance.
TEST_F(ParameterFiles, NonFiniteOrNonPositiveDistancesChangeNothing) {
  EXPECT_EQ(distance("0 inf"), 1.0);
  EXPECT_EQ(distance("0 nan"), 1.0);
  EXPECT_EQ(distance("1e60"), 1.0);  // beyond the float range: infinite
  EXPECT_EQ(distance("0 -5"), 1.0);
}

TEST_F(ParameterFiles, MergeRadiusFromTheThirdAndFourthPairs) {
  EXPECT_EQ(radius("0 0 0 0 0.8 3.0 0.6 7.0"), 1.0f);
  EXPECT_EQ(radius("1 1\n1 1\n0.8 3.0\n"), 10.0f);
  EXPECT_EQ(radius("0 0 0 0 0.1 0 2 0"), 2.0f);
  EXPECT_EQ(radius("0 0 0 0 0.3 0 0.2 0"), 0.6f);
  EXPECT_EQ(radius("0 0 0 0 x"), 10.0f);
  float r = 10.0f;
  EXPECT_EQ(read_merge_radius(path("missing").c_str(), r), -1);
}

// Regression: non-finite or non-positive values went into the radius.
TEST_F(ParameterFiles, NonFiniteOrNonPositiveRadiiChangeNothing) {
  EXPECT_EQ(radius("0 0 0 0 0 0 -3 0"), 10.0f);
  EXPECT_EQ(radius("0 0 0 0 0 0 nan 0"), 10.0f);
  EXPECT_EQ(radius("0 0 0 0 0 0 inf 0"), 10.0f);
  EXPECT_EQ(radius("0 0 0 0 nan 0 0.2 0"), 0.2f);
  EXPECT_EQ(radius("0 0 0 0 -1 0 0.2 0"), 0.2f);
}

}  // namespace
}  // namespace zt::testing
