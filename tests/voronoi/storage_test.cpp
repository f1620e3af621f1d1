// Record arrays large enough for huge pages: growth keeps every record and
// stays a remap in place of a copy; prefetch hints never touch what is not
// there.
#include <gtest/gtest.h>

#include <fstream>
#include <string>

#include "voronoi/detail/records.hpp"
#include "voronoi/detail/storage.hpp"

namespace zt::vd {
namespace {

#if !defined(__SANITIZE_ADDRESS__)
// Peak resident memory of this process, in kB (0 when unknown).
long PeakKb() {
  std::ifstream f("/proc/self/status");
  std::string line;
  while (std::getline(f, line))
    if (line.rfind("VmHWM:", 0) == 0) return std::stol(line.substr(6));
  return 0;
}
#endif

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
#if !defined(__SANITIZE_ADDRESS__)
  const long before = PeakKb();
#endif
  for (int round = 0; round < 3; ++round) {
    for (std::int32_t i = 0; i < 65536; ++i) a.Append(EdgeRecord{}, 65536);
  }
  // Growth by remapping adds only the new records to the peak; a copy would
  // hold old and new block at once (another 14 MB and more).
  // (The address sanitizer's allocator always copies.)
#if !defined(__SANITIZE_ADDRESS__)
  const long grown = PeakKb() - before;
  if (before > 0) {
    EXPECT_LT(grown, 14000) << "growth copied the array";
  }
#endif
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
