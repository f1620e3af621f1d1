// The worker threads: how many a run takes (RESTZONES_THREADS caps the
// hardware threads, a value that is not a whole number from 1 on leaves no
// cap, the work and a stand-in engine bound it), and the pool running every
// job once with its future ready at the end.
#include "zone/worker_pool.hpp"

#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <thread>

#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

struct ThreadsRow {
  const char* value;  // nullptr: unset
  std::int32_t items;
  std::int32_t cap;   // the expected count is min(cap, hardware threads, items); 0: no cap
};

constexpr ThreadsRow kThreadsRows[] = {
    {nullptr, 100, 0}, {"1", 100, 1}, {"2", 100, 2}, {"8", 100, 8},  {"3", 2, 3},
    {"0", 100, 0},     {"-2", 100, 0}, {"x", 100, 0}, {"2x", 100, 0}, {"", 100, 0},
    {"99999999999999999999", 100, 0}, {nullptr, 1, 0}, {"4", 0, 4},
};

TEST(ZoneThreadCount, EnvironmentCapsTheHardwareThreadsAndTheWork) {
  const std::int32_t hardware = std::max(1u, std::thread::hardware_concurrency());
  for (const ThreadsRow& row : kThreadsRows) {
    if (row.value) {
      setenv(kThreadsVariable, row.value, 1);
    } else {
      unsetenv(kThreadsVariable);
    }
    std::int32_t expected = row.cap > 0 ? std::min(row.cap, hardware) : hardware;
    expected = std::max(1, std::min(expected, row.items));
    EXPECT_EQ(zone_thread_count(row.items), expected) << (row.value ? row.value : "(unset)") << " items " << row.items;
  }
  unsetenv(kThreadsVariable);
}

TEST(ZoneThreadCount, AStandInEngineRunsOnOneThread) {
  BoxOffsetEngine engine;
  set_offset_engine(&engine);
  setenv(kThreadsVariable, "8", 1);
  EXPECT_EQ(zone_thread_count(100), 1);
  set_offset_engine(nullptr);
  unsetenv(kThreadsVariable);
}

TEST(WorkerPool, RunsEveryJobOnceOnItsWorkers) {
  constexpr int kJobs = 200;
  std::atomic<int> runs[kJobs] = {};
  std::vector<std::future<void>> done;
  {
    WorkerPool pool(3);
    ASSERT_EQ(pool.size(), 3);
    for (int i = 0; i < kJobs; ++i) done.push_back(pool.run([&runs, i] { runs[i].fetch_add(1); }));
    for (auto& f : done) f.wait();
  }
  for (int i = 0; i < kJobs; ++i) EXPECT_EQ(runs[i].load(), 1) << i;
}

}  // namespace
}  // namespace zt::testing
