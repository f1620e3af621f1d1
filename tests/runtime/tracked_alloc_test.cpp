// Tracked allocation: counters, kinds and their fatal texts (dynamic
// storage: data/storage.cases).
#include <cstring>
#include <string>

#include "runtime/path_expansion.hpp"
#include "runtime/tracked_alloc.hpp"
#include "runtime_fixture.hpp"

namespace zt {
namespace {

class TrackedAllocTest : public testing::RuntimeTest {};

TEST_F(TrackedAllocTest, CountersFollowKindsAndSerials) {
  const TrackedCounters before = tracked_counters();
  void* t = _Wmalloc(100);
  void* p = permanent_alloc(40);
  ASSERT_NE(t, nullptr);
  ASSERT_NE(p, nullptr);
  TrackedCounters now = tracked_counters();
  EXPECT_EQ(now.bytes_in_use - before.bytes_in_use, 140u);
  EXPECT_EQ(now.permanent_bytes - before.permanent_bytes, 40u);
  EXPECT_EQ(now.next_serial - before.next_serial, 2u);
  std::memset(p, 7, 40);
  p = _Wrealloc(kBlockPermanent, p, 4000);
  ASSERT_NE(p, nullptr);
  EXPECT_EQ(static_cast<unsigned char*>(p)[39], 7);
  now = tracked_counters();
  EXPECT_EQ(now.permanent_bytes - before.permanent_bytes, 4000u);
  EXPECT_EQ(now.next_serial - before.next_serial, 2u);  // a resize keeps the serial
  EXPECT_EQ(tracked_free(t), 0);
  EXPECT_EQ(tracked_free(p), 0);
  now = tracked_counters();
  EXPECT_EQ(now.bytes_in_use, before.bytes_in_use);
  EXPECT_EQ(now.permanent_bytes, before.permanent_bytes);
  EXPECT_TRUE(fatals.empty());
}

TEST_F(TrackedAllocTest, WrongFreesAndReallocsAreFatal) {
  void* t = _Wmalloc(8);
  const std::uint32_t serial = tracked_counters().next_serial - 1;
  EXPECT_EQ(_Wrealloc(kBlockPermanent, t, 16), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "Trying to reallocp temporary allocated memory#" + std::to_string(serial));
  void* p = permanent_alloc(8);
  EXPECT_EQ(_Wrealloc(kBlockTemporary, p, 16), nullptr);
  EXPECT_EQ(fatals.back().rfind("Trying to reallocp permanent allocated memory#", 0), 0u);
  ASSERT_EQ(tracked_free(t), 0);
  EXPECT_EQ(tracked_free(t), -1);
  EXPECT_EQ(fatals.back(), "Trying to free previously freed memory");
  EXPECT_EQ(_Wrealloc(kBlockTemporary, t, 4), nullptr);
  EXPECT_EQ(fatals.back(), "Trying to reallocp previously freed memory #0");
  int local = 0;
  EXPECT_EQ(tracked_free(&local), -1);
  EXPECT_EQ(fatals.back(), "Trying to free unallocated or corrupt memory");
  EXPECT_EQ(_Wrealloc(kBlockTemporary, &local, 4), nullptr);
  EXPECT_EQ(fatals.back(), "Trying to reallocp unallocated or corrupt memory #0");
  EXPECT_EQ(tracked_free(p), 0);
}

TEST_F(TrackedAllocTest, PermanentMaximumAndImpossibleSizes) {
  const std::uint64_t base = tracked_counters().permanent_bytes;
  set_permanent_maximum(base + 3000);
  void* small = permanent_alloc(1024);  // below 1025 bytes never refused
  ASSERT_NE(small, nullptr);
  EXPECT_EQ(permanent_alloc(4000), nullptr);
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], "_Wmalloc: allocating 4000 bytes would exceed maximum of " +
                             std::to_string(base + 3000));
  EXPECT_EQ(_Wrealloc(kBlockPermanent, small, 4000), nullptr);  // refused silently
  EXPECT_EQ(warnings.size(), 1u);
  set_permanent_maximum(4294967295ull);
  EXPECT_EQ(_Wmalloc(~std::uint64_t{0}), nullptr);
  EXPECT_EQ(warnings.back(), "_Wmalloc: unable to allocate 18446744073709551615 bytes");
  void* temporary = _Wmalloc(24);
  EXPECT_EQ(_Wrealloc(kBlockTemporary, temporary, ~std::uint64_t{0} - 8), nullptr);
  EXPECT_EQ(warnings.back().rfind("_Wrealloc: unable to increase size from 24 to ", 0), 0u);
  EXPECT_EQ(tracked_free(temporary), 0);  // the failed resize left it alone
  EXPECT_EQ(tracked_free(small), 0);
}

TEST_F(TrackedAllocTest, DefaultFatalEndsProcess) {
  EXPECT_EXIT(
      {
        set_fatal_handler(nullptr);
        int local = 0;
        tracked_free(&local);
      },
      ::testing::ExitedWithCode(255), "Trying to free unallocated or corrupt memory");
}

}  // namespace
}  // namespace zt
