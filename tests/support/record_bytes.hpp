// Segmented record files built byte by byte, independently of the readers
// and writers under test: "K", each record as segments of at most 128 bytes
// between two equal length bytes (129: another segment follows), then 0x82.
#pragma once

#include <cstddef>
#include <vector>

namespace zt::test {

template <class Bytes>  // std::string or a vector of bytes
Bytes segmented_record_file(const std::vector<Bytes>& records) {
  using Byte = typename Bytes::value_type;
  Bytes out(1, static_cast<Byte>('K'));
  for (const Bytes& r : records) {
    std::size_t done = 0;
    do {
      const std::size_t rest = r.size() - done, n = rest > 128 ? 128 : rest;
      const auto mark = static_cast<Byte>(rest > 128 ? 129 : n);
      out.push_back(mark);
      out.insert(out.end(), r.begin() + static_cast<std::ptrdiff_t>(done),
                 r.begin() + static_cast<std::ptrdiff_t>(done + n));
      out.push_back(mark);
      done += n;
    } while (done < r.size());
  }
  out.push_back(static_cast<Byte>(0x82));
  return out;
}

}  // namespace zt::test
