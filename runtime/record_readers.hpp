// Readers of the suite's binary record files.
//
// A record file is the byte 75 ("K"), then records stored as segments
// [L][up to 128 data bytes][L] (L = 129: 128 bytes and the record goes on;
// 1..128: the last segment; 0: an empty record), then the end marker 130.
// Three classes read it directly, without the driver's record layer:
//  - VCZi4UnformattedFileReader owns the file and its byte-level operations;
//  - CZi4UnformattedSequentialFileReader delivers one logical record at a time;
//  - CKvlBinaryResFileReader also knows the fixed-size point records
//    (x, y, z floats, optional 32-bit code, optional 16-bit flag, all
//    little-endian) of the suite's result files, counts them from the file
//    size and jumps to the n-th one. It accepts an optional 8-byte header
//    record (float, int32) as the file's first record.
// Paths are taken as already expanded. Open statuses: -1 no path, -2 the file
// does not exist (no size), -3 it cannot be opened or is not a regular file
// (a FIFO, device, socket or directory is refused without blocking or reading
// from it), -4 fewer than two bytes,
// -5 not starting with "K", -6 a header record announced but not whole.
// Damage is reported through the message callback (when one is set) and as
// -1 from the reads; a reader never reads past what it was given. Reading
// goes through one buffer per reader: no system call per record, none to
// tell the position and none for a seek within the buffered bytes.
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>

namespace zt {

// Receives the readers' diagnostics; `text` is only valid during the call.
using ReaderMessageHandler = void (*)(void* context, const char* text);

class VCZi4UnformattedFileReader {
 public:
  explicit VCZi4UnformattedFileReader(bool unlockedReads = false);
  virtual ~VCZi4UnformattedFileReader();
  VCZi4UnformattedFileReader(const VCZi4UnformattedFileReader&) = delete;
  VCZi4UnformattedFileReader& operator=(const VCZi4UnformattedFileReader&) = delete;

  virtual void setMessageHandler(ReaderMessageHandler handler, void* context);
  // Data bytes of the next record (copied up to `capacity`; a null buffer
  // skips the record), 0 at the end of the file, -1 on a read error.
  virtual std::int64_t readNextRecord(void* buffer, std::int64_t capacity) = 0;

  // 0, -1 (no path), -2 (no such file), -3 (cannot be opened for reading, or
  // not a regular file).
  // A file already open is closed first.
  int open(const char* path);
  // 0, or -1 when closing the file failed; 0 when none is open.
  int close();
  // 0 when all n bytes were read, -2 with no open file, -1 when fewer came.
  int readBytes(void* buffer, std::size_t n);
  // The next n bytes in place, or null when they are not buffered yet
  // (BufferedInput::peek); skipBytes moves past bytes peekBytes granted.
  const unsigned char* peekBytes(std::size_t n) const;
  void skipBytes(std::size_t n);
  // Counts a record delivered without nextRecord.
  void countRecord();
  // readNextRecord, counting every record delivered (result neither 0 nor -1).
  std::int64_t nextRecord(void* buffer, std::int64_t capacity);
  // Positions at a byte offset from the start and, on success, sets the
  // count of records read; 0 or -1 (no file, or the positioning failed).
  int seek(std::int64_t offset, std::int64_t recordsRead);

  std::int64_t fileSize() const;
  std::int64_t recordsRead() const;
  std::int64_t tell() const;  // -1 with no open file
  bool isOpen() const;

  // Formats into at most 1024 characters and hands the text to the message
  // callback; without one the text is dropped.
  void message(const char* format, ...) __attribute__((format(printf, 2, 3)));

 private:
  struct FileState;
  std::unique_ptr<FileState> state_;
};

class CZi4UnformattedSequentialFileReader : public VCZi4UnformattedFileReader {
 public:
  explicit CZi4UnformattedSequentialFileReader(bool unlockedReads = false);
  ~CZi4UnformattedSequentialFileReader() override;

  // open's result, or -4 (first two bytes unreadable) / -5 (first byte is
  // not "K"), the file then closed. On success the second byte is pending.
  int openSequential(const char* path);
  std::int64_t readNextRecord(void* buffer, std::int64_t capacity) override;
  int pendingLength() const { return pending_; }
  // The next record's data in place and its length, the record then read
  // and counted as nextRecord counts it; null, nothing read, unless the
  // record is one segment already buffered with agreeing lengths (the
  // caller then reads it with nextRecord).
  const unsigned char* takeRecordInPlace(int& length);
  // seek, then the length byte found at the offset becomes the pending one
  // (the end marker when there is none, so the next read ends the file).
  int seekRecord(std::int64_t offset, std::int64_t recordsRead);

 private:
  // takeRecordInPlace without the count, for readNextRecord, whose caller
  // counts.
  const unsigned char* takeSegmentInPlace(int& length);

  std::uint8_t pending_ = 0;
};

class CKvlBinaryResFileReader : public CZi4UnformattedSequentialFileReader {
 public:
  explicit CKvlBinaryResFileReader(bool unlockedReads = false);
  ~CKvlBinaryResFileReader() override;

  // openSequential's result, or -6 (header record announced, not whole).
  int openPoints(const char* path);
  // Positions on point record n (from 1; 0 and below count as 1): 0, -1 when
  // n is beyond the record count, or the positioning error.
  int seekToPoint(std::int64_t n);
  // Reads the next point record: 12 bytes asked, 16 with `code`, 18 with
  // `flag` (code may then be null). Returns the record's number (from 1), 0
  // at the end of the file, -1 for a damaged file or a record shorter than
  // asked. Outputs change only when a record was read whole.
  std::int64_t readPoint(float& x, float& y, float& z, std::int32_t* code = nullptr,
                         std::int16_t* flag = nullptr);

  std::int64_t recordCount() const { return recordCount_; }
  std::int64_t recordSize() const { return recordSize_; }
  bool hasCode() const { return recordSize_ > 12; }
  bool hasFlag() const { return recordSize_ > 16; }
  float headerValue() const { return headerValue_; }
  std::int32_t headerCount() const { return headerCount_; }

 private:
  std::int64_t headerSize_ = 0;
  std::int64_t recordSize_ = 0;
  std::int64_t recordCount_ = 0;
  float headerValue_ = 0.0f;
  std::int32_t headerCount_ = -1;
};

}  // namespace zt
