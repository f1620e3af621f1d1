// Binary record file readers: file ownership, the segmented record read and
// the fixed-size point records.
#include "runtime/record_readers.hpp"

#include "runtime/buffered_input.hpp"

#include <sys/stat.h>

#include <algorithm>
#include <bit>
#include <cstdarg>
#include <cstring>

namespace zt {

namespace {

constexpr std::uint8_t kFileMarker = 75;        // "K"
constexpr int kLastSegmentMax = 128;            // data bytes of one segment
constexpr int kContinuedSegment = 129;          // 128 bytes, the record goes on
constexpr std::uint8_t kEndMarker = 130;        // a leading length above 129 ends the file
constexpr std::int64_t kHeaderRecordSize = 8;   // float + int32
constexpr int kMessageCapacity = 1024;
// Point record widths: x y z, then code, then flag.
constexpr std::int64_t kPointXyz = 12;
constexpr std::int64_t kPointWithCode = 16;
constexpr std::int64_t kPointWithFlag = 18;

std::uint32_t le32(const unsigned char* b) {
  return std::uint32_t{b[0]} | std::uint32_t{b[1]} << 8 | std::uint32_t{b[2]} << 16 |
         std::uint32_t{b[3]} << 24;
}
float le_float(const unsigned char* b) { return std::bit_cast<float>(le32(b)); }
std::int32_t le_int32(const unsigned char* b) { return static_cast<std::int32_t>(le32(b)); }
std::int16_t le_int16(const unsigned char* b) {
  return static_cast<std::int16_t>(static_cast<std::uint16_t>(b[0] | b[1] << 8));
}

}  // namespace

// ---------------------------------------------------------------------------
// VCZi4UnformattedFileReader

struct VCZi4UnformattedFileReader::FileState {
  // Every read goes through one large buffer: the per-segment reads, the
  // position asked for each message and the jumps of seekToPoint cost no
  // system call of their own.
  BufferedInput input;
  std::int64_t fileSize = 0;
  std::int64_t recordsRead = 0;
  // Kept for the callers that choose it; with the reader's own buffer there
  // is no stream lock to skip.
  bool unlockedReads = false;
  ReaderMessageHandler handler = nullptr;
  void* handlerContext = nullptr;
};

VCZi4UnformattedFileReader::VCZi4UnformattedFileReader(bool unlockedReads)
    : state_(std::make_unique<FileState>()) {
  state_->unlockedReads = unlockedReads;
}

VCZi4UnformattedFileReader::~VCZi4UnformattedFileReader() { close(); }

void VCZi4UnformattedFileReader::setMessageHandler(ReaderMessageHandler handler, void* context) {
  state_->handler = handler;
  state_->handlerContext = context;
}

int VCZi4UnformattedFileReader::open(const char* path) {
  close();
  if (!path || !*path) return -1;
  struct stat info {};
  if (::stat(path, &info) != 0) return -2;
  // Only a regular file opens: a FIFO would block, a device never end.
  if (state_->input.open(path) != BufferedInput::Open::kOk) return -3;
  state_->fileSize = state_->input.size();
  state_->recordsRead = 0;
  return 0;
}

int VCZi4UnformattedFileReader::close() { return state_->input.close(); }

int VCZi4UnformattedFileReader::readBytes(void* buffer, std::size_t n) {
  if (!state_->input.is_open()) return -2;
  return state_->input.read(buffer, n) == n ? 0 : -1;
}

const unsigned char* VCZi4UnformattedFileReader::peekBytes(std::size_t n) const {
  return state_->input.peek(n);
}

void VCZi4UnformattedFileReader::skipBytes(std::size_t n) { state_->input.skip(n); }

void VCZi4UnformattedFileReader::countRecord() { ++state_->recordsRead; }

std::int64_t VCZi4UnformattedFileReader::nextRecord(void* buffer, std::int64_t capacity) {
  const std::int64_t r = readNextRecord(buffer, capacity);
  if (r != 0 && r != -1) ++state_->recordsRead;
  return r;
}

int VCZi4UnformattedFileReader::seek(std::int64_t offset, std::int64_t recordsRead) {
  if (!state_->input.seek(offset)) return -1;
  state_->recordsRead = recordsRead;
  return 0;
}

std::int64_t VCZi4UnformattedFileReader::fileSize() const { return state_->fileSize; }
std::int64_t VCZi4UnformattedFileReader::recordsRead() const { return state_->recordsRead; }
std::int64_t VCZi4UnformattedFileReader::tell() const {
  return state_->input.is_open() ? state_->input.tell() : -1;
}
bool VCZi4UnformattedFileReader::isOpen() const { return state_->input.is_open(); }

void VCZi4UnformattedFileReader::message(const char* format, ...) {
  if (!state_->handler) return;
  char text[kMessageCapacity + 1];
  va_list args;
  va_start(args, format);
  std::vsnprintf(text, sizeof text, format, args);
  va_end(args);
  state_->handler(state_->handlerContext, text);
}

// ---------------------------------------------------------------------------
// CZi4UnformattedSequentialFileReader

CZi4UnformattedSequentialFileReader::CZi4UnformattedSequentialFileReader(bool unlockedReads)
    : VCZi4UnformattedFileReader(unlockedReads) {}

CZi4UnformattedSequentialFileReader::~CZi4UnformattedSequentialFileReader() = default;

int CZi4UnformattedSequentialFileReader::openSequential(const char* path) {
  const int r = open(path);
  if (r != 0) return r;
  unsigned char start[2];
  if (readBytes(start, sizeof start) != 0) {
    close();
    return -4;
  }
  if (start[0] != kFileMarker) {
    close();
    return -5;
  }
  pending_ = start[1];
  return 0;
}

std::int64_t CZi4UnformattedSequentialFileReader::readNextRecord(void* buffer,
                                                                 std::int64_t capacity) {
  if (pending_ > kContinuedSegment) return 0;
  auto* out = static_cast<unsigned char*>(buffer);
  std::int64_t remaining = buffer ? std::max<std::int64_t>(capacity, 0) : 0;
  // A record of one segment whose bytes are buffered and whose lengths agree
  // is taken in place; anything else goes the general way below.
  int inPlace = 0;
  if (const unsigned char* data = takeSegmentInPlace(inPlace)) {
    const std::int64_t copied = std::min<std::int64_t>(inPlace, remaining);
    if (copied > 0) std::memcpy(out, data, static_cast<std::size_t>(copied));
    return inPlace;
  }
  std::int64_t total = 0;
  // Data, trailing length and the next segment's leading length in one read.
  unsigned char segment[kLastSegmentMax + 2];
  int length = 0;
  do {
    length = pending_;
    const int n = std::min(length, kLastSegmentMax);
    total += n;
    const std::int64_t position = tell();
    if (readBytes(segment, static_cast<std::size_t>(n) + 2) != 0) {
      message("readNextRecord internal error : cannot read %d bytes from position %lld\n", n + 1,
              static_cast<long long>(position));
      return -1;
    }
    if (segment[n] != length) {
      message("readNextRecord internal error : size mismatch %d != %d @ %lld %lld %d\n", length,
              segment[n], static_cast<long long>(tell()), static_cast<long long>(recordsRead()), n);
    }
    pending_ = segment[n + 1];
    const std::int64_t copied = std::min<std::int64_t>(n, remaining);
    if (copied > 0) {
      std::memcpy(out, segment, static_cast<std::size_t>(copied));
      out += copied;
      remaining -= copied;
    }
  } while (length >= kContinuedSegment);
  return total;
}

const unsigned char* CZi4UnformattedSequentialFileReader::takeSegmentInPlace(int& length) {
  if (pending_ >= kContinuedSegment) return nullptr;
  const int n = pending_;
  const unsigned char* segment = peekBytes(static_cast<std::size_t>(n) + 2);
  if (!segment || segment[n] != n) return nullptr;
  pending_ = segment[n + 1];
  skipBytes(static_cast<std::size_t>(n) + 2);
  length = n;
  return segment;
}

const unsigned char* CZi4UnformattedSequentialFileReader::takeRecordInPlace(int& length) {
  const unsigned char* segment = takeSegmentInPlace(length);
  if (segment && length != 0) countRecord();  // as nextRecord counts
  return segment;
}

int CZi4UnformattedSequentialFileReader::seekRecord(std::int64_t offset, std::int64_t recordsRead) {
  const int r = seek(offset, recordsRead);
  if (r != 0) return r;
  unsigned char length = kEndMarker;
  if (readBytes(&length, 1) != 0) length = kEndMarker;
  pending_ = length;
  return 0;
}

// ---------------------------------------------------------------------------
// CKvlBinaryResFileReader

CKvlBinaryResFileReader::CKvlBinaryResFileReader(bool unlockedReads)
    : CZi4UnformattedSequentialFileReader(unlockedReads) {}

CKvlBinaryResFileReader::~CKvlBinaryResFileReader() = default;

int CKvlBinaryResFileReader::openPoints(const char* path) {
  headerSize_ = recordSize_ = recordCount_ = 0;
  headerValue_ = 0.0f;
  headerCount_ = -1;
  const int r = openSequential(path);
  if (r != 0) return r;
  if (pendingLength() == kHeaderRecordSize) {
    unsigned char header[kHeaderRecordSize];
    if (nextRecord(header, sizeof header) != kHeaderRecordSize) {
      close();
      return -6;
    }
    headerSize_ = kHeaderRecordSize;
    headerValue_ = le_float(header);
    headerCount_ = le_int32(header + 4);
  }
  recordSize_ = pendingLength();
  // "K", [header], N x (L + data + L), end marker.
  const std::int64_t framing = headerSize_ ? headerSize_ + 4 : 2;
  recordCount_ = std::max<std::int64_t>(0, (fileSize() - framing) / (recordSize_ + 2));
  return 0;
}

int CKvlBinaryResFileReader::seekToPoint(std::int64_t n) {
  if (n < 1) n = 1;
  if (n > recordCount_) return -1;
  const std::int64_t offset = (recordSize_ + 2) * (n - 1) + (headerSize_ ? headerSize_ + 3 : 1);
  return seekRecord(offset, n - 1 + (headerSize_ ? 1 : 0));
}

std::int64_t CKvlBinaryResFileReader::readPoint(float& x, float& y, float& z, std::int32_t* code,
                                                std::int16_t* flag) {
  const std::int64_t asked = flag ? kPointWithFlag : code ? kPointWithCode : kPointXyz;
  int length = 0;
  if (const unsigned char* in = takeRecordInPlace(length)) {
    if (length < asked) return -1;
    x = le_float(in);
    y = le_float(in + 4);
    z = le_float(in + 8);
    if (code) *code = le_int32(in + 12);
    if (flag) *flag = le_int16(in + 16);
    return recordsRead() - (headerSize_ ? 1 : 0);
  }
  unsigned char record[kPointWithFlag] = {};
  // Only the end marker ends the records: a damaged file or an empty record
  // in their midst is an error, never a quiet end of the file.
  const bool atEnd = pendingLength() > kContinuedSegment;
  const std::int64_t r = nextRecord(record, asked);
  if (r == 0 && atEnd) return 0;
  if (r < asked) return -1;
  x = le_float(record);
  y = le_float(record + 4);
  z = le_float(record + 8);
  if (code && asked >= kPointWithCode) *code = le_int32(record + 12);
  if (flag) *flag = le_int16(record + 16);
  return recordsRead() - (headerSize_ ? 1 : 0);
}

}  // namespace zt
