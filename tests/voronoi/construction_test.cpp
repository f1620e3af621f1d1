// Construction of the diagram of points: the invariant checker after every
// insertion on random, clustered, lattice and collinear input, and the edge
// cases of a computation (single point, duplicates, restarts, scaling,
// reproducibility).
#include <gtest/gtest.h>

#include "vd_test_util.hpp"

namespace zt {
namespace {

using namespace vdtest;

void RunChecked(const std::vector<Pt>& pts, int every = 1) {
  Store(pts);
  CheckingObserver obs;
  obs.every = every;
  obs.Attach();
  ASSERT_TRUE(ComputePoints());
  EXPECT_EQ(obs.firstError, "");
  EXPECT_EQ(FinalCheck(), "");
}

TEST(PointDiagram, RandomPointsKeepInvariantsAfterEveryInsertion) {
  RunChecked(UniformPoints(2000, 1, 100.0));
}

TEST(PointDiagram, SmallRandomSets) {
  for (int n = 1; n <= 40; ++n) RunChecked(UniformPoints(n, 100 + n));
}

}  // namespace
}  // namespace zt
