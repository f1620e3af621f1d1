// Binary record readers, byte by byte: open statuses, the segmented read,
// point counting and seeking with and without a header record, damage.
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

template <class T>
std::string le(T v) { return std::string(reinterpret_cast<const char*>(&v), sizeof v); }  // a little-endian host
std::string xyz(float x, float y, float z) { return le(x) + le(y) + le(z); }
std::string file_of(const std::vector<std::string>& records) { return zt::test::segmented_record_file(records); }

// readPoint's result and the point, as "n: x y z".
std::string next(CKvlBinaryResFileReader& r) {
  float x = 0, y = 0, z = 0;
  const std::int64_t n = r.readPoint(x, y, z);
  return std::to_string(n) + ": " + std::to_string(x) + " " + std::to_string(y) + " " + std::to_string(z);
}
std::string at(std::int64_t n, float x, float y, float z) {
  return std::to_string(n) + ": " + std::to_string(x) + " " + std::to_string(y) + " " + std::to_string(z);
}

class RecordReaders : public testing::Test {
 protected:
  std::string write(const std::string& name, const std::string& bytes) {
    zt::test::write_text(dir.file(name), bytes);
    return dir.file(name);
  }
  zt::test::ScratchDir dir;
};

struct Messages {
  std::vector<std::string> texts;
  static void collect(void* self, const char* text) { static_cast<Messages*>(self)->texts.emplace_back(text); }
};

TEST_F(RecordReaders, OpenStatuses) {
  CKvlBinaryResFileReader r;
  EXPECT_EQ(r.openPoints(nullptr), -1);
  EXPECT_EQ(r.openPoints(""), -1);
  EXPECT_EQ(r.openPoints(dir.file("missing").c_str()), -2);
  // A socket has a size but cannot be opened as a file, even by root.
  const std::string sock = dir.file("sock");
  const int fd = socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un addr{};
  addr.sun_family = AF_UNIX;
  std::strncpy(addr.sun_path, sock.c_str(), sizeof addr.sun_path - 1);
  ASSERT_EQ(bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr), 0);
  EXPECT_EQ(r.openPoints(sock.c_str()), -3);
  ::close(fd);
  const std::pair<std::string, int> cases[] = {{"", -4}, {"K", -4}, {"k\x82", -5}, {"K\x08" "abc", -6}};
  for (const auto& [bytes, status] : cases) {
    EXPECT_EQ(r.openPoints(write("f", bytes).c_str()), status) << bytes;
    EXPECT_FALSE(r.isOpen());
  }
  EXPECT_EQ(r.close(), 0);
  EXPECT_EQ(r.readBytes(nullptr, 1), -2);
  EXPECT_EQ(r.seek(0, 0), -1);
}

TEST_F(RecordReaders, EmptyFileHasNoPoints) {
  CKvlBinaryResFileReader r;
  ASSERT_EQ(r.openPoints(write("e", "K\x82").c_str()), 0);
  EXPECT_EQ(r.recordSize(), 130);
  EXPECT_EQ(r.recordCount(), 0);
  float x = 5, y = 6, z = 7;
  EXPECT_EQ(r.readPoint(x, y, z), 0);
  EXPECT_EQ(x, 5);
  EXPECT_EQ(r.seekToPoint(1), -1);
}

TEST_F(RecordReaders, TwoTwelveByteRecords) {
  const std::string bytes = file_of({xyz(1, 2, 3), xyz(4, 5, 6)});
  ASSERT_EQ(bytes.size(), 30u);
  CKvlBinaryResFileReader r;
  ASSERT_EQ(r.openPoints(write("two", bytes).c_str()), 0);
  EXPECT_EQ(r.recordSize(), 12);
  EXPECT_EQ(r.recordCount(), 2);
  EXPECT_FALSE(r.hasCode());
  EXPECT_EQ(r.headerCount(), -1);
  ASSERT_EQ(r.seekToPoint(2), 0);
  EXPECT_EQ(r.tell(), 15 + 1);  // the length byte at 15 has been taken as pending
  EXPECT_EQ(r.pendingLength(), 12);
  EXPECT_EQ(next(r), at(2, 4, 5, 6));
  EXPECT_EQ(next(r), at(0, 0, 0, 0));  // the end: the point untouched
  EXPECT_EQ(r.seekToPoint(3), -1);
  ASSERT_EQ(r.seekToPoint(0), 0);  // counts as 1
  EXPECT_EQ(next(r), at(1, 1, 2, 3));
  // Asking for more than a record holds is an error and changes nothing.
  float x = 0, y = 0, z = 0;
  std::int32_t code = 9;
  std::int16_t flag = 9;
  EXPECT_EQ(r.readPoint(x, y, z, &code, &flag), -1);
  EXPECT_EQ(x, 0);
  EXPECT_EQ(flag, 9);
}

