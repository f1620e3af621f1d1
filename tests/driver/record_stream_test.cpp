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

TEST(RecordLayout, EmptyFileIsMarkerAndEndMarker) {
  test::ScratchDir dir;
  EXPECT_EQ(write_records(dir.file("e.bin"), {}), (Bytes{0x4b, 0x82}));
}

TEST(RecordLayout, SegmentBoundaries) {
  test::ScratchDir dir;
  // 130 bytes: a continued segment of 128 and a last segment of 2.
  const Bytes data = filled(130);
  Bytes f = write_records(dir.file("a.bin"), {data});
  ASSERT_EQ(f.size(), 1u + 134u + 1u);
  EXPECT_EQ(f[1], 129);
  EXPECT_EQ(f[130], 129);
  EXPECT_EQ(f[131], 2);
  EXPECT_EQ(f[134], 2);
  EXPECT_EQ(Bytes(f.begin() + 2, f.begin() + 130), Bytes(data.begin(), data.begin() + 128));
  // Exactly 128 bytes: one segment with length 128 at both ends.
  f = write_records(dir.file("b.bin"), {filled(128)});
  ASSERT_EQ(f.size(), 1u + 130u + 1u);
  EXPECT_EQ(f[1], 128);
  EXPECT_EQ(f[130], 128);
  // 256 bytes: 129 then 128.
  f = write_records(dir.file("c.bin"), {filled(256)});
  ASSERT_EQ(f.size(), 1u + 260u + 1u);
  EXPECT_EQ(f[1], 129);
  EXPECT_EQ(f[131], 128);
  // An empty record is 0 0.
  EXPECT_EQ(write_records(dir.file("d.bin"), {Bytes{}}), (Bytes{0x4b, 0, 0, 0x82}));
}

TEST(RecordLayout, PointRecordBytes) {
  const PointRecord sep = encode_point_record(kSeparatorValue, kSeparatorValue, kSeparatorValue,
                                              kSeparatorCode, kPointFlag);
  EXPECT_EQ(Bytes(sep.begin(), sep.end()),
            (Bytes{0x80, 0x4f, 0xc3, 0x47, 0x80, 0x4f, 0xc3, 0x47, 0x80, 0x4f, 0xc3, 0x47, 0x17, 0xfc,
                   0xff, 0xff, 0x01, 0x00}));
  float x = 0, y = 0, z = 0;
  const PointRecord p = encode_point_record(-1.5f, 2.25f, 1e-3f, kPointCode, kPointFlag);
  decode_xyz(p.data(), x, y, z);
  EXPECT_EQ(x, -1.5f);
  EXPECT_EQ(y, 2.25f);
  EXPECT_EQ(z, 1e-3f);
}

// Random record lengths around the segment size read back byte for byte, with
// and without a head shorter than the record.
TEST(RecordLayout, RoundTripRandomLengths) {
  test::ScratchDir dir;
  std::mt19937 rng(7);
  std::vector<Bytes> records;
  for (int i = 0; i < 200; ++i) {
    Bytes r(rng() % 600);
    for (auto& b : r) b = static_cast<std::uint8_t>(rng());
    records.push_back(r);
  }
  const std::string path = dir.file("r.bin");
  EXPECT_EQ(write_records(path, records), test::record_file(records));

  RecordReader reader;
  ASSERT_TRUE(reader.open(path));
  for (int pass = 0; pass < 2; ++pass) {
    for (std::size_t i = 0; i < records.size(); ++i) {
      Bytes head(pass == 0 ? 1000 : 12);
      std::size_t length = 0;
      ASSERT_EQ(reader.read(head, length), ReadStatus::kRecord);
      ASSERT_EQ(length, records[i].size());
      const std::size_t kept = std::min(length, head.size());
      EXPECT_TRUE(std::equal(head.begin(), head.begin() + static_cast<std::ptrdiff_t>(kept), records[i].begin()));
      EXPECT_EQ(reader.next_record(), static_cast<std::int64_t>(i) + 2);
    }
    std::size_t length = 0;
    Bytes head(12);
    EXPECT_EQ(reader.read(head, length), ReadStatus::kEnd);
    EXPECT_EQ(reader.read(head, length), ReadStatus::kEnd);
    ASSERT_TRUE(reader.rewind());
  }
}

// A length byte above 130 where a record starts also ends the file.
TEST(RecordLayout, AnyLengthAbove129EndsTheFile) {
  test::ScratchDir dir;
  Bytes f = test::record_file({filled(5)});
  f.back() = 200;
  f.push_back(0x33);  // bytes after the end are never looked at
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
  RecordReader reader;
  EXPECT_FALSE(reader.open(dir.file("missing.bin")));
  EXPECT_EQ(reader.fault().fault, RecordFault::kUnreadable);
  EXPECT_NE(reader.fault().detail, "");
  // A directory opens but cannot be read.
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
