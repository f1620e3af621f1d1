// Reading a regular file through one large buffer.
//
// The record readers take their files a few bytes at a time; this class
// turns that into one system call per kBufferBytes, positions by arithmetic
// (no system call to tell or to seek, and none to seek within the buffered
// window), and never blocks on opening: a name that is not a regular file
// (a FIFO, a device, a socket, a directory) is refused before anything is
// read from it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

namespace zt {

class BufferedInput {
 public:
  // Bytes fetched by one read of the file.
  static constexpr std::size_t kBufferBytes = 64 * 1024;

  enum class Open { kOk, kFailed, kNotRegular };

  BufferedInput() = default;
  BufferedInput(const BufferedInput&) = delete;
  BufferedInput& operator=(const BufferedInput&) = delete;
  ~BufferedInput();

  // Opens for reading at offset 0 (a file already open is closed first).
  // kFailed: error() has the system's code.
  Open open(const char* path);
  // 0, or -1 when the system reported an error on closing; 0 when none is open.
  int close();
  bool is_open() const { return fd_ >= 0; }

  // Copies up to n bytes; fewer only at the end of the file or on an error
  // (failed() tells which). The position moves past what was copied.
  std::size_t read(void* destination, std::size_t n);
  // The next n bytes where the buffer holds them already, else null (the
  // caller then takes them with read()); the position stays until skip().
  // The records are a few bytes each: handing them out in place saves the
  // copies and the calls of read() on nearly every record.
  const unsigned char* peek(std::size_t n) const {
    return end_ - next_ >= n ? buffer_.get() + next_ : nullptr;
  }
  // Moves past n bytes that peek(n) granted.
  void skip(std::size_t n) { next_ += n; }
  // The next byte, or -1 at the end of the file or on an error.
  int get() {
    if (next_ < end_) return buffer_[next_++];
    return refill() ? buffer_[next_++] : -1;
  }

  // Moves to a byte offset from the start; false for a negative offset or
  // with no file open. Offsets past the end are allowed (reads then end).
  bool seek(std::int64_t offset);
  std::int64_t tell() const { return start_ + static_cast<std::int64_t>(next_); }
  // The file's size when it was opened.
  std::int64_t size() const { return size_; }
  bool failed() const { return error_ != 0; }
  int error() const { return error_; }

 private:
  bool refill();

  int fd_ = -1;
  std::unique_ptr<unsigned char[]> buffer_;
  std::int64_t start_ = 0;  // file offset of buffer_[0]
  std::size_t next_ = 0;    // next byte to hand out
  std::size_t end_ = 0;     // bytes valid in the buffer
  std::int64_t size_ = 0;
  int error_ = 0;
};

}  // namespace zt
