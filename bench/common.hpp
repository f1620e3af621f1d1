// Helpers shared by the benchmarks: the peak memory of one run, measured in
// a child process so that earlier runs and the benchmark's own caches do not
// count, a timed case that reports it, and a paired case that times ours and
// a peer in turn and reports their ratio.
#pragma once

#include <malloc.h>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

#include <benchmark/benchmark.h>

#include <algorithm>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

namespace zt::bench {

// A field of /proc/self/status in kB (0 when absent).
inline long status_kb(const char* field) {
  std::ifstream f("/proc/self/status");
  std::string line;
  const std::string key = std::string(field) + ":";
  while (std::getline(f, line))
    if (line.rfind(key, 0) == 0) return std::stol(line.substr(key.size()));
  return 0;
}

// Growth of the resident set's high-water mark (MB) over one call of `run`,
// in a fresh child process; `release` runs there first to drop memory the
// parent held (e.g. an engine's pools). -1 when the child could not report.
inline double peak_mb(const std::function<void()>& release, const std::function<void()>& run) {
  int fds[2];
  if (pipe(fds) != 0) return -1;
  const pid_t pid = fork();
  if (pid == 0) {
    close(fds[0]);
    release();
    malloc_trim(0);
    std::ofstream("/proc/self/clear_refs") << "5";  // restart the peak from here
    const long before = status_kb("VmRSS");
    run();
    const double mb = (status_kb("VmHWM") - before) / 1024.0;
    if (write(fds[1], &mb, sizeof mb) != sizeof mb) _exit(1);
    _exit(0);
  }
  close(fds[1]);
  double mb = -1;
  if (read(fds[0], &mb, sizeof mb) != sizeof mb) mb = -1;
  close(fds[0]);
  int status = 0;
  waitpid(pid, &status, 0);
  return mb;
}

// A timed case: `run` as many times as the benchmark asks, with the peak
// memory of one run (see peak_mb) as the counter peak_MB.
inline void timed_case(benchmark::State& state, const std::function<void()>& release,
                       const std::function<void()>& run) {
  state.counters["peak_MB"] = peak_mb(release, run);
  for (auto _ : state) run();
}

// Ours and the peer in turn on the same input, one pair per iteration, each
// from fresh memory (`release` runs after ours; the peer frees its own). On
// a shared machine whose speed drifts by tens of percent between runs, the
// two halves of a pair see the same machine, so the ratio within pairs is
// the figure to quote. Times are the thread's processor time. Counters:
// ours_ms and peer_ms (the best of each),
// ratio (best over best) and ratio_median (the median within pairs).
inline void paired_case(benchmark::State& state, const std::function<void()>& release,
                        const std::function<void()>& ours, const std::function<void()>& peer) {
  // Processor time of this thread: on a machine shared with other jobs the
  // wall clock also counts the time the thread waited for a core.
  const auto seconds = [](const std::function<void()>& run) {
    timespec t0{}, t1{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t0);
    run();
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t1);
    return double(t1.tv_sec - t0.tv_sec) + 1e-9 * double(t1.tv_nsec - t0.tv_nsec);
  };
  std::vector<double> a, b, within;
  for (auto _ : state) {
    a.push_back(seconds(ours));
    release();
    b.push_back(seconds(peer));
    within.push_back(a.back() / b.back());
  }
  if (within.empty()) return;
  std::sort(within.begin(), within.end());
  const double bestA = *std::min_element(a.begin(), a.end()), bestB = *std::min_element(b.begin(), b.end());
  state.counters["ours_ms"] = 1e3 * bestA;
  state.counters["peer_ms"] = 1e3 * bestB;
  state.counters["ratio"] = bestA / bestB;
  state.counters["ratio_median"] = within[within.size() / 2];
}

}  // namespace zt::bench
