// Array<T>: growth rules, self-insertion, and the fatal report's exact bytes.
#include <gtest/gtest.h>

#include <cstdint>
#include <functional>

#include "core/points.hpp"

using zt::Array;
using zt::TaggedPoint;

TEST(Array, GrowthRules) {
  Array<int> a(0, 0);
  EXPECT_EQ(a.growBy(), 100);
  EXPECT_EQ(a.capacity(), 0);
  EXPECT_EQ(a.data(), nullptr);
  a.Add(7);
  EXPECT_EQ(a.capacity(), 100);
  EXPECT_EQ(a.count(), 1);

  Array<int> d;
  int expected[] = {1, 2, 4, 4, 8, 8, 8, 8, 16};
  for (int i = 0; i < 9; ++i) {
    d.AddDoubling(i);
    EXPECT_EQ(d.capacity(), expected[i]) << i;
  }
  for (int i = 0; i < 9; ++i) EXPECT_EQ(d.At(i), i);

  d.SetCapacity(3);
  EXPECT_EQ(d.capacity(), 16);
  d.SetCapacity(40);
  EXPECT_EQ(d.capacity(), 40);
  EXPECT_EQ(d.count(), 9);
  EXPECT_EQ(d.At(8), 8);
  d.Clear();
  EXPECT_EQ(d.capacity(), 40);
}

TEST(Array, AddOwnElementWhenFull) {
  Array<TaggedPoint> a(2, 1);
  a.Add({1, 1.5, 2.5});
  a.Add({2, 3.5, 4.5});
  a.Add(a.At(1));  // full: the value lives in the storage being replaced
  ASSERT_EQ(a.count(), 3);
  EXPECT_EQ(a.At(2).tag, 2);
  EXPECT_EQ(a.At(2).x, 3.5);
  EXPECT_EQ(a.At(2).y, 4.5);
  Array<TaggedPoint> b;
  b.AddDoubling({5, 6, 7});
  b.AddDoubling(b.At(0));
  EXPECT_EQ(b.At(1).tag, 5);
  EXPECT_EQ(b.At(1).y, 7);
}

TEST(Array, DefaultElements) {
  Array<TaggedPoint> a(3, 1);
  EXPECT_EQ(a.data()[2].tag, -1);
  EXPECT_EQ(zt::TaggedPoint::separator().tag, zt::kSeparatorTag);
}

static std::string report(const char* msg, int line) {
  return std::string("\n\a*************************************\n*** ERROR : ") + msg +
         "\n*** FILE  : array_impl\n*** LINE  : " + std::to_string(line) +
         "\n*************************************\n\n";
}

// The report goes to standard output: the child that runs `body` and must
// end with status 1 writes it into a temporary file, returned as text.
static std::string stdout_of_exit_1(const std::function<void()>& body) {
  FILE* f = std::tmpfile();
  if (!f) return "no temporary file";
  const int fd = fileno(f);
  EXPECT_EXIT(
      {
        std::fflush(stdout);
        dup2(fd, 1);
        body();
      },
      testing::ExitedWithCode(1), "");
  std::rewind(f);
  std::string got;
  char buf[256];
  for (size_t n; (n = std::fread(buf, 1, sizeof buf, f)) > 0;) got.append(buf, n);
  std::fclose(f);
  return got;
}

TEST(ArrayDeathTest, InvalidIndexReportBytesOnStdout) {
  for (const int i : {0, 1, -1}) {
    SCOPED_TRACE(i);
    EXPECT_EQ(stdout_of_exit_1([i] {
                Array<int> a;
                if (i != 0) a.Add(1);  // one element, or none for index 0
                (void)a.At(i);
              }),
              report("Invalid Array Index", 59));
  }
}

TEST(ArrayDeathTest, CapacityBeyond32BitsIsAllocationFailure) {
  EXPECT_EQ(stdout_of_exit_1([] {
              Array<char> a(0, 0x7fffffff);
              a.Add('x');  // capacity 0x7fffffff: allocated lazily below only if it fits
              a.SetCount(a.capacity());
              a.Add('y');  // would need 2^32 - 2 elements
            }),
            report("Memory Allocation Failure", 105));
}
