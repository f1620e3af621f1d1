// The zone builder's worker threads: levels computed at once, each on a
// thread of its own with that thread's engines (the Voronoi engine, the
// Boolean engine and a working context are per thread).
//
// zone_thread_count says how many threads a run uses: every hardware thread,
// capped by the environment variable RESTZONES_THREADS (a whole number from
// 1 on; 1 keeps the one-thread path). A test's stand-in engine, being one
// object, forces one thread.
//
// A WorkerPool runs jobs first in, first out; each run() gives a future that
// is ready when its job has ended. Destroying the pool waits for the jobs
// under way and drops those not started.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <future>
#include <mutex>
#include <thread>
#include <vector>

namespace zt {

// The environment variable that caps the number of threads.
inline constexpr const char* kThreadsVariable = "RESTZONES_THREADS";

// Threads for `items` independent pieces of work (at least 1).
std::int32_t zone_thread_count(std::int32_t items);

class WorkerPool {
 public:
  // Starts up to `threads` workers (fewer when the system refuses some;
  // size() says how many run).
  explicit WorkerPool(std::int32_t threads);
  ~WorkerPool();
  WorkerPool(const WorkerPool&) = delete;
  WorkerPool& operator=(const WorkerPool&) = delete;

  std::int32_t size() const { return static_cast<std::int32_t>(threads_.size()); }
  std::future<void> run(std::function<void()> job);

 private:
  void work();

  std::mutex mutex_;
  std::condition_variable wake_;
  std::deque<std::packaged_task<void()>> queue_;
  bool stopping_ = false;
  std::vector<std::thread> threads_;
};

}  // namespace zt
