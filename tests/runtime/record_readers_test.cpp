// Binary record readers beyond the cases of data/readers.cases: open
// statuses no file name can give, the sequential reader's segmented read and
// its damage.
#include "runtime/record_readers.hpp"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cstring>
#include <string>
#include <vector>

#include "support/record_bytes.hpp"
#include "support/scratch_dir.hpp"

namespace {

using zt::CKvlBinaryResFileReader;
using zt::CZi4UnformattedSequentialFileReader;

std::string xyz(float x, float y, float z) {  // a little-endian host, like the files
  const float v[] = {x, y, z};
  return std::string(reinterpret_cast<const char*>(v), sizeof v);
}
std::string file_of(const std::vector<std::string>& records) { return zt::test::segmented_record_file(records); }

class RecordReaders : public testing::Test {
 protected:
  std::string write(const std::string& name, const std::string& bytes) {
    zt::test::write_text(dir.file(name), bytes);
    return dir.file(name);
  }
  zt::test::ScratchDir dir;
};

TEST_F(RecordReaders, OpenStatuses) {
  CKvlBinaryResFileReader r;
  EXPECT_EQ(r.openPoints(nullptr), -1);
  EXPECT_EQ(r.openPoints(""), -1);
  // A socket has a size but cannot be opened as a file, even by root.
  const std::string sock = dir.file("sock");
  const int fd = socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un addr{};
  addr.sun_family = AF_UNIX;
  std::strncpy(addr.sun_path, sock.c_str(), sizeof addr.sun_path - 1);
  ASSERT_EQ(bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr), 0);
  EXPECT_EQ(r.openPoints(sock.c_str()), -3);
  ::close(fd);
  // Nor does anything else that is not a regular file; a FIFO without a
  // writer is refused at once instead of blocking the open.
  const std::string fifo = dir.file("fifo");
  ASSERT_EQ(::mkfifo(fifo.c_str(), 0600), 0);
  EXPECT_EQ(r.openPoints(fifo.c_str()), -3);
  EXPECT_EQ(r.openPoints(dir.path().c_str()), -3);
  EXPECT_EQ(r.openPoints("/dev/zero"), -3);
  EXPECT_EQ(r.close(), 0);
  EXPECT_EQ(r.readBytes(nullptr, 1), -2);
  EXPECT_EQ(r.seek(0, 0), -1);
}

TEST_F(RecordReaders, SegmentedRecordsAndSkipping) {
  std::string big(300, '\0');
  for (size_t i = 0; i < big.size(); ++i) big[i] = static_cast<char>(i * 7);
  const std::string exact(128, 'a');
  const std::string bytes = file_of({big, big, exact, "xy"});
  CZi4UnformattedSequentialFileReader r;
  ASSERT_EQ(r.openSequential(write("seg", bytes).c_str()), 0);
  EXPECT_EQ(r.nextRecord(nullptr, 0), 300);
  std::vector<char> buf(200, '?');
  EXPECT_EQ(r.nextRecord(buf.data(), 200), 300);  // the rest is dropped
  EXPECT_EQ(std::string(buf.data(), 200), big.substr(0, 200));
  buf.assign(200, '?');
  EXPECT_EQ(r.nextRecord(buf.data(), 200), 128);
  EXPECT_EQ(std::string(buf.data(), 128), exact);
  EXPECT_EQ(buf[128], '?');
  EXPECT_EQ(r.nextRecord(buf.data(), 200), 2);
  EXPECT_EQ(r.nextRecord(buf.data(), 200), 0);
  EXPECT_EQ(r.recordsRead(), 4);
}

// A file of many buffers' worth: every point read by jumping to it, in a
// scrambled order, is the one read in sequence, at the same position, and
// records of several segments come whole across buffer boundaries.
TEST_F(RecordReaders, JumpsAgreeWithSequentialReadingAcrossBuffers) {
  constexpr int kPoints = 9000;  // 18-byte records: about 180 KiB
  std::vector<std::string> records;
  for (int i = 0; i < kPoints; ++i) {
    std::string r = xyz(static_cast<float>(i), static_cast<float>(-i), 0.5f * static_cast<float>(i % 7));
    r += std::string("\x15\xfc\xff\xff\x01\x00", 6);  // code -1003, flag 1
    records.push_back(r);
  }
  CKvlBinaryResFileReader r;
  ASSERT_EQ(r.openPoints(write("many", file_of(records)).c_str()), 0);
  ASSERT_EQ(r.recordCount(), kPoints);
  std::vector<std::array<float, 3>> seq;
  std::vector<std::int64_t> at;
  float x, y, z;
  for (std::int64_t n; at.push_back(r.tell()), (n = r.readPoint(x, y, z)) > 0;) {
    ASSERT_EQ(n, static_cast<std::int64_t>(seq.size()) + 1);
    seq.push_back({x, y, z});
  }
  ASSERT_EQ(seq.size(), static_cast<std::size_t>(kPoints));
  std::int32_t code = 0;
  std::int16_t flag = 0;
  for (std::int64_t k = 0, n = 1; k < kPoints; ++k, n = (n * 7919) % kPoints + 1) {
    ASSERT_EQ(r.seekToPoint(n), 0);
    ASSERT_EQ(r.tell(), at[static_cast<std::size_t>(n - 1)]) << n;  // past the pending length byte
    ASSERT_EQ(r.readPoint(x, y, z, &code, &flag), n);
    EXPECT_EQ((std::array<float, 3>{x, y, z}), seq[static_cast<std::size_t>(n - 1)]) << n;
    EXPECT_EQ(code, -1003);
    EXPECT_EQ(flag, 1);
  }
  std::vector<std::string> long_records(600, std::string(300, '\0'));
  for (std::size_t i = 0; i < long_records.size(); ++i) long_records[i][i % 300] = static_cast<char>(1 + i % 250);
  CZi4UnformattedSequentialFileReader q;
  ASSERT_EQ(q.openSequential(write("long", file_of(long_records)).c_str()), 0);
  std::vector<char> buf(300);
  for (const std::string& want : long_records) {
    ASSERT_EQ(q.nextRecord(buf.data(), 300), 300);
    EXPECT_EQ(std::string(buf.data(), 300), want);
  }
  EXPECT_EQ(q.nextRecord(buf.data(), 300), 0);
}

// The sequential reader reports damage the same way; without a handler the
// text is dropped.
TEST_F(RecordReaders, SequentialReaderWithoutHandler) {
  CZi4UnformattedSequentialFileReader quiet;
  ASSERT_EQ(quiet.openSequential(write("q", file_of({xyz(1, 2, 3), xyz(4, 5, 6)}).substr(0, 20)).c_str()), 0);
  EXPECT_EQ(quiet.readNextRecord(nullptr, 0), 12);
  EXPECT_EQ(quiet.readNextRecord(nullptr, 0), -1);
  EXPECT_EQ(quiet.recordsRead(), 0);  // readNextRecord itself counts nothing
}

}  // namespace
