// Logical units over record files: unit numbers, reading the first three
// floats of records of any size, write_contour's bytes, and the record-layer
// faults that end the program (message naming file and record, exit status).
#include <gtest/gtest.h>
#include <unistd.h>

#include "driver/logical_units.hpp"
#include "driver/record_fault.hpp"
#include "driver/record_files.hpp"
#include "test_files.hpp"

namespace zt {
namespace {

using test::Bytes;

TEST(LogicalUnits, FreeUnitStartsAtThreeAndSkipsAttached) {
  test::ScratchDir dir;
  test::write_bytes(dir.file("a.bin"), test::record_file({}));
  EXPECT_EQ(free_unit(), 3);
  attach_record_input(3, dir.file("a.bin"));
  attach_record_input(4, dir.file("a.bin"));
  attach_record_input(6, dir.file("a.bin"));
  std::int32_t unit = 0;
  get_free_unit(unit);
  EXPECT_EQ(unit, 5);
  close_unit(4);
  EXPECT_EQ(free_unit(), 4);
  EXPECT_TRUE(unit_attached(3));
  EXPECT_FALSE(unit_attached(4));
  close_unit(3);
  close_unit(6);
  close_unit(6);  // a free unit: nothing happens
  EXPECT_EQ(free_unit(), 3);
}

TEST(WriteContour, ClosedSquareBytes) {
  test::ScratchDir dir;
  const Point2f square[] = {{0, 0}, {1, 0}, {1, 1}, {0, 1}, {0, 0}};
  const std::int32_t u = free_unit();
  attach_record_output(u, dir.file("s.bin"));
  std::int32_t ierr = 5;
  write_contour(5, square, 2.0f, u, ierr);
  EXPECT_EQ(ierr, 0);
  close_unit(u);
  const Bytes f = test::read_bytes(dir.file("s.bin"));
  ASSERT_EQ(f.size(), 122u);
  const Bytes prefix = {0x4b, 0x12, 0x80, 0x4f, 0xc3, 0x47, 0x80, 0x4f, 0xc3, 0x47, 0x80,
                        0x4f, 0xc3, 0x47, 0x17, 0xfc, 0xff, 0xff, 0x01, 0x00, 0x12};
  EXPECT_EQ(Bytes(f.begin(), f.begin() + 21), prefix);
  std::vector<Bytes> records = {test::separator()};
  for (const Point2f& p : square) records.push_back(test::point(p.x, p.y, 2.0f));
  EXPECT_EQ(f, test::record_file(records));
}

// Ends 0.002 apart: refused; 0.0009 apart: written. No points: refused,
// never a read before the array.
TEST(WriteContour, RefusesOpenAndEmptyContours) {
  test::ScratchDir dir;
  Point2f ring[] = {{0, 0}, {1, 0}, {1, 1}, {0, 1}, {0.002f, 0}};
  std::int32_t ierr = 0;
  attach_record_output(3, dir.file("o.bin"));
  write_contour(5, ring, 1.0f, 3, ierr);
  EXPECT_EQ(ierr, -1);
  write_contour(0, ring, 1.0f, 3, ierr);
  EXPECT_EQ(ierr, -1);
  ring[4].x = 0.0009f;
  close_unit(3);
  EXPECT_EQ(test::read_bytes(dir.file("o.bin")), (Bytes{0x4b, 0x82}));
  attach_record_output(3, dir.file("c.bin"));
  write_contour(5, ring, 1.0f, 3, ierr);
  EXPECT_EQ(ierr, 0);
  close_unit(3);
  EXPECT_EQ(test::read_bytes(dir.file("c.bin")).size(), 122u);
}

// Record-layer faults end the program with their own status and a message
// naming the file and the record (short and non-finite records: names.cases).
class RecordStops : public ::testing::Test {
 protected:
  void read_all(const std::string& path) {
    attach_record_input(3, path);
    float x, y, z;
    while (read_record_xyz(3, x, y, z)) {
    }
  }
  test::ScratchDir dir;
};

TEST_F(RecordStops, OpeningFaults) {
  EXPECT_EXIT(read_all(dir.file("missing.bin")), ::testing::ExitedWithCode(10),
              "missing.bin\", record 0: cannot read the file");
  EXPECT_EXIT(attach_record_output(3, dir.file("no/dir/out.bin")), ::testing::ExitedWithCode(11),
              "out.bin\", record 0: cannot write the file");
  // A unit used for what it was not opened for is no silent success.
  EXPECT_EXIT(write_point_record(9, 0, 0, 0, kPointCode, kPointFlag), ::testing::ExitedWithCode(11),
              "unit 9");
}

// Regression: a run that stops on a fault leaves no half-written record file
// (it would have no end marker, or worse, look complete); a finished one stays.
TEST_F(RecordStops, RegressionIncompleteOutputIsRemoved) {
  const std::string in = dir.file("short.bin");
  test::write_bytes(in, test::record_file({Bytes(4, 0)}));
  const std::string done = dir.file("done.bin");
  const std::string out = dir.file("stock2.bin");
  auto stop_while_writing = [&] {
    attach_record_output(4, done);
    close_unit(4);
    attach_record_output(5, out);
    const Point2f sq[] = {{0, 0}, {1, 0}, {0, 0}};
    std::int32_t ierr = 0;
    write_contour(3, sq, 1.0f, 5, ierr);
    read_all(in);
  };
  EXPECT_EXIT(stop_while_writing(), ::testing::ExitedWithCode(15), "short.bin\", record 1");
  EXPECT_FALSE(std::filesystem::exists(out));
  EXPECT_EQ(test::read_bytes(done), (Bytes{0x4b, 0x82}));
}

}  // namespace
}  // namespace zt
