// Diagrams of points and segments through the facade: the clean and the
// defective input of data/segment_diagrams.txt checked after every insertion
// and in full, and the orientation memory of the constructions.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

#include "support/case_rows.hpp"
#include "vd_test_util.hpp"
#include "voronoi/detail/segment_checks.hpp"

namespace zt::test {
namespace {

// A star-shaped simple polygon: sorted random angles, random radii.
Contour StarPolygon(int n, std::uint32_t seed, Pt centre = {0.5, 0.5}, double rmin = 0.2, double rmax = 0.45) {
  std::mt19937 rng(seed);
  // Jittered even angles: every gap stays below half a turn (n >= 4).
  std::uniform_real_distribution<double> ua(0.0, 0.8), ur(rmin, rmax);
  std::vector<double> ang(n);
  for (int i = 0; i < n; ++i) ang[i] = 2 * M_PI * (i + ua(rng)) / n;
  Contour c;
  for (int i = 0; i < n; ++i) {
    const double r = ur(rng);
    c.push_back({centre.x + r * std::cos(ang[i]), centre.y + r * std::sin(ang[i])});
  }
  return c;
}

// A random simple polygon: random points, crossings removed by 2-opt moves.
Contour RandomSimplePolygon(int n, std::uint32_t seed) {
  const auto o = [](Pt p, Pt q, Pt r) { return (q.x - p.x) * (r.y - p.y) - (q.y - p.y) * (r.x - p.x); };
  const auto cross = [&](Pt a, Pt b, Pt c, Pt d) { return o(a, b, c) * o(a, b, d) < 0 && o(c, d, a) * o(c, d, b) < 0; };
  std::mt19937 rng(seed);
  std::uniform_real_distribution<double> u(0.0, 1.0);
  Contour c(n);
  for (Pt& p : c) p = {u(rng), u(rng)};
  for (bool changed = true; changed;) {
    changed = false;
    for (int i = 0; i < n; ++i) {
      for (int j = i + 2; j < n; ++j) {
        if (i == 0 && j == n - 1) continue;
        if (cross(c[i], c[i + 1], c[j], c[(j + 1) % n])) {
          std::reverse(c.begin() + i + 1, c.begin() + j + 1);
          changed = true;
        }
      }
    }
  }
  return c;
}

// Stores the sites of a generator list (see data/segment_diagrams.txt): its
// contours first, then its loose points, open segments and links.
void StoreList(const std::string& list) {
  std::vector<Contour> contours;
  std::vector<std::pair<std::string, std::vector<double>>> extras;
  for (const std::string& part : Parts(list, ';')) {
    std::vector<std::string> w = Split(part);
    const bool reversed = w.at(0) == "rev";
    if (reversed) w.erase(w.begin());
    std::vector<double> a;
    for (std::size_t i = 1; i < w.size(); ++i) a.push_back(Num(w[i]));
    const auto arg = [&](std::size_t i, double fallback) { return i < a.size() ? a[i] : fallback; };
    Contour c;
    if (w[0] == "poly") {
      for (std::size_t i = 0; i + 1 < a.size(); i += 2) c.push_back({a[i], a[i + 1]});
    } else if (w[0] == "star") {
      c = StarPolygon(int(a.at(0)), std::uint32_t(a.at(1)), {arg(2, 0.5), arg(3, 0.5)}, arg(4, 0.2), arg(5, 0.45));
    } else if (w[0] == "burst") {
      for (int i = 0; i < int(a.at(0)); ++i) {
        const double angle = 2 * M_PI * i / int(a[0]), r = i % 2 ? a.at(2) : a.at(1);
        c.push_back({r * std::cos(angle), r * std::sin(angle)});
      }
    } else if (w[0] == "simple") {
      c = RandomSimplePolygon(int(a.at(0)), std::uint32_t(a.at(1)));
    } else if (w[0] == "circle") {
      for (int i = 0; i < int(a.at(0)); ++i) {
        const double angle = arg(4, 0.1) + 2 * M_PI * i / int(a[0]);
        c.push_back({a.at(1) + a.at(3) * std::cos(angle), a.at(2) + a.at(3) * std::sin(angle)});
      }
    } else if (w[0] == "staircase") {
      const double h = a.at(1) / int(a.at(0));
      c.push_back({0, 0});
      for (int i = 0; i < int(a[0]); ++i) {
        c.push_back({(i + 1) * h, i * h});
        c.push_back({(i + 1) * h, (i + 1) * h});
      }
      c.push_back({0, a[1]});
    } else if (w[0] == "dense") {
      const double size = a.at(1), at = arg(2, 0.0);
      for (int side = 0; side < 4; ++side) {
        for (int i = 0; i < int(a[0]); ++i) {
          const double t = size * i / int(a[0]);
          const Pt p = side == 0 ? Pt{t, 0} : side == 1 ? Pt{size, t} : side == 2 ? Pt{size - t, size} : Pt{0, size - t};
          c.push_back({p.x + at, p.y + at});
        }
      }
    } else {
      extras.emplace_back(w[0], a);
      continue;
    }
    if (reversed) std::reverse(c.begin(), c.end());
    contours.push_back(c);
  }
  StoreContours(contours);
  for (const auto& [kind, a] : extras) {
    if (kind == "points") {
      for (std::size_t i = 0; i + 1 < a.size(); i += 2) API_AddPoint(a[i], a[i + 1], 3);
    } else if (kind == "segment") {
      API_AddSegment(API_AddPoint(a.at(0), a.at(1), 0), API_AddPoint(a.at(2), a.at(3), 0), 0);
    } else if (kind == "link") {
      API_AddSegment(int(a.at(0)), int(a.at(1)), 0);
    } else {
      ADD_FAILURE() << "unknown sites " << kind;
    }
  }
}

class SegmentDiagrams : public CaseRows {};

TEST_P(SegmentDiagrams, AreSound) {
  const Keys k(row().field(1));
  StoreList(row().field(0));
  // The checker after every `every`-th insertion and in full, then the segment edges.
  const std::string error = CheckedCompute(false, int(k.num("every", 1)), k.num("brute", 1) != 0);
  EXPECT_EQ(error.empty() ? vd::CheckSegmentEdges() : error, "");
  const std::string restarts = k.has("restarts") ? k.str("restarts") : "0";
  EXPECT_TRUE(restarts == "any" || (restarts == "1+" ? VD_GetRestartCount() > 0 : VD_GetRestartCount() == 0))
      << VD_GetRestartCount();
  EXPECT_FALSE(VD_InRecoveryMode());
  EXPECT_TRUE(!k.has("segments") || vd::Vd().segments.count == k.num("segments")) << vd::Vd().segments.count;
}

INSTANTIATE_TEST_SUITE_P(Data, SegmentDiagrams, RowsOf("segment_diagrams.txt"), RowName);

// The orientation memory of the point-segment-segment construction is reset
// by every segment insertion: a memory left set by anything before gives
// the same diagram.
TEST(SegmentDiagram, OrientationMemoryDoesNotLeakIntoInsertions) {
  const std::string input = "star 60 3; rev circle 9 0.5 0.5 0.1";
  StoreList(input);
  ASSERT_TRUE(ComputeSegments());
  const std::vector<double> first = Snapshot();
  StoreList(input);
  vd::Vd().pssOrientByKeptNode = true;
  ASSERT_TRUE(ComputeSegments());
  EXPECT_FALSE(vd::Vd().pssOrientByKeptNode);
  EXPECT_EQ(Snapshot(), first);
}

}  // namespace
}  // namespace zt::test
