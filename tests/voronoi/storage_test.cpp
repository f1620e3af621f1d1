// Record arrays large enough for huge pages: growth keeps every record;
// prefetch hints never touch what is not there. (Peak memory of the growth
// is measured by the benchmarks, not here.)
#include <gtest/gtest.h>

#include "voronoi/detail/records.hpp"
#include "voronoi/detail/storage.hpp"

namespace zt::vd {
namespace {

TEST(Storage, LargeArraysKeepTheirRecordsThroughGrowth) {
  RecordArray<EdgeRecord> a;
  const std::int32_t n = 300000;  // 14.4 MB: advised for huge pages
  a.Reserve(n);
  for (std::int32_t i = 0; i < n; ++i) {
    EdgeRecord r{};
    r.n1 = i;
    r.spare = ~i;
    a.Append(r, 65536);
  }
  for (int round = 0; round < 3; ++round) {
    for (std::int32_t i = 0; i < 65536; ++i) a.Append(EdgeRecord{}, 65536);
  }
  for (std::int32_t i = 0; i < n; ++i) {
    ASSERT_EQ(a[i].n1, i);
    ASSERT_EQ(a[i].spare, ~i);
  }
  a.Free();
}

TEST(Storage, PrefetchOutsideTheArrayIsIgnored) {
  RecordArray<NodeRecord> a;
  a.Prefetch(0);  // no storage at all
  a.Reserve(4);
  a.Prefetch(-1);
  a.Prefetch(4);
  a.Prefetch(3);
  a.Free();
  SUCCEED();
}

}  // namespace
}  // namespace zt::vd
