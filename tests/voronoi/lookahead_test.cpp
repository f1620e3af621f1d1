// The point phase looks a few insertions ahead (draws, nearest-point
// searches, prefetch walks). None of that may change a diagram: on an input
// whose near-coincident pairs force a restart in the middle of the point
// phase, zonetool voronoi must print, byte for byte, the same diagram every
// time. The digest below was first taken from the engine that drew and
// searched one point at a time, when each pair cost a restart of its own
// (ten); it was retaken when the first restart came to mend every pair at
// once, and when large point sets went over to a partly sorted order (which
// renumbers the records; the diagram's geometry is checked against a random
// order in insertion_order_test.cpp). Underneath, the generator of a random
// order must give the sequence of a plain generator however its values are
// peeked at and given back.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"
#include "voronoi/detail/engine_state.hpp"

namespace {

std::uint64_t Fnv1a(const std::string& s) {
  std::uint64_t h = 0xcbf29ce484222325ull;
  for (const unsigned char c : s) h = (h ^ c) * 0x100000001b3ull;
  return h;
}

// 3000 pseudo-random points in the unit square, then every 300th point again
// 3e-13 to its right: closer than the engine's coincidence tolerance, so
// each pair is merged by a restart.
std::string RestartingInput() {
  std::uint64_t s = 12345;
  const auto next = [&s] {
    s = s * 6364136223846793005ull + 1442695040888963407ull;
    return static_cast<double>(s >> 11) * 0x1p-53;
  };
  std::vector<std::pair<double, double>> pts;
  for (int i = 0; i < 3000; ++i) {
    const double x = next();
    pts.emplace_back(x, next());
  }
  for (int i = 0; i < 3000; i += 300) pts.emplace_back(pts[i].first + 3e-13, pts[i].second);
  std::string text;
  char line[80];
  for (const auto& [x, y] : pts) {
    std::snprintf(line, sizeof line, "p %.17g %.17g\n", x, y);
    text += line;
  }
  return text;
}

TEST(PointLookahead, DiagramWithRestartsIsThatOfOneDrawAtATime) {
  const zt::test::ScratchDir dir;
  zt::test::write_text(dir.file("in.txt"), RestartingInput());
  const zt::test::CommandRun r =
      zt::test::run_command(zt::test::zonetool_path() + " voronoi " + dir.file("in.txt") + " 2>/dev/null");
  ASSERT_EQ(r.status, 0);
  ASSERT_NE(r.out.find("restarts 1 recovery 0\n"), std::string::npos) << r.out.substr(r.out.size() - 60);
  EXPECT_EQ(Fnv1a(r.out), 0xf2be7d938f806782ull);
}

// A random script of draws, peeks and give-backs against the plain
// sequence: pos values are consumed, `back` of them given back and not yet
// drawn again.
TEST(OrderRandom, PeeksAndGiveBacksKeepTheSequenceOfOneDrawAtATime) {
  std::mt19937 plain(0);
  std::vector<std::uint32_t> seq(20000);
  for (auto& v : seq) v = static_cast<std::uint32_t>(plain());
  zt::vd::OrderRandom r;
  r.seed(0);
  std::mt19937 script(7);
  std::size_t pos = 0;
  int back = 0;
  while (pos + zt::vd::OrderRandom::kMaxPeek < seq.size()) {
    const unsigned op = script() % 8;
    if (op < 5) {
      ASSERT_EQ(r(), seq[pos]) << "draw " << pos;
      ++pos;
      back = std::max(back - 1, 0);
    } else if (op < 7) {
      const int j = static_cast<int>(script() % zt::vd::OrderRandom::kMaxPeek);
      ASSERT_EQ(r.Peek(j), seq[pos + j]) << "peek " << j << " at " << pos;
    } else {
      const int k = std::min<int>(static_cast<int>(script() % 8), zt::vd::OrderRandom::kMaxGivenBack - back);
      for (int i = 0; i < k && pos > 0; ++i, ++back) r.GiveBack(seq[--pos]);
    }
  }
}

}  // namespace
