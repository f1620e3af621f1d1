// One instance of an engine's state per thread.
//
// PerThread<T>::mine() gives the calling thread its own T, created on the
// thread's first call. When a thread ends, its instance goes to a shelf and
// the next new thread takes it over instead of creating one: the instance
// keeps its storage (a worker started for the next run finds it warm), none
// is ever lost (a leak checker sees every one reachable), and at most as many
// exist as threads ever ran at once. A T must therefore leave no result of
// one computation that the next depends on; the engines reset what a
// computation reads at its start.
#pragma once

#include <mutex>
#include <vector>

namespace zt {

template <typename T>
class PerThread {
 public:
  static T& mine() {
    thread_local Holder holder;
    return *holder.instance;
  }

 private:
  struct Shelf {
    std::mutex mutex;
    std::vector<T*> free;
  };
  static Shelf& shelf() {
    static Shelf* const s = new Shelf;  // never destroyed: threads may end after static destructors ran
    return *s;
  }
  struct Holder {
    T* instance;
    Holder() {
      Shelf& s = shelf();
      std::lock_guard<std::mutex> lock(s.mutex);
      if (s.free.empty()) {
        instance = new T;
      } else {
        instance = s.free.back();
        s.free.pop_back();
      }
    }
    ~Holder() {
      Shelf& s = shelf();
      std::lock_guard<std::mutex> lock(s.mutex);
      s.free.push_back(instance);
    }
    Holder(const Holder&) = delete;
    Holder& operator=(const Holder&) = delete;
  };
};

}  // namespace zt
