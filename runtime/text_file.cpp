// Opening a text file for reading, refusing what is not a regular file.
#include "runtime/text_file.hpp"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace zt {

std::FILE* open_regular_for_reading(const char* path) {
  // Opened without blocking so that a FIFO does not wait for a writer
  // before it can be told apart; reads then block as usual.
  const int fd = ::open(path, O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  if (fd < 0) return nullptr;
  struct stat st {};
  if (::fstat(fd, &st) != 0 || !S_ISREG(st.st_mode)) {
    ::close(fd);
    return nullptr;
  }
  const int flags = ::fcntl(fd, F_GETFL);
  if (flags >= 0) ::fcntl(fd, F_SETFL, flags & ~O_NONBLOCK);
  std::FILE* f = ::fdopen(fd, "r");
  if (f == nullptr) ::close(fd);
  return f;
}

}  // namespace zt
