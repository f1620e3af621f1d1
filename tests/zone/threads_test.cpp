// The worker threads: how many a run takes (RESTZONES_THREADS caps the
// hardware threads, a value that is not a whole number from 1 on leaves no
// cap, the work and a stand-in engine bound it), the pool running every job
// once. Faults in a run on several threads end it as a one-thread run ends:
// two threads reporting fatal errors at once give one report and its status;
// a level whose reading faults, read ahead while earlier levels are
// computed, ends the run only once those levels are done, and not at all
// when one of them fails first. Each on 1, 2 and 8 threads.
#include "zone/worker_pool.hpp"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <latch>
#include <string>
#include <thread>
#include <vector>

#include "voronoi/detail/fatal.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

constexpr int kThreadCounts[] = {1, 2, 8};

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
    row.value ? setenv(kThreadsVariable, row.value, 1) : unsetenv(kThreadsVariable);
    std::int32_t expected = row.cap > 0 ? std::min(row.cap, hardware) : hardware;
    expected = std::max(1, std::min(expected, row.items));
    EXPECT_EQ(zone_thread_count(row.items), expected) << (row.value ? row.value : "(unset)") << " items " << row.items;
  }
  // A stand-in engine runs on one thread.
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

int occurrences(const std::string& text, const std::string& what) {
  int n = 0;
  for (std::size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++n;
  return n;
}

// `threads` threads report fatal errors at once, the array's and the
// Voronoi engine's in turn, in a child process: its output and status.
std::pair<std::string, int> race_fatal_reports(int threads) {
  int fds[2];
  if (::pipe(fds) != 0) return {"", -1};
  const pid_t pid = ::fork();
  if (pid == 0) {
    ::dup2(fds[1], 1), ::dup2(fds[1], 2), ::close(fds[0]);
    std::latch start(threads);
    std::vector<std::thread> racers;
    for (int i = 0; i < threads; ++i) {
      racers.emplace_back([&start, i] {
        start.arrive_and_wait();
        if (i % 2 == 0) FatalError("race", i, "array report");
        vd::VdFatal("engine report");
      });
    }
    for (std::thread& t : racers) t.join();
    std::_Exit(99);  // never reached: a report ends the process
  }
  ::close(fds[1]);
  std::string out;
  char buf[4096];
  for (ssize_t n; (n = ::read(fds[0], buf, sizeof buf)) > 0;) out.append(buf, static_cast<std::size_t>(n));
  ::close(fds[0]);
  int status = 0;
  ::waitpid(pid, &status, 0);
  return {out, WIFEXITED(status) ? WEXITSTATUS(status) : -1};
}

TEST(ThreadFaults, FirstFatalReportWinsOnEveryThreadCount) {
  for (int threads : kThreadCounts) {
    for (int round = 0; round < 20; ++round) {
      const auto [out, status] = race_fatal_reports(threads);
      SCOPED_TRACE(std::to_string(threads) + " threads: " + out);
      const int arrays = occurrences(out, "*** ERROR : array report");
      const int engines = occurrences(out, "error in engine report");  // on standard output and error
      if (status == 1) {
        EXPECT_EQ(arrays, 1);
        EXPECT_EQ(engines, 0);
      } else {
        EXPECT_EQ(status, vd::kFatalExitStatus);
        EXPECT_EQ(arrays, 0);
        EXPECT_EQ(engines, 2);
      }
    }
  }
}

// Stock levels from a script: "ok" levels give a square of rest material,
// "fault" levels fault; what the zone builder called back is recorded.
struct ScriptedLevels final : LevelSource {
  std::vector<std::pair<float, bool>> levels;  // z, faults
  std::vector<std::int32_t> done_levels, faulted_levels;
  std::int32_t count() const override { return static_cast<std::int32_t>(levels.size()); }
  LevelRead read(std::int32_t i, float& z, std::vector<Point2f>& points) override {
    const auto& [level, faults] = levels[static_cast<std::size_t>(i - 1)];
    z = level;
    if (faults) return LevelRead::kFault;
    points = stock_points({rectangle(40, 40, 60, 60)});
    return LevelRead::kPoints;
  }
  void done(std::int32_t i) override { done_levels.push_back(i); }
  void fault(std::int32_t i) override { faulted_levels.push_back(i); }
};

struct ReadAheadCase {
  const char* name;
  std::vector<float> rangeLevels;                // of wf_init_czone
  std::vector<std::pair<float, bool>> levels;    // the stock levels
  std::vector<std::int32_t> done, faulted;
};

class ReadAhead : public ZoneTmpTest {};

TEST_F(ReadAhead, AFaultReadAheadEndsTheRunAsInALevelByLevelRun) {
  const auto square = rectangle(0, 0, 100, 100);
  write_file("contour.bin", record_file({{10.0f, {square}}, {5.0f, {square}}, {0.0f, {square}}}));
  const ReadAheadCase cases[] = {
      // Level 2 has no range to go to and fails: level 3's fault never shows.
      {"FailedLevelBeforeTheFault", {10}, {{10, false}, {5, false}, {0, true}, {0, false}}, {1}, {}},
      {"FaultAfterGoodLevels", {10, 5, 0}, {{10, false}, {5, false}, {0, true}}, {1, 2}, {3}},
      {"FaultFirst", {10, 5, 0}, {{10, true}, {5, false}}, {}, {1}},
  };
  for (const ReadAheadCase& c : cases) {
    for (int threads : kThreadCounts) {
      SCOPED_TRACE(std::string(c.name) + ", " + std::to_string(threads) + " threads");
      ::setenv(kThreadsVariable, std::to_string(threads).c_str(), 1);
      reset_zone_builder();
      std::int32_t ierr = 99;
      wf_init_czone(c.rangeLevels.data(), static_cast<std::int32_t>(c.rangeLevels.size()), ierr);
      ASSERT_EQ(ierr, 0);
      ScriptedLevels source;
      source.levels = c.levels;
      wf_add_levels(source, ierr);
      EXPECT_EQ(ierr, -1);
      EXPECT_EQ(source.done_levels, c.done);
      EXPECT_EQ(source.faulted_levels, c.faulted);
    }
  }
  ::unsetenv(kThreadsVariable);
}

}  // namespace
}  // namespace zt::testing
