// Segmented record files, byte by byte.
//
// Layout: the byte 75 ("K"), the records, the byte 130. A record is one or
// more segments: a length byte L, min(L, 128) data bytes, L again. L = 129
// means 128 bytes and the record goes on in the next segment; L in 0..128
// ends the record with L bytes. The end marker 130 where a record starts ends
// the file, and must be its last byte; any other length byte above 129 there
// is damage, never a quiet end. Every multi-byte value inside a record is
// little-endian.
//
// RecordReader and RecordWriter work on plain (already expanded) paths and
// report every fault through a RecordFaultInfo instead of stopping; the
// logical units above them decide to stop. The reader takes only regular
// files (anything else is refused without blocking) and reads through one
// buffer: no system call per record.
#pragma once

#include <array>
#include <cstdint>
#include <cstdio>
#include <span>
#include <string>

#include "driver/record_fault.hpp"
#include "runtime/buffered_input.hpp"

namespace zt {

inline constexpr std::uint8_t kRecordFileMarker = 75;   // "K"
inline constexpr std::uint8_t kRecordEndMarker = 130;
inline constexpr std::uint8_t kSegmentContinued = 129;
inline constexpr std::size_t kSegmentBytes = 128;

// Point records as this system writes them: x, y, z (f32), code (i32), flag (i16).
inline constexpr std::size_t kPointRecordBytes = 18;
inline constexpr std::size_t kPointXyzBytes = 12;
inline constexpr float kSeparatorValue = 99999.0f;
inline constexpr std::int32_t kSeparatorCode = -1001;
inline constexpr std::int32_t kPointCode = -1003;
inline constexpr std::int16_t kPointFlag = 1;

using PointRecord = std::array<std::uint8_t, kPointRecordBytes>;
PointRecord encode_point_record(float x, float y, float z, std::int32_t code, std::int16_t flag);
// The first three floats of a record of at least 12 bytes.
void decode_xyz(const std::uint8_t* bytes, float& x, float& y, float& z);

enum class ReadStatus { kRecord, kEnd, kFault };

class RecordReader {
 public:
  RecordReader() = default;
  RecordReader(const RecordReader&) = delete;
  RecordReader& operator=(const RecordReader&) = delete;
  ~RecordReader();

  // Opens the file and checks its marker byte; false with fault() set.
  bool open(const std::string& path);
  bool is_open() const { return input_.is_open(); }
  void close();
  // Back to the first record.
  bool rewind();

  // Reads the next record: its first head.size() bytes (at most) go to head,
  // its full length to `length`; the rest of the record is skipped.
  ReadStatus read(std::span<std::uint8_t> head, std::size_t& length);
  // The next record's data in place (valid until the next read) with its
  // length, the record then read; null, nothing read, unless it is one
  // segment lying whole in the buffer with agreeing lengths: read() then
  // takes it (and reports the end of the file or a fault).
  const std::uint8_t* read_in_place(std::size_t& length) {
    if (ended_) return nullptr;
    const std::uint8_t* lead = input_.peek(1);
    if (!lead || *lead >= kSegmentContinued) return nullptr;
    const std::size_t n = *lead;
    const std::uint8_t* p = input_.peek(n + 2);
    if (!p || p[n + 1] != p[0]) return nullptr;
    input_.skip(n + 2);
    ++records_;
    length = n;
    return p + 1;
  }

  // Number of the next record to be read, from 1.
  std::int64_t next_record() const { return records_ + 1; }
  const std::string& path() const { return path_; }
  const RecordFaultInfo& fault() const { return fault_; }

 private:
  ReadStatus fail(RecordFault f, std::int64_t record, std::string detail);

  BufferedInput input_;
  std::string path_;
  std::int64_t records_ = 0;
  bool ended_ = false;
  RecordFaultInfo fault_;
};

class RecordWriter {
 public:
  RecordWriter() = default;
  RecordWriter(const RecordWriter&) = delete;
  RecordWriter& operator=(const RecordWriter&) = delete;
  // Abandons an unclosed file without its end marker (the fault path).
  ~RecordWriter();

  // Creates (or truncates) the file and writes its marker; false with fault() set.
  bool create(const std::string& path);
  bool is_open() const { return file_ != nullptr; }
  bool write(std::span<const std::uint8_t> data);
  // Writes the end marker and closes; false with fault() set.
  bool close();
  // Gives up a file that was not closed successfully: it is closed and, when
  // it is a regular file, removed, so that no incomplete record file is left
  // that a reader could take for a result.
  void abandon();

  std::int64_t records_written() const { return records_; }
  const std::string& path() const { return path_; }
  const RecordFaultInfo& fault() const { return fault_; }

 private:
  bool fail(std::int64_t record, int error);

  std::FILE* file_ = nullptr;
  std::string path_;
  std::int64_t records_ = 0;
  bool regular_ = false;     // a regular file (never remove a device)
  bool incomplete_ = false;  // created and not closed successfully
  RecordFaultInfo fault_;
};

}  // namespace zt
