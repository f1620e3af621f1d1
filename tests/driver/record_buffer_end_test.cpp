// Both record readers over files far longer than their input buffer: records
// lying whole in the buffer are taken in place, records across its end and
// long records go the general way; every record must come back the same
// whichever way it was taken.
#include <gtest/gtest.h>

#include <random>

#include "driver/record_stream.hpp"
#include "runtime/record_readers.hpp"
#include "test_files.hpp"

namespace zt {
namespace {

using test::Bytes;

// Point records (18 bytes: 20 on disk, which does not divide the buffer, so
// records straddle its end at many offsets) and, mixed in, records of every
// length up to two segments.
std::vector<Bytes> make_records(bool pointsOnly) {
  std::mt19937 rng(11);
  std::vector<Bytes> records;
  for (int i = 0; i < 12000; ++i) {
    if (pointsOnly || rng() % 4 != 0) {
      const PointRecord p = encode_point_record(static_cast<float>(i), 0.5f * static_cast<float>(i),
                                                -0.25f * static_cast<float>(i), i, static_cast<std::int16_t>(i % 7));
      records.emplace_back(p.begin(), p.end());
    } else {
      Bytes r(rng() % 260);
      for (auto& b : r) b = static_cast<std::uint8_t>(rng());
      records.push_back(std::move(r));
    }
  }
  return records;
}

std::string write_file(const test::ScratchDir& dir, const std::vector<Bytes>& records) {
  const std::string path = dir.file("long.bin");
  RecordWriter writer;
  EXPECT_TRUE(writer.create(path));
  for (const Bytes& r : records) EXPECT_TRUE(writer.write(r));
  EXPECT_TRUE(writer.close());
  return path;
}

TEST(RecordBufferEnd, DriverReaderTakesEveryRecordAlike) {
  test::ScratchDir dir;
  const std::vector<Bytes> records = make_records(false);
  RecordReader reader;
  ASSERT_TRUE(reader.open(write_file(dir, records)));
  Bytes head(12);
  std::size_t length = 0;
  for (std::size_t i = 0; i < records.size(); ++i) {
    const Bytes& r = records[i];
    // Alternately the in-place form (falling back to read()) and read() alone.
    const std::uint8_t* data = i % 2 ? reader.read_in_place(length) : nullptr;
    if (!data) {
      ASSERT_EQ(reader.read(head, length), ReadStatus::kRecord) << "record " << i + 1;
      data = head.data();
    }
    ASSERT_EQ(length, r.size()) << "record " << i + 1;
    ASSERT_TRUE(std::equal(r.begin(), r.begin() + std::min<std::ptrdiff_t>(12, ssize(r)), data)) << "record " << i + 1;
    ASSERT_EQ(reader.next_record(), static_cast<std::int64_t>(i) + 2);
  }
  EXPECT_EQ(reader.read_in_place(length), nullptr);
  EXPECT_EQ(reader.read(head, length), ReadStatus::kEnd);
}

TEST(RecordBufferEnd, PointReaderTakesEveryRecordAlike) {
  test::ScratchDir dir;
  const std::vector<Bytes> records = make_records(true);
  CKvlBinaryResFileReader reader;
  ASSERT_EQ(reader.openPoints(write_file(dir, records).c_str()), 0);
  for (std::size_t i = 0; i < records.size(); ++i) {
    float x = 0, y = 0, z = 0;
    std::int32_t code = -1;
    std::int16_t flag = -1;
    ASSERT_EQ(reader.readPoint(x, y, z, &code, &flag), static_cast<std::int64_t>(i) + 1);
    const auto f = static_cast<float>(i);
    ASSERT_EQ(x, f);
    ASSERT_EQ(y, 0.5f * f);
    ASSERT_EQ(z, -0.25f * f);
    ASSERT_EQ(code, static_cast<std::int32_t>(i));
    ASSERT_EQ(flag, static_cast<std::int16_t>(i % 7));
  }
  float x = 0, y = 0, z = 0;
  EXPECT_EQ(reader.readPoint(x, y, z), 0);
  // Positioned reads land on the same records.
  ASSERT_EQ(reader.seekToPoint(3277), 0);
  std::int32_t code = -1;
  EXPECT_EQ(reader.readPoint(x, y, z, &code), 3277);
  EXPECT_EQ(code, 3276);
}

}  // namespace
}  // namespace zt
