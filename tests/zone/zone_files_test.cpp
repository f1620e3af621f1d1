// The files of the zone builder: the contour store (the level rules of the
// scan, the z lookup's cursor, the level read with its tags, the refusals of
// a full table and an unreadable level); the scratch files (byte layout,
// round trips, positions past 4 GB, every failure reported: reads past the
// end, a full disk, a failed close); the offset distance of zstock.ok and
// the merge radius of grid.tmp (the rows of data/parameter_files.txt).
#include <gtest/gtest.h>
#include <unistd.h>

#include <cmath>
#include <filesystem>

#include "support/case_rows.hpp"
#include "zone/contour_store.hpp"
#include "zone/parameter_files.hpp"
#include "zone/scratch_file.hpp"
#include "zone_test_support.hpp"

namespace zt::testing {
namespace {

class ContourStoreTest : public ZoneTmpTest {
 protected:
  // Writes the file, opens it as wf_add_level does and scans it.
  int load(const std::string& bytes) {
    write_file("contour.bin", bytes);
    store_ = ContourStore{};
    store_.reader = std::make_unique<CKvlBinaryResFileReader>(false);
    if (store_.reader->openPoints(path("contour.bin").c_str()) != 0) return -100;
    return load_contours(store_, read_contour_record);
  }
  void expect_level(int i, std::int64_t first, std::int64_t last, float z) {
    ASSERT_LT(i, store_.levelCount);
    EXPECT_EQ(store_.levels[i].first, first) << "level " << i;
    EXPECT_EQ(store_.levels[i].last, last) << "level " << i;
    EXPECT_EQ(store_.levels[i].z, z) << "level " << i;
  }