TEST_F(RecordReaders, HeaderRecordIsCountedAsRead) {
  CKvlBinaryResFileReader r;
  ASSERT_EQ(r.openPoints(write("hdr", file_of({le(2.5f) + le(7), xyz(1, 2, 3), xyz(4, 5, 6)})).c_str()), 0);
  EXPECT_EQ(r.recordCount(), 2);
  EXPECT_EQ(r.headerValue(), 2.5f);
  EXPECT_EQ(r.headerCount(), 7);
  EXPECT_EQ(r.recordsRead(), 1);
  EXPECT_EQ(next(r), at(1, 1, 2, 3));
  EXPECT_EQ(next(r), at(2, 4, 5, 6));
  EXPECT_EQ(r.recordsRead(), 3);
  ASSERT_EQ(r.seekToPoint(1), 0);
  EXPECT_EQ(r.tell(), 11 + 1);
  EXPECT_EQ(next(r), at(1, 1, 2, 3));
}

TEST_F(RecordReaders, EighteenByteRecordsDecodeCodeAndFlag) {
  const std::string sep = xyz(99999, 99999, 99999) + le(-1001) + le(std::int16_t{1});
  const std::string pt = xyz(-1.5f, 2, 3) + le(-1003) + le(std::int16_t{-2});
  CKvlBinaryResFileReader r(true);
  ASSERT_EQ(r.openPoints(write("p18", file_of({sep, pt})).c_str()), 0);
  EXPECT_TRUE(r.hasFlag());
  EXPECT_EQ(r.recordCount(), 2);
  float x, y, z;
  std::int32_t code = 0;
  std::int16_t flag = 0;
  EXPECT_EQ(r.readPoint(x, y, z, &code, &flag), 1);
  EXPECT_EQ(code, -1001);
  EXPECT_EQ(r.readPoint(x, y, z, nullptr, &flag), 2);
  EXPECT_EQ(x, -1.5f);
  EXPECT_EQ(flag, -2);
}

TEST_F(RecordReaders, SegmentedRecordsAndSkipping) {
  std::string big(300, '\0');
  for (size_t i = 0; i < big.size(); ++i) big[i] = static_cast<char>(i * 7);
  const std::string exact(128, 'a');
  const std::string bytes = file_of({big, big, exact, "xy"});
  // The layout itself: 129-byte continuation marks, then the rest's length.
  ASSERT_EQ(bytes.size(), 1 + 306 * 2 + 130 + 4 + 1u);
  EXPECT_EQ(static_cast<unsigned char>(bytes[1]), 129);
  EXPECT_EQ(static_cast<unsigned char>(bytes[131]), 129);
  EXPECT_EQ(static_cast<unsigned char>(bytes[261]), 44);

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

TEST_F(RecordReaders, DamageIsReportedAndNeverReadAsAnEnd) {
  Messages m;
  // A wrong trailing length: reported, the record still delivered.
  std::string bad = file_of({xyz(1, 2, 3), xyz(4, 5, 6)});
  bad[14] = 11;
  CKvlBinaryResFileReader r;
  r.setMessageHandler(Messages::collect, &m);
  ASSERT_EQ(r.openPoints(write("mismatch", bad).c_str()), 0);
  EXPECT_EQ(next(r), at(1, 1, 2, 3));
  EXPECT_EQ(next(r), at(2, 4, 5, 6));
  ASSERT_EQ(m.texts.size(), 1u);
  EXPECT_EQ(m.texts[0].rfind("readNextRecord internal error : size mismatch 12 != 11 @ ", 0), 0u);

  // Truncated inside the second record, and without the end marker.
  std::string two = file_of({xyz(1, 2, 3), xyz(4, 5, 6)});
  two.pop_back();
  for (const std::string& bytes : {two.substr(0, 20), two}) {
    m.texts.clear();
    ASSERT_EQ(r.openPoints(write("cut", bytes).c_str()), 0);
    EXPECT_EQ(next(r), at(1, 1, 2, 3));
    EXPECT_EQ(next(r).substr(0, 4), "-1: ");
    ASSERT_EQ(m.texts.size(), 1u);
    EXPECT_EQ(m.texts[0].rfind("readNextRecord internal error : cannot read 13 bytes from position 16", 0), 0u);
  }
  // An empty record among the points is not the end of the file.
  ASSERT_EQ(r.openPoints(write("hole", file_of({xyz(1, 2, 3), "", xyz(4, 5, 6)})).c_str()), 0);
  EXPECT_EQ(next(r).substr(0, 3), "1: ");
  EXPECT_EQ(next(r).substr(0, 4), "-1: ");
  // Without a handler the text is dropped.
  CZi4UnformattedSequentialFileReader quiet;
  ASSERT_EQ(quiet.openSequential(write("q", two.substr(0, 20)).c_str()), 0);
  EXPECT_EQ(quiet.readNextRecord(nullptr, 0), 12);
  EXPECT_EQ(quiet.readNextRecord(nullptr, 0), -1);
  EXPECT_EQ(quiet.recordsRead(), 0);  // readNextRecord itself counts nothing
}

}  // namespace
