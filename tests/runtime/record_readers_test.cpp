// Binary record readers beyond the cases of data/readers.cases: open
// statuses no file name can give, the sequential reader's segmented read and
// its damage.
#include "runtime/record_readers.hpp"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

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