  ContourStore store_;
};

TEST_F(ContourStoreTest, LevelsSpanTheirSeparatorsAndReadBackWithTags) {
  const std::vector<Rec> recs{kSep,        kSep,        {1, 2, 10, 3}, {3, 4, 10, -2}, kSep,
                              {5, 6, 10},  {7, 8, 10},  kSep,          {1, 1, 5},      {2, 2, 5},
                              kSep};
  for (bool header : {false, true}) {
    ASSERT_EQ(load(record_bytes(recs, 18, header)), 0);
    ASSERT_EQ(store_.levelCount, 2);
    expect_level(0, 3, 8, 10.0f);
    expect_level(1, 9, 11, 5.0f);
    EXPECT_EQ(store_.recordIndex, 0);

    TaggedPointList list;
    ASSERT_EQ(read_contour_level(store_, 0, list), 0);
    ASSERT_EQ(list.count(), 6);
    const std::int32_t tags[] = {3, -2, kSeparatorTag, 1, 1, kSeparatorTag};
    for (int k = 0; k < 6; ++k) EXPECT_EQ(list[k].tag, tags[k]) << k;
    EXPECT_EQ(list[0].x, 1.0);
    EXPECT_EQ(list[2].x, 99999.0);  // separators keep their coordinates
    EXPECT_EQ(list[4].y, 8.0);
    list.Clear();
    ASSERT_EQ(read_contour_level(store_, 1, list), 0);
    EXPECT_EQ(list.count(), 3);
    EXPECT_EQ(read_contour_level(store_, 2, list), -1);
    EXPECT_EQ(read_contour_level(store_, -1, list), -1);
  }
}

TEST_F(ContourStoreTest, OnlyADropBeyondTheToleranceOpensALevel) {
  ASSERT_EQ(load(record_bytes({{0, 0, 10}, {1, 0, 12}, {2, 0, 10}, {3, 0, 9.9995f}, {4, 0, 9.998f},
                               kSep, {5, 0, 9.9975f}},
                              12)),
            0);
  // 12 rises, 9.9995 drops 0.0005: level 0. 9.998 drops 0.002: level 1, whose
  // own z then governs (9.9975 is only 0.0005 below it).
  ASSERT_EQ(store_.levelCount, 2);
  expect_level(0, 1, 4, 10.0f);
  expect_level(1, 5, 7, 9.998f);
}

TEST_F(ContourStoreTest, LookupCursorOnlyMovesForward) {
  ASSERT_EQ(load(record_bytes({{0, 0, 10}, {0, 0, 5}, {0, 0, 0}}, 12)), 0);
  ASSERT_EQ(store_.levelCount, 3);
  // Each lookup in turn: z, the level found, the cursor after it.
  const struct { double z; int level, cursor; } steps[] = {
      {10.00005, 0, 0}, {10.0, 0, 0},  // the same z twice
      {7.0, -1, 1},                    // between 10 and 5
      {10.0, -1, 1},                   // above the cursor's level
      {std::nan(""), -1, 1}, {1e300, -1, 1}, {4.99995, 1, 1},
      {-3.0, -1, 3},  // below everything
      {0.0, -1, 3}};
  for (const auto& s : steps) {
    EXPECT_EQ(find_contour_level(store_, s.z), s.level) << s.z;
    EXPECT_EQ(store_.levelCursor, s.cursor) << s.z;
  }
}

TEST_F(ContourStoreTest, FilesWithoutPointRecords) {
  for (const std::vector<Rec>& recs : {std::vector<Rec>{}, std::vector<Rec>{kSep, kSep}}) {
    ASSERT_EQ(load(record_bytes(recs, 18)), 0);
    ASSERT_EQ(store_.levelCount, 1);
    EXPECT_EQ(store_.levels[0].z, 99999.0f);
    EXPECT_EQ(find_contour_level(store_, 0.0), -1);
    TaggedPointList list;
    EXPECT_EQ(read_contour_level(store_, 0, list), 0);
    EXPECT_EQ(list.count(), 0);
  }
}

// Regression: records without a flag once gave their points whatever bytes
// the previous read had left; they carry the suite's flag 1.
TEST_F(ContourStoreTest, ShortRecordsGetTagOne) {
  for (int width : {12, 16}) {
    ASSERT_EQ(load(record_bytes({{1, 1, 3, 7}, {2, 2, 3, 7}, kSep}, width)), 0);
    TaggedPointList list;
    ASSERT_EQ(read_contour_level(store_, 0, list), 0);
    std::vector<std::int32_t> tags;
    for (const TaggedPoint& p : list) tags.push_back(p.tag);
    EXPECT_EQ(tags, (std::vector<std::int32_t>{1, 1, kSeparatorTag})) << width;
  }
}

TEST_F(ContourStoreTest, RefusesATooLongFileAndAnUnreadableLevel) {
  std::vector<Rec> recs;
  for (int i = 0; i <= kMaxContourLevels; ++i) recs.push_back({0, 0, -0.01f * i});
  EXPECT_EQ(load(record_bytes(recs, 12)), -1);
  recs.pop_back();
  EXPECT_EQ(load(record_bytes(recs, 12)), 0);
  EXPECT_EQ(store_.levelCount, kMaxContourLevels);

  // A level range that runs past the records the file holds (as after the
  // file lost its tail) cannot be read whole: the level fails.
  ASSERT_EQ(load(record_bytes({{0, 0, 1}, {1, 0, 1}, {1, 1, 1}, {0, 0, 1}, kSep}, 18)), 0);
  store_.levels[0].last += 1;
  TaggedPointList list;
  EXPECT_EQ(read_contour_level(store_, 0, list), -1);
  store_.levels[0] = {7, 7, 1.0f};
  EXPECT_EQ(read_contour_level(store_, 0, list), -1);

  ContourStore none;
  EXPECT_EQ(load_contours(none, read_contour_record), -1);
}

class ScratchFiles : public ZoneTmpTest {};

TEST_F(ScratchFiles, LayoutRoundTripAndReopenKeepsTheContents) {
  ScratchFile f;
  ASSERT_EQ(f.create(path("t").c_str()), 0);
  const Point2f pts[2] = {{1.0f, -2.0f}, {99999.0f, 99999.0f}};
  std::int32_t written = 0;
  ASSERT_EQ(write_points(f, pts, 2, written), 0);
  EXPECT_EQ(written, 2);
  ASSERT_EQ(f.close(), 0);
  const std::string bytes = read_file("t");
  ASSERT_EQ(bytes.size(), 16u);
  EXPECT_EQ(bytes.substr(0, 8), std::string("\x00\x00\x80\x3f\x00\x00\x00\xc0", 8));
  ASSERT_EQ(f.reopen(path("t").c_str()), 0);
  Point2f back[2];
  ASSERT_EQ(read_points(f, back, 1, 1), 0);
  EXPECT_EQ(back[0].x, 99999.0f);
  // Appends go after point `written`, wherever reads left the position.
  ASSERT_EQ(read_points(f, back, 1, 0), 0);
  ASSERT_EQ(write_points(f, pts, 1, written), 0);
  ASSERT_EQ(f.close(), 0);
  EXPECT_EQ(read_file("t").size(), 24u);
  EXPECT_EQ(f.reopen(path("absent").c_str()), -1);
}

TEST_F(ScratchFiles, ReadsPastTheEndAndBadCallsFail) {
  ScratchFile f;
  Point2f p[4];
  EXPECT_EQ(read_points(f, p, 1, 0), -1);  // not open
  EXPECT_EQ(read_points(f, p, 0, 0), 0);   // nothing asked
  ASSERT_EQ(f.create(path("t").c_str()), 0);
  std::int32_t written = 0;
  ASSERT_EQ(write_points(f, p, 3, written), 0);
  EXPECT_EQ(read_points(f, p, 4, 0), -1);
  EXPECT_EQ(read_points(f, p, 1, 3), -1);
  EXPECT_EQ(read_points(f, p, 1, -1), -1);
}

// Regression: positions were formed in 32 bits, so a point beyond 4 GB was
// read from the wrong place.
TEST_F(ScratchFiles, PositionsBeyondFourGigabytes) {
  ScratchFile f;
  ASSERT_EQ(f.create(path("big").c_str()), 0);
  const std::int64_t start = (std::int64_t{1} << 32) / kScratchPointBytes + 3;
  ASSERT_EQ(::ftruncate(::fileno(f.stream()), start * kScratchPointBytes), 0);
  std::int32_t written = static_cast<std::int32_t>(start);
  const Point2f p{7.0f, 8.0f};
  ASSERT_EQ(write_points(f, &p, 1, written), 0);
  Point2f back{};
  ASSERT_EQ(read_points(f, &back, 1, start), 0);
  EXPECT_EQ(back.y, 8.0f);
  EXPECT_EQ(std::filesystem::file_size(path("big")), static_cast<std::uintmax_t>(start + 1) * 8);
}

// Regression: a write the disk refused went unnoticed.
TEST_F(ScratchFiles, AFullDiskIsAFailure) {
  if (!std::filesystem::exists("/dev/full")) GTEST_SKIP() << "no /dev/full";
  ScratchFile f;
  ASSERT_EQ(f.create("/dev/full"), 0);
  const Point2f p[3] = {};
  std::int32_t written = 0;
  EXPECT_EQ(write_points(f, p, 3, written), -1);
  ASSERT_EQ(f.create("/dev/full"), 0);
  std::fwrite("x", 1, 1, f.stream());
  EXPECT_EQ(f.close(), -1);
  EXPECT_FALSE(f.isOpen());
}

class ParameterFiles : public ZoneTmpTest, public ::testing::WithParamInterface<test::Row> {};

// CONTENT <none>: no such file, which changes nothing.
TEST_P(ParameterFiles, ValueAsListed) {
  ASSERT_EQ(GetParam().error, "");
  const std::string file = GetParam().field(0), content = GetParam().field(1), value = GetParam().field(2);
  if (content != "<none>") write_file(file, test::Unescape(content));
  if (file == "zstock.ok") {
    double d = 1.0;
    read_offset_distance(path(file).c_str(), d);
    EXPECT_EQ(d, std::strtod(value.c_str(), nullptr));
  } else {
    float r = 10.0f;
    EXPECT_EQ(read_merge_radius(path(file).c_str(), r), content == "<none>" ? -1 : 0);
    EXPECT_EQ(r, std::strtof(value.c_str(), nullptr));
  }
}

INSTANTIATE_TEST_SUITE_P(Rows, ParameterFiles, test::RowsOf("parameter_files.txt"), test::RowName);

}  // namespace
}  // namespace zt::testing
