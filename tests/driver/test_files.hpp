// Helpers of the driver tests: a scratch directory per test and whole-file
// byte access.
#pragma once

#include <unistd.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "driver/record_stream.hpp"

namespace zt::test {

using Bytes = std::vector<std::uint8_t>;

class ScratchDir {
 public:
  ScratchDir() {
    std::string tmpl = (std::filesystem::temp_directory_path() / "zt_driver_XXXXXX").string();
    path_ = ::mkdtemp(tmpl.data());
  }
  ~ScratchDir() {
    std::error_code ec;
    std::filesystem::remove_all(path_, ec);
  }
  std::string file(const std::string& name) const { return (path_ / name).string(); }
  const std::filesystem::path& path() const { return path_; }

 private:
  std::filesystem::path path_;
};

inline Bytes read_bytes(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return Bytes(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

inline void write_bytes(const std::string& path, const Bytes& bytes) {
  std::ofstream out(path, std::ios::binary);
  out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
}

inline void write_text(const std::string& path, const std::string& text) {
  std::ofstream out(path, std::ios::binary);
  out << text;
}

// A record file of the given records, each written as segments.
inline Bytes record_file(const std::vector<Bytes>& records) {
  Bytes out{kRecordFileMarker};
  for (const Bytes& r : records) {
    std::size_t done = 0;
    do {
      const std::size_t rest = r.size() - done;
      const std::size_t n = rest > kSegmentBytes ? kSegmentBytes : rest;
      const auto mark = static_cast<std::uint8_t>(rest > kSegmentBytes ? kSegmentContinued : n);
      out.push_back(mark);
      out.insert(out.end(), r.begin() + static_cast<std::ptrdiff_t>(done),
                 r.begin() + static_cast<std::ptrdiff_t>(done + n));
      out.push_back(mark);
      done += n;
    } while (done < r.size());
  }
  out.push_back(kRecordEndMarker);
  return out;
}

// A point record of `size` bytes (12, 16 or 18) with x, y, z.
inline Bytes point(float x, float y, float z, std::size_t size = kPointRecordBytes) {
  const bool separator = x > 99998.0f;
  const PointRecord r = encode_point_record(x, y, z, separator ? kSeparatorCode : kPointCode, kPointFlag);
  return Bytes(r.begin(), r.begin() + static_cast<std::ptrdiff_t>(size));
}

inline Bytes separator(std::size_t size = kPointRecordBytes) {
  return point(kSeparatorValue, kSeparatorValue, kSeparatorValue, size);
}

}  // namespace zt::test
