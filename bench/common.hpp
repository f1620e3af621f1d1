// Helpers shared by the benchmarks: the peak memory of one run, measured in
// a child process so that earlier runs and the benchmark's own caches do not
// count, and a timed case that reports it.
#pragma once

#include <malloc.h>
#include <sys/wait.h>
#include <unistd.h>

#include <benchmark/benchmark.h>

#include <fstream>
#include <functional>
#include <string>

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

}  // namespace zt::bench
