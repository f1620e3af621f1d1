// Segmented record files beyond the cases of data/records.cases: random
// round trips, the writer's faults, and the fault messages and statuses.
#include <gtest/gtest.h>

#include <random>
#include <set>

#include "driver/record_stream.hpp"
#include "test_files.hpp"

namespace zt {
namespace {

using test::Bytes;

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
  RecordWriter writer;
  ASSERT_TRUE(writer.create(dir.file("r.bin")));
  for (const Bytes& r : records) EXPECT_TRUE(writer.write(r));
  EXPECT_TRUE(writer.close());
  EXPECT_EQ(test::read_bytes(dir.file("r.bin")), test::record_file(records));
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

TEST(RecordFaults, WriterFaults) {
  test::ScratchDir dir;
  RecordWriter writer;
  EXPECT_FALSE(writer.create(dir.file("no/such/dir.bin")));
  EXPECT_EQ(writer.fault().fault, RecordFault::kUnwritable);
  // A full device: the buffered records fail at the latest when closing.
  ASSERT_TRUE(writer.create("/dev/full"));
  bool ok = true;
  for (int i = 0; i < 1000 && ok; ++i) ok = writer.write(Bytes(18, 7));
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
