// The whole zone builder on the real engines: the entry points from the
// first level to the written contours.
#include <gtest/gtest.h>

#include "zone/entry_points.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

struct Contour {
  float z;
  std::vector<Point2f> points;
};
std::vector<Contour> g_contours;

void keep_contour(const std::int32_t& n, const Point2f* p, const float& z, const std::int32_t&,
                  std::int32_t& ierr) {
  g_contours.push_back({z, std::vector<Point2f>(p, p + n)});
  ierr = 0;
}

class WholeRun : public ZoneTmpTest {
 protected:
  void SetUp() override {
    ZoneTmpTest::SetUp();
    g_contours.clear();
  }
  // The driver's calls, levels from the top down.
  std::int32_t run(const std::vector<float>& contourLevels,
                   const std::vector<std::pair<float, std::vector<Point2f>>>& stock) {
    std::int32_t ierr = -1;
    wf_init_czone(contourLevels.data(), static_cast<std::int32_t>(contourLevels.size()), ierr);
    if (ierr != 0) return ierr;
    for (const auto& [z, pts] : stock) {
      wf_add_level(z, pts.data(), static_cast<std::int32_t>(pts.size()), ierr);
      if (ierr != 0) return ierr;
    }
    std::vector<Point2f> buffer(16);
    ::testing::internal::CaptureStdout();
    wf_fin_czone(buffer, 5, ierr, keep_contour);
    ::testing::internal::GetCapturedStdout();
    return ierr;
  }
};

TEST_F(WholeRun, SquareOfRestMaterialInASquarePocket) {
  write_file("contour.bin", record_file({{0.0f, {rectangle(0, 0, 100, 100)}}}));
  write_file("grid.tmp", "0 0 0 0 0.1 0 2 0");
  ASSERT_EQ(run({0.0f}, {{0.0f, stock_points({rectangle(40, 40, 60, 60)})}}), 0);
  ASSERT_EQ(g_contours.size(), 1u);
  const auto& c = g_contours[0].points;
  EXPECT_EQ(g_contours[0].z, 0.0f);
  EXPECT_EQ(c.front().x, c.back().x);
  EXPECT_EQ(c.front().y, c.back().y);
  float x0 = 1e9f, y0 = 1e9f, x1 = -1e9f, y1 = -1e9f;
  for (const Point2f& p : c) {
    x0 = std::min(x0, p.x);
    y0 = std::min(y0, p.y);
    x1 = std::max(x1, p.x);
    y1 = std::max(y1, p.y);
  }
  EXPECT_NEAR(x0, 38.96, 0.01);
  EXPECT_NEAR(y0, 38.96, 0.01);
  EXPECT_NEAR(x1, 61.04, 0.01);
  EXPECT_NEAR(y1, 61.04, 0.01);
}

}  // namespace
}  // namespace zt::testing
