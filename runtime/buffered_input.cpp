// Buffered reading of a regular file with positional reads.
#include "runtime/buffered_input.hpp"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

namespace zt {

BufferedInput::~BufferedInput() { close(); }

BufferedInput::Open BufferedInput::open(const char* path) {
  close();
  error_ = 0;
  // Opening a FIFO without a writer would wait for one: never block here,
  // and refuse anything but a regular file before reading from it.
  const int fd = ::open(path, O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  if (fd < 0) {
    error_ = errno;
    return Open::kFailed;
  }
  struct stat st {};
  if (::fstat(fd, &st) != 0) {
    error_ = errno;
    ::close(fd);
    return Open::kFailed;
  }
  if (!S_ISREG(st.st_mode)) {
    ::close(fd);
    return Open::kNotRegular;
  }
  const int flags = ::fcntl(fd, F_GETFL);
  if (flags >= 0) ::fcntl(fd, F_SETFL, flags & ~O_NONBLOCK);
  if (!buffer_) buffer_ = std::make_unique<unsigned char[]>(kBufferBytes);
  fd_ = fd;
  size_ = static_cast<std::int64_t>(st.st_size);
  start_ = 0;
  next_ = end_ = 0;
  return Open::kOk;
}

int BufferedInput::close() {
  if (fd_ < 0) return 0;
  const int r = ::close(fd_);
  fd_ = -1;
  start_ = 0;
  next_ = end_ = 0;
  return r == 0 ? 0 : -1;
}

bool BufferedInput::refill() {
  if (fd_ < 0) return false;
  start_ += static_cast<std::int64_t>(end_);
  next_ = end_ = 0;
  for (;;) {
    const ssize_t n = ::pread(fd_, buffer_.get(), kBufferBytes, static_cast<off_t>(start_));
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) error_ = errno;
    if (n <= 0) return false;
    end_ = static_cast<std::size_t>(n);
    return true;
  }
}

std::size_t BufferedInput::read(void* destination, std::size_t n) {
  auto* out = static_cast<unsigned char*>(destination);
  std::size_t done = 0;
  while (done < n) {
    if (next_ == end_ && !refill()) break;
    const std::size_t take = std::min(n - done, end_ - next_);
    std::memcpy(out + done, buffer_.get() + next_, take);
    next_ += take;
    done += take;
  }
  return done;
}

bool BufferedInput::seek(std::int64_t offset) {
  if (fd_ < 0 || offset < 0) return false;
  // Inside the buffered window only the cursor moves.
  if (offset >= start_ && offset <= start_ + static_cast<std::int64_t>(end_)) {
    next_ = static_cast<std::size_t>(offset - start_);
    return true;
  }
  start_ = offset;
  next_ = end_ = 0;
  return true;
}

}  // namespace zt
