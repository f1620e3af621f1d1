// zone_thread_count and the worker pool.
#include "zone/worker_pool.hpp"

#include <cerrno>
#include <cstdlib>
#include <system_error>

#include "zone/offset_engine.hpp"

namespace zt {

std::int32_t zone_thread_count(std::int32_t items) {
  // A stand-in engine is one object that every thread would share.
  OffsetEngine* standIn = set_offset_engine(nullptr);
  set_offset_engine(standIn);
  if (standIn != nullptr) return 1;
  std::int64_t n = static_cast<std::int64_t>(std::thread::hardware_concurrency());
  if (const char* cap = std::getenv(kThreadsVariable)) {
    char* end = nullptr;
    errno = 0;
    const long long v = std::strtoll(cap, &end, 10);
    // A value that is not a whole number from 1 on leaves no cap.
    if (errno == 0 && end != cap && *end == '\0' && v >= 1 && (n < 1 || v < n)) n = v;
  }
  if (n > items) n = items;
  return n < 1 ? 1 : static_cast<std::int32_t>(n);
}

WorkerPool::WorkerPool(std::int32_t threads) {
  for (std::int32_t i = 0; i < threads; ++i) {
    try {
      threads_.emplace_back([this] { work(); });
    } catch (const std::system_error&) {
      break;  // run with the workers there are
    }
  }
}

WorkerPool::~WorkerPool() {
  {
    std::lock_guard<std::mutex> lock(mutex_);
    stopping_ = true;
    queue_.clear();
  }
  wake_.notify_all();
  for (std::thread& t : threads_) t.join();
}

std::future<void> WorkerPool::run(std::function<void()> job) {
  std::packaged_task<void()> task(std::move(job));
  std::future<void> done = task.get_future();
  {
    std::lock_guard<std::mutex> lock(mutex_);
    queue_.push_back(std::move(task));
  }
  wake_.notify_one();
  return done;
}

void WorkerPool::work() {
  for (;;) {
    std::packaged_task<void()> task;
    {
      std::unique_lock<std::mutex> lock(mutex_);
      wake_.wait(lock, [this] { return stopping_ || !queue_.empty(); });
      if (stopping_) return;
      task = std::move(queue_.front());
      queue_.pop_front();
    }
    task();
  }
}

}  // namespace zt
