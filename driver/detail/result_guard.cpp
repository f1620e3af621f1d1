// Removal of a half-written result at process exit.
#include "driver/detail/result_guard.hpp"

#include <cstdio>
#include <cstdlib>

namespace zt::detail {

namespace {

std::string& pending() {
  // Never destroyed: the exit handler may run after static destructors.
  static std::string* path = new std::string;
  return *path;
}

void discard_pending() {
  if (!pending().empty()) std::remove(pending().c_str());
}

}  // namespace

void guard_result(const std::string& path) {
  static const bool registered = std::atexit(discard_pending) == 0;
  (void)registered;
  pending() = path;
}

void release_result() { pending().clear(); }

}  // namespace zt::detail
