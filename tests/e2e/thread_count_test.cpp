// restzones on 1, 2 and 8 threads (RESTZONES_THREADS): the same temp1,
// temp2, stock2.bin and console, byte for byte, on the bundled example, on a
// generated part whose levels differ (levels without rest material, with too
// few records, with zones that the finishing region cuts away) and on one
// whose levels are all alike (each thread reuses the offsets it remembers
// for other levels than the one-thread run does).
#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <set>

#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

constexpr int kThreadCounts[] = {1, 2, 8};
constexpr int kPartLevels = 14;
constexpr double kPi = 3.14159265358979323846;

struct RunFiles {
  Bytes temp1, temp2, result;
  std::string console;
};

RunFiles run_with(int threads, const std::function<void(const ProgramRun&)>& fill) {
  ProgramRun r;
  fill(r);
  const int status = r.run("export RESTZONES_THREADS=" + std::to_string(threads));
  EXPECT_EQ(status, 0) << threads << " threads: " << r.err;
  return {r.bytes("temp1"), r.bytes("temp2"), r.bytes("stock2.bin"), r.out};
}

// A pocket with a wavy wall on every level; per level some of: a band along
// the wall, a blob in the floor, a piece outside the pocket (its zones are
// cut away), nothing, or a contour of three records (too few to count).
void fill_part(const ProgramRun& r, bool alike) {
  std::vector<Contour> finishing, stock;
  for (int level = 0; level < kPartLevels; ++level) {
    const float z = -static_cast<float>(level);
    const int k = alike ? 3 : level;  // level 3 has a band and a blob
    Contour wall{z, {}}, band{z, {}}, blob{z, {}};
    for (int i = 0; i <= 360; ++i) {
      const double a = 2 * kPi * (i % 360) / 360, rw = 50 - 0.1 * k + 2 * std::sin(7 * a);
      wall.points.push_back({static_cast<float>(rw * std::cos(a)), static_cast<float>(rw * std::sin(a))});
    }
    finishing.push_back(wall);
    const int kind = (k * 7) % 5;
    if (kind == 0 || kind == 1) {  // a band on the wall's inner side, a quarter turn long
      for (int i = 0; i <= 90; ++i) band.points.push_back(wall.points[static_cast<std::size_t>(i + 45 * (k % 4))]);
      for (int i = 90; i >= 0; --i) {
        const Pt p = wall.points[static_cast<std::size_t>(i + 45 * (k % 4))];
        band.points.push_back({p.x * 0.97f, p.y * 0.97f});
      }
      band.points.push_back(band.points.front());
      stock.push_back(band);
    }
    if (kind == 1 || kind == 2) {
      for (int i = 0; i <= 40; ++i) {
        const double a = 2 * kPi * (i % 40) / 40, rb = 3 + 0.2 * k;
        blob.points.push_back({static_cast<float>(-10 + 2 * k + rb * std::cos(a)), static_cast<float>(5 + rb * std::sin(a))});
      }
      stock.push_back(blob);
    }
    if (kind == 3) stock.push_back({z, {{200, 200}, {210, 200}, {210, 210}, {200, 210}, {200, 200}}});
    if (kind == 4 && k % 2 == 0) stock.push_back({z, {{0, 0}, {1, 0}, {0, 0}}});
  }
  r.put("contour.bin", records(finishing));
  r.put("stock1.bin", records(stock));
  r.parameters();
}

void expect_same_for_every_thread_count(const std::function<void(const ProgramRun&)>& fill, std::size_t minLevels) {
  const RunFiles one = run_with(1, fill);
  std::vector<Contour> zones;
  ASSERT_TRUE(read_result(one.result, zones));
  std::set<float> levels;
  for (const Contour& c : zones) levels.insert(c.z);
  ASSERT_GE(levels.size(), minLevels);  // enough levels for the threads to share
  for (int threads : kThreadCounts) {
    const RunFiles other = run_with(threads, fill);
    EXPECT_EQ(other.temp1, one.temp1) << threads << " threads";
    EXPECT_EQ(other.temp2, one.temp2) << threads << " threads";
    EXPECT_EQ(other.result, one.result) << threads << " threads";
    EXPECT_EQ(other.console, one.console) << threads << " threads";  // the progress bar, level by level
  }
}

TEST(ThreadCount, ExampleIsTheSameOnEveryThreadCount) { expect_same_for_every_thread_count(copy_example, 2); }

TEST(ThreadCount, GeneratedPartIsTheSameOnEveryThreadCount) {
  expect_same_for_every_thread_count([](const ProgramRun& r) { fill_part(r, false); }, kPartLevels - 1);
}

TEST(ThreadCount, PartOfLevelsAlikeIsTheSameOnEveryThreadCount) {
  expect_same_for_every_thread_count([](const ProgramRun& r) { fill_part(r, true); }, kPartLevels);
}

}  // namespace
}  // namespace zt::e2e
