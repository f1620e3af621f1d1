// Byte layout of segmented record files, both directions, and the faults a
// reader or writer reports.
#include <gtest/gtest.h>

#include <random>
#include <set>

#include "driver/record_stream.hpp"
#include "test_files.hpp"

namespace zt {
namespace {

using test::Bytes;

Bytes write_records(const std::string& path, const std::vector<Bytes>& records) {
  RecordWriter w;
  EXPECT_TRUE(w.create(path));
  for (const Bytes& r : records) EXPECT_TRUE(w.write(r));
  EXPECT_TRUE(w.close());
  return test::read_bytes(path);
}

Bytes filled(std::size_t n) {
  Bytes b(n);
  for (std::size_t i = 0; i < n; ++i) b[i] = static_cast<std::uint8_t>(i * 7 + 1);
  return b;
}

// File size and the length bytes at given offsets for records of n bytes.
TEST(RecordLayout, SegmentsOfEachSize) {
  test::ScratchDir dir;
  EXPECT_EQ(write_records(dir.file("e.bin"), {}), (Bytes{0x4b, 0x82}));
  struct Case {
    std::size_t n, file_size;
    std::vector<std::pair<std::size_t, int>> lengths;
  };
  const Case cases[] = {
      {0, 4, {{1, 0}, {2, 0}}},
      {128, 132, {{1, 128}, {130, 128}}},
      {130, 136, {{1, 129}, {130, 129}, {131, 2}, {134, 2}}},  // the record takes 134 bytes
      {256, 262, {{1, 129}, {130, 129}, {131, 128}, {260, 128}}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.n);
    const Bytes f = write_records(dir.file("r.bin"), {filled(c.n)});
    ASSERT_EQ(f.size(), c.file_size);
    EXPECT_EQ(f.front(), 0x4b);
    EXPECT_EQ(f.back(), 0x82);
    for (auto [at, value] : c.lengths) EXPECT_EQ(f[at], value) << "offset " << at;
  }
}

// Random record lengths around the segment size: the writer's bytes agree
// with the layout built independently here, and read back (a 12-byte head
// keeps the start, the length counts the whole record), twice over a rewind.
TEST(RecordLayout, RoundTripRandomLengths) {
  test::ScratchDir dir;
  std::mt19937 rng(7);
  std::vector<Bytes> records(200);
  for (Bytes& r : records) {
    r.resize(rng() % 600);
    for (auto& b : r) b = static_cast<std::uint8_t>(rng());
  }
  EXPECT_EQ(write_records(dir.file("r.bin"), records), test::record_file(records));
  RecordReader reader;
  ASSERT_TRUE(reader.open(dir.file("r.bin")));
  Bytes head(12);
  std::size_t length = 0;
  for (int pass = 0; pass < 2; ++pass) {
    for (const Bytes& r : records) {
      ASSERT_EQ(reader.read(head, length), ReadStatus::kRecord);
      ASSERT_EQ(length, r.size());
      EXPECT_TRUE(std::equal(r.begin(), r.begin() + std::min<std::ptrdiff_t>(12, ssize(r)), head.begin()));
    }
    EXPECT_EQ(reader.next_record(), 201);
    EXPECT_EQ(reader.read(head, length), ReadStatus::kEnd);
    EXPECT_EQ(reader.read(head, length), ReadStatus::kEnd);
    ASSERT_TRUE(reader.rewind());
  }
}

// A length byte above 130 where a record starts also ends the file; bytes
// after it are never looked at.
TEST(RecordLayout, AnyLengthAbove129EndsTheFile) {
  test::ScratchDir dir;
  Bytes f = test::record_file({filled(5)});
  f.back() = 200;
  f.push_back(0x33);
  test::write_bytes(dir.file("x.bin"), f);
  RecordReader reader;
  ASSERT_TRUE(reader.open(dir.file("x.bin")));
  Bytes head(12);
  std::size_t length = 0;
  EXPECT_EQ(reader.read(head, length), ReadStatus::kRecord);
  EXPECT_EQ(reader.read(head, length), ReadStatus::kEnd);
}

struct BadFile {
  const char* name;
  Bytes bytes;
  RecordFault open_fault;   // kNone: opens, then the first read fails
  RecordFault read_fault;
  std::int64_t record;
};

TEST(RecordFaults, ReaderNamesKindAndRecord) {
  const Bytes two = test::record_file({filled(20), filled(20)});
  Bytes no_end = two;
  no_end.pop_back();
  Bytes cut = two;
  cut.resize(two.size() - 6);
  Bytes mismatch = two;
  mismatch[mismatch.size() - 2] = 19;  // trailing length of record 2
  Bytes end_inside = test::record_file({filled(200)});
  end_inside.resize(1 + 130);
  end_inside.push_back(kRecordEndMarker);
  const std::vector<BadFile> cases = {
      {"empty", Bytes{}, RecordFault::kNotRecordFile, RecordFault::kNone, 0},
      {"wrong_marker", Bytes{'L', 0x82}, RecordFault::kNotRecordFile, RecordFault::kNone, 0},
      {"no_end_marker", no_end, RecordFault::kNone, RecordFault::kDamaged, 3},
      {"cut_in_segment", cut, RecordFault::kNone, RecordFault::kDamaged, 2},
      {"lengths_disagree", mismatch, RecordFault::kNone, RecordFault::kDamaged, 2},
      {"end_marker_inside_record", end_inside, RecordFault::kNone, RecordFault::kDamaged, 1},
  };
  test::ScratchDir dir;
  for (const BadFile& c : cases) {
    SCOPED_TRACE(c.name);
    const std::string path = dir.file(c.name);
    test::write_bytes(path, c.bytes);
    RecordReader reader;
    if (c.open_fault != RecordFault::kNone) {
      EXPECT_FALSE(reader.open(path));
      EXPECT_EQ(reader.fault().fault, c.open_fault);
      EXPECT_EQ(reader.fault().record, 0);
      continue;
    }
    ASSERT_TRUE(reader.open(path));
    Bytes head(12);
    std::size_t length = 0;
    ReadStatus s = ReadStatus::kRecord;
    while ((s = reader.read(head, length)) == ReadStatus::kRecord) {
    }
    EXPECT_EQ(s, ReadStatus::kFault);
    EXPECT_EQ(reader.fault().fault, c.read_fault);
    EXPECT_EQ(reader.fault().record, c.record);
    EXPECT_EQ(reader.fault().path, path);
  }
}

TEST(RecordFaults, UnreadableAndUnwritable) {
  test::ScratchDir dir;
  RecordReader reader;  // a directory opens but cannot be read
  EXPECT_FALSE(reader.open(dir.path().string()));
  EXPECT_EQ(reader.fault().fault, RecordFault::kUnreadable);

  RecordWriter writer;
  EXPECT_FALSE(writer.create(dir.file("no/such/dir.bin")));
  EXPECT_EQ(writer.fault().fault, RecordFault::kUnwritable);
  // A full device: the buffered records fail at the latest when closing.
  ASSERT_TRUE(writer.create("/dev/full"));
  bool ok = true;
  for (int i = 0; i < 1000 && ok; ++i) ok = writer.write(filled(18));
  if (ok) ok = writer.close();
  EXPECT_FALSE(ok);
  EXPECT_EQ(writer.fault().fault, RecordFault::kDiskFull);
}

TEST(RecordFaults, MessagesAndExitStatusesAreDistinct) {
  const RecordFault kinds[] = {RecordFault::kUnreadable,    RecordFault::kUnwritable,
                               RecordFault::kDiskFull,      RecordFault::kNotRecordFile,
                               RecordFault::kDamaged,       RecordFault::kShortRecord,
                               RecordFault::kNonFinite};
  std::set<std::int32_t> statuses;
  for (RecordFault k : kinds) {
    const std::int32_t s = record_fault_exit_status(k);
    EXPECT_GT(s, 2);  // 1 and 2 belong to the array and Voronoi fatal reports
    EXPECT_LT(s, 128);
    statuses.insert(s);
  }
  EXPECT_EQ(statuses.size(), std::size(kinds));
  EXPECT_EQ(record_fault_message({RecordFault::kShortRecord, "/t/a.bin", 7, "8 bytes"}),
            "record file error: \"/t/a.bin\", record 7: record shorter than three floats (8 bytes)");
}

}  // namespace
}  // namespace zt
