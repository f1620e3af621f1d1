// Binary record readers, byte by byte: open statuses, the segmented read,
// point counting and seeking with and without a header record, damage.
#include "runtime/record_readers.hpp"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

namespace {

using zt::CKvlBinaryResFileReader;
using zt::CZi4UnformattedSequentialFileReader;

std::string le(const void* p, size_t n) { return std::string(static_cast<const char*>(p), n); }
std::string f32(float v) { return le(&v, 4); }  // the test host is little-endian like the files
std::string i32(std::int32_t v) { return le(&v, 4); }
std::string i16(std::int16_t v) { return le(&v, 2); }

// The segmented layout, written independently of the readers.
std::string record(const std::string& data) {
  std::string out;
  size_t at = 0;
  do {
    const size_t left = data.size() - at;
    const unsigned char l = left > 128 ? 129 : static_cast<unsigned char>(left);
    const size_t n = left > 128 ? 128 : left;
    out += static_cast<char>(l);
    out += data.substr(at, n);
    out += static_cast<char>(l);
    at += n;
  } while (at < data.size());
  return out;
}

std::string point12(float x, float y, float z) { return record(f32(x) + f32(y) + f32(z)); }
std::string file_of(const std::string& records) { return "K" + records + "\x82"; }

class RecordReaders : public testing::Test {
 protected:
  std::string write(const std::string& name, const std::string& bytes) {
    const std::string path = dir_ + "/" + name;
    std::ofstream(path, std::ios::binary) << bytes;
    return path;
  }
  void SetUp() override {
    char tmpl[] = "/tmp/zt_readers_XXXXXX";
    ASSERT_NE(mkdtemp(tmpl), nullptr);
    dir_ = tmpl;
  }
  void TearDown() override { std::filesystem::remove_all(dir_); }
  std::string dir_;
};

struct Messages {
  std::vector<std::string> texts;
  static void collect(void* self, const char* text) {
    static_cast<Messages*>(self)->texts.emplace_back(text);
  }
};

TEST_F(RecordReaders, OpenStatuses) {
  CKvlBinaryResFileReader r;
  EXPECT_EQ(r.openPoints(nullptr), -1);
  EXPECT_EQ(r.openPoints(""), -1);
  EXPECT_EQ(r.openPoints((dir_ + "/missing").c_str()), -2);
  // A socket has a size but cannot be opened as a file, even by root.
  const std::string sock = dir_ + "/sock";
  const int fd = socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un addr{};
  addr.sun_family = AF_UNIX;
  std::strncpy(addr.sun_path, sock.c_str(), sizeof addr.sun_path - 1);
  ASSERT_EQ(bind(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr), 0);
  EXPECT_EQ(r.openPoints(sock.c_str()), -3);
  ::close(fd);
  EXPECT_EQ(r.openPoints(write("empty", "").c_str()), -4);
  EXPECT_EQ(r.openPoints(write("one", "K").c_str()), -4);
  EXPECT_FALSE(r.isOpen());
  EXPECT_EQ(r.openPoints(write("notk", "k\x82").c_str()), -5);
  EXPECT_FALSE(r.isOpen());
  EXPECT_EQ(r.openPoints(write("hdr", std::string("K\x08") + "abc").c_str()), -6);
  EXPECT_FALSE(r.isOpen());
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
  const std::string bytes = file_of(point12(1, 2, 3) + point12(4, 5, 6));
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
  float x = 0, y = 0, z = 0;
  EXPECT_EQ(r.readPoint(x, y, z), 2);
  EXPECT_EQ(x, 4);
  EXPECT_EQ(z, 6);
  EXPECT_EQ(r.readPoint(x, y, z), 0);
  EXPECT_EQ(r.seekToPoint(3), -1);
  ASSERT_EQ(r.seekToPoint(0), 0);  // counts as 1
  EXPECT_EQ(r.readPoint(x, y, z), 1);
  EXPECT_EQ(y, 2);
  // Asking for more than a record holds is an error and changes nothing.
  std::int32_t code = 9;
  std::int16_t flag = 9;
  EXPECT_EQ(r.readPoint(x, y, z, &code, &flag), -1);
  EXPECT_EQ(x, 1);
  EXPECT_EQ(flag, 9);
}

TEST_F(RecordReaders, HeaderRecordIsCountedAsRead) {
  const std::string header = record(f32(2.5f) + i32(7));
  const std::string bytes = file_of(header + point12(1, 2, 3) + point12(4, 5, 6));
  CKvlBinaryResFileReader r;
  ASSERT_EQ(r.openPoints(write("hdr", bytes).c_str()), 0);
  EXPECT_EQ(r.recordCount(), 2);
  EXPECT_EQ(r.headerValue(), 2.5f);
  EXPECT_EQ(r.headerCount(), 7);
  EXPECT_EQ(r.recordsRead(), 1);
  float x = 0, y = 0, z = 0;
  EXPECT_EQ(r.readPoint(x, y, z), 1);
  EXPECT_EQ(r.readPoint(x, y, z), 2);
  EXPECT_EQ(r.recordsRead(), 3);
  ASSERT_EQ(r.seekToPoint(1), 0);
  EXPECT_EQ(r.tell(), 11 + 1);
  EXPECT_EQ(r.readPoint(x, y, z), 1);
  EXPECT_EQ(x, 1);
}

TEST_F(RecordReaders, EighteenByteRecordsDecodeCodeAndFlag) {
  const std::string sep = record(f32(99999) + f32(99999) + f32(99999) + i32(-1001) + i16(1));
  const std::string pt = record(f32(-1.5f) + f32(2) + f32(3) + i32(-1003) + i16(-2));
  CKvlBinaryResFileReader r(true);
  ASSERT_EQ(r.openPoints(write("p18", file_of(sep + pt)).c_str()), 0);
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
  const std::string seg = record(big);
  ASSERT_EQ(seg.size(), 306u);
  ASSERT_EQ(static_cast<unsigned char>(seg[0]), 129);
  ASSERT_EQ(static_cast<unsigned char>(seg[130]), 129);
  ASSERT_EQ(static_cast<unsigned char>(seg[260]), 44);
  const std::string exact(128, 'a');
  ASSERT_EQ(record(exact).size(), 130u);
  const std::string path = write("seg", file_of(seg + seg + record(exact) + record("xy")));

  CZi4UnformattedSequentialFileReader r;
  ASSERT_EQ(r.openSequential(path.c_str()), 0);
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
  std::string bad = point12(1, 2, 3);
  bad[13] = 11;
  CKvlBinaryResFileReader r;
  r.setMessageHandler(Messages::collect, &m);
  ASSERT_EQ(r.openPoints(write("mismatch", file_of(bad + point12(4, 5, 6))).c_str()), 0);
  float x = 0, y = 0, z = 0;
  EXPECT_EQ(r.readPoint(x, y, z), 1);
  EXPECT_EQ(r.readPoint(x, y, z), 2);
  EXPECT_EQ(x, 4);
  ASSERT_EQ(m.texts.size(), 1u);
  EXPECT_EQ(m.texts[0].rfind("readNextRecord internal error : size mismatch 12 != 11 @ ", 0), 0u);

  // Truncated inside the second record, and without the end marker.
  const std::string two = "K" + point12(1, 2, 3) + point12(4, 5, 6);
  for (const std::string& bytes : {two.substr(0, 20), two}) {
    m.texts.clear();
    ASSERT_EQ(r.openPoints(write("cut", bytes).c_str()), 0);
    EXPECT_EQ(r.readPoint(x, y, z), 1);
    EXPECT_EQ(r.readPoint(x, y, z), -1);
    ASSERT_EQ(m.texts.size(), 1u);
    EXPECT_EQ(m.texts[0].rfind("readNextRecord internal error : cannot read 13 bytes from position 16", 0), 0u);
  }
  // An empty record among the points is not the end of the file.
  ASSERT_EQ(r.openPoints(write("hole", file_of(point12(1, 2, 3) + record("") + point12(4, 5, 6))).c_str()), 0);
  EXPECT_EQ(r.readPoint(x, y, z), 1);
  EXPECT_EQ(r.readPoint(x, y, z), -1);
  // Without a handler the text is dropped.
  CZi4UnformattedSequentialFileReader quiet;
  ASSERT_EQ(quiet.openSequential(write("q", two.substr(0, 20)).c_str()), 0);
  EXPECT_EQ(quiet.readNextRecord(nullptr, 0), 12);
  EXPECT_EQ(quiet.readNextRecord(nullptr, 0), -1);
  EXPECT_EQ(quiet.recordsRead(), 0);  // readNextRecord itself counts nothing
}

}  // namespace
