// Segmented record files: reading and writing the bytes of the layout.
#include "driver/record_stream.hpp"

#include <algorithm>
#include <bit>
#include <cassert>
#include <cerrno>
#include <cstring>
#include <sys/stat.h>

namespace zt {

namespace {

void put_u32(std::uint8_t* p, std::uint32_t v) {
  for (int i = 0; i < 4; ++i) p[i] = static_cast<std::uint8_t>(v >> (8 * i));
}

std::uint32_t get_u32(const std::uint8_t* p) {
  if constexpr (std::endian::native == std::endian::little) {
    std::uint32_t v;
    std::memcpy(&v, p, sizeof v);
    return v;
  }
  std::uint32_t v = 0;
  for (int i = 0; i < 4; ++i) v |= static_cast<std::uint32_t>(p[i]) << (8 * i);
  return v;
}

std::string system_text(int error) { return error != 0 ? std::strerror(error) : std::string(); }

RecordFault write_fault_kind(int error) {
  return (error == ENOSPC || error == EDQUOT) ? RecordFault::kDiskFull : RecordFault::kUnwritable;
}

}  // namespace

PointRecord encode_point_record(float x, float y, float z, std::int32_t code, std::int16_t flag) {
  PointRecord r{};
  put_u32(&r[0], std::bit_cast<std::uint32_t>(x));
  put_u32(&r[4], std::bit_cast<std::uint32_t>(y));
  put_u32(&r[8], std::bit_cast<std::uint32_t>(z));
  put_u32(&r[12], static_cast<std::uint32_t>(code));
  const auto f = static_cast<std::uint16_t>(flag);
  r[16] = static_cast<std::uint8_t>(f);
  r[17] = static_cast<std::uint8_t>(f >> 8);
  return r;
}

void decode_xyz(const std::uint8_t* bytes, float& x, float& y, float& z) {
  x = std::bit_cast<float>(get_u32(bytes));
  y = std::bit_cast<float>(get_u32(bytes + 4));
  z = std::bit_cast<float>(get_u32(bytes + 8));
}

// ---------------------------------------------------------------- reading

RecordReader::~RecordReader() { close(); }

void RecordReader::close() { input_.close(); }

ReadStatus RecordReader::fail(RecordFault f, std::int64_t record, std::string detail) {
  fault_ = {f, path_, record, std::move(detail)};
  return ReadStatus::kFault;
}

bool RecordReader::open(const std::string& path) {
  close();
  path_ = path;
  records_ = 0;
  ended_ = false;
  fault_ = {};
  switch (input_.open(path.c_str())) {
    case BufferedInput::Open::kOk: break;
    case BufferedInput::Open::kFailed:
      fail(RecordFault::kUnreadable, 0, system_text(input_.error()));
      return false;
    case BufferedInput::Open::kNotRegular:
      fail(RecordFault::kUnreadable, 0, "not a regular file");
      return false;
  }
  const int first = input_.get();
  if (first < 0) {
    const bool error = input_.failed();
    fail(error ? RecordFault::kUnreadable : RecordFault::kNotRecordFile, 0,
         error ? system_text(input_.error()) : "empty file");
    close();
    return false;
  }
  if (first != kRecordFileMarker) {
    fail(RecordFault::kNotRecordFile, 0, "first byte " + std::to_string(first));
    close();
    return false;
  }
  return true;
}

bool RecordReader::rewind() {
  assert(input_.is_open());
  records_ = 0;
  ended_ = false;
  input_.seek(1);
  return true;
}

ReadStatus RecordReader::read(std::span<std::uint8_t> head, std::size_t& length) {
  assert(input_.is_open());
  length = 0;
  if (ended_) return ReadStatus::kEnd;
  const std::int64_t record = records_ + 1;
  // Anything but the end marker, a long record, a record across the
  // buffer's end or a fault is taken in place.
  if (const std::uint8_t* p = read_in_place(length)) {
    if (length > 0) std::memcpy(head.data(), p, std::min(length, head.size()));
    return ReadStatus::kRecord;
  }
  // Reads n bytes, keeping those that still fit in head.
  std::uint8_t scratch[kSegmentBytes];
  auto read_data = [&](std::size_t n) -> bool {
    std::uint8_t* dst = scratch;
    if (length < head.size() && head.size() - length >= n) dst = head.data() + length;
    if (input_.read(dst, n) != n) return false;
    if (dst == scratch && length < head.size()) {
      std::memcpy(head.data() + length, scratch, head.size() - length);
    }
    length += n;
    return true;
  };
  auto cut_short = [&] {
    if (input_.failed()) return fail(RecordFault::kUnreadable, record, system_text(input_.error()));
    return fail(RecordFault::kDamaged, record, "file ends inside a record");
  };

  bool first_segment = true;
  for (;;) {
    const int lead = input_.get();
    if (lead < 0) {
      if (input_.failed()) return fail(RecordFault::kUnreadable, record, system_text(input_.error()));
      return fail(RecordFault::kDamaged, record,
                  first_segment ? "file ends without its end marker" : "file ends inside a record");
    }
    if (lead > kSegmentContinued) {
      if (!first_segment) return fail(RecordFault::kDamaged, record, "end marker inside a record");
      // Only the end marker, as the file's last byte, ends the file: any other
      // length byte, or bytes after the marker, mean records would be lost.
      if (lead != kRecordEndMarker) {
        return fail(RecordFault::kDamaged, record, "length byte " + std::to_string(lead) + " where a record starts");
      }
      if (input_.get() >= 0) return fail(RecordFault::kDamaged, record, "end marker before the end of the file");
      if (input_.failed()) return fail(RecordFault::kUnreadable, record, system_text(input_.error()));
      ended_ = true;
      return ReadStatus::kEnd;
    }
    first_segment = false;
    const std::size_t n = lead == kSegmentContinued ? kSegmentBytes : static_cast<std::size_t>(lead);
    if (!read_data(n)) return cut_short();
    const int trail = input_.get();
    if (trail < 0) return cut_short();
    if (trail != lead) {
      return fail(RecordFault::kDamaged, record,
                  "segment lengths " + std::to_string(lead) + " and " + std::to_string(trail) + " disagree");
    }
    if (lead != kSegmentContinued) break;
  }
  records_ = record;
  return ReadStatus::kRecord;
}

// ---------------------------------------------------------------- writing

RecordWriter::~RecordWriter() {
  if (file_ != nullptr) std::fclose(file_);
}

bool RecordWriter::fail(std::int64_t record, int error) {
  fault_ = {write_fault_kind(error), path_, record, system_text(error)};
  if (file_ != nullptr) std::fclose(file_);
  file_ = nullptr;
  return false;
}

bool RecordWriter::create(const std::string& path) {
  if (file_ != nullptr) std::fclose(file_);
  path_ = path;
  records_ = 0;
  fault_ = {};
  errno = 0;
  file_ = std::fopen(path.c_str(), "wb");
  if (file_ == nullptr) return fail(0, errno);
  struct stat st {};
  regular_ = ::fstat(::fileno(file_), &st) == 0 && S_ISREG(st.st_mode);
  incomplete_ = true;
  if (std::fputc(kRecordFileMarker, file_) == EOF) return fail(0, errno);
  return true;
}

bool RecordWriter::write(std::span<const std::uint8_t> data) {
  assert(file_ != nullptr);
  const std::int64_t record = records_ + 1;
  std::size_t done = 0;
  do {
    const std::size_t rest = data.size() - done;
    const std::size_t n = rest > kSegmentBytes ? kSegmentBytes : rest;
    const auto mark = static_cast<std::uint8_t>(rest > kSegmentBytes ? kSegmentContinued : n);
    errno = 0;
    if (std::fputc(mark, file_) == EOF) return fail(record, errno);
    if (n > 0 && std::fwrite(data.data() + done, 1, n, file_) != n) return fail(record, errno);
    if (std::fputc(mark, file_) == EOF) return fail(record, errno);
    done += n;
  } while (done < data.size());
  records_ = record;
  return true;
}

bool RecordWriter::close() {
  if (file_ == nullptr) return fault_.fault == RecordFault::kNone;
  errno = 0;
  if (std::fputc(kRecordEndMarker, file_) == EOF) return fail(records_, errno);
  if (std::fflush(file_) != 0) return fail(records_, errno);
  std::FILE* f = file_;
  file_ = nullptr;
  if (std::fclose(f) != 0) {
    fault_ = {write_fault_kind(errno), path_, records_, system_text(errno)};
    return false;
  }
  incomplete_ = false;
  return true;
}

void RecordWriter::abandon() {
  if (file_ != nullptr) std::fclose(file_);
  file_ = nullptr;
  if (incomplete_ && regular_) std::remove(path_.c_str());
  incomplete_ = false;
}

}  // namespace zt
