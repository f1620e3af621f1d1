// restzones on 1, 2 and 8 threads (RESTZONES_THREADS): the same temp1,
// temp2, stock2.bin and console, byte for byte, on the bundled example, on a
// generated part whose levels differ (levels without rest material, with too
// few records, with zones that the finishing region cuts away) and on one
// whose levels are all alike (each thread reuses the offsets it remembers
// for other levels than the one-thread run does). The one-thread run is
// made twice in the same directory (the second finds the first one's
// scratch files and result) with the same result; zones come from the top
// down.
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

RunFiles run_with(int threads, const std::function<void(const ProgramRun&)>& fill, int runs = 1) {
  ProgramRun r;
  fill(r);
  RunFiles first;
  for (int k = 0; k < runs; ++k) {
    EXPECT_EQ(r.run("export RESTZONES_THREADS=" + std::to_string(threads)), 0) << threads << " threads: " << r.err;
    EXPECT_FALSE(r.marker_left()) << r.out;
    if (k == 0) first = {r.bytes("temp1"), r.bytes("temp2"), r.bytes("stock2.bin"), r.out};
    EXPECT_EQ(r.bytes("stock2.bin"), first.result) << "run " << k + 1 << " in the same directory";
  }
  return first;
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

// The one-thread run's files and zones in `one` and `zones`.
void expect_same_for_every_thread_count(const std::function<void(const ProgramRun&)>& fill, std::size_t minLevels,
                                        RunFiles& one, std::vector<Contour>& zones) {
  one = run_with(1, fill, 2);
  ASSERT_TRUE(read_result(one.result, zones));
  std::set<float> levels;
  for (const Contour& c : zones) {
    EXPECT_TRUE(levels.empty() || c.z <= *levels.begin()) << "from the top down";
    levels.insert(c.z);
  }
  ASSERT_GE(levels.size(), minLevels);  // enough levels for the threads to share
  for (int threads : kThreadCounts) {
    const RunFiles other = run_with(threads, fill);
    EXPECT_EQ(other.temp1, one.temp1) << threads << " threads";
    EXPECT_EQ(other.temp2, one.temp2) << threads << " threads";
    EXPECT_EQ(other.result, one.result) << threads << " threads";
    EXPECT_EQ(other.console, one.console) << threads << " threads";  // the progress bar, level by level
  }
}

TEST(ThreadCount, ExampleIsTheSameOnEveryThreadCount) {
  RunFiles one;
  std::vector<Contour> zones;
  expect_same_for_every_thread_count(copy_example, 2, one, zones);
  ASSERT_FALSE(zones.empty());
  EXPECT_EQ(zones.front().z, -1.0f);
  EXPECT_EQ(zones.back().z, -20.0f);
  EXPECT_NE(one.console.find("Calcul des zones de reprise par niveau"), std::string::npos) << one.console;
}

TEST(ThreadCount, GeneratedPartsAreTheSameOnEveryThreadCount) {
  for (const bool alike : {false, true}) {
    SCOPED_TRACE(alike ? "levels alike" : "levels that differ");
    RunFiles one;
    std::vector<Contour> zones;
    expect_same_for_every_thread_count([alike](const ProgramRun& r) { fill_part(r, alike); },
                                       alike ? kPartLevels : kPartLevels - 1, one, zones);
  }
}

}  // namespace
}  // namespace zt::e2e
