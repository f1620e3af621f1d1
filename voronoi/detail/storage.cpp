// Allocation of the engine's arrays and its fatal-error path.
#include "voronoi/detail/storage.hpp"

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "voronoi/detail/engine_state.hpp"
#include "voronoi/detail/fatal.hpp"

namespace zt::vd {

void VdFatal(const char* message) {
  Vd().errorFlag = true;
  std::fprintf(stdout, "\nerror in %s\n", message);
  std::fflush(stdout);
  std::fprintf(stderr, "\nerror in %s\n", message);
  std::fflush(stderr);
  std::exit(kFatalExitStatus);
}

void* ReallocateArray(void* ptr, std::int64_t count, std::int64_t size) {
  const bool fresh = ptr == nullptr;
  void* block = nullptr;
  const std::int64_t bytes = count * size;
  if (count >= 0 && size > 0 && count <= INT32_MAX && bytes > 0) {
    block = fresh ? std::calloc(static_cast<std::size_t>(count), static_cast<std::size_t>(size))
                  : std::realloc(ptr, static_cast<std::size_t>(bytes));
  }
  if (!block) {
    std::fprintf(stderr, "ReallocateArray() - Cannot get %d elements of %d bytes...\n",
                 static_cast<int>(count), static_cast<int>(size));
    VdFatal(fresh ? "ReallocateArray() - memory allocation failed!\n"
                  : "ReallocateArray() - memory reallocation failed!\n");
  }
  return block;
}

void FreeArray(void*& ptr) {
  std::free(ptr);
  ptr = nullptr;
}

}  // namespace zt::vd
