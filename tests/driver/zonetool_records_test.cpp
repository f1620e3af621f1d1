// zonetool make and dump, run as the built program: the text round trip, the
// record sizes dump accepts, scratch point files, and refusals.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "test_files.hpp"

namespace zt {
namespace {

using test::Bytes;

class ZonetoolRecords : public ::testing::Test {
 protected:
  void SetUp() override {
    tool = std::string(ZT_BINARY_DIR) + "/tools/zonetool/zonetool";
    ASSERT_TRUE(std::filesystem::exists(tool)) << "build the zonetool target first: " << tool;
  }
  // Runs `zonetool ARGS <in >out 2>err`; returns the exit status.
  int run(const std::string& args, const std::string& input = "") {
    test::write_text(dir.file("in.txt"), input);
    const std::string cmd = tool + " " + args + " <" + dir.file("in.txt") + " >" + dir.file("out.txt") +
                            " 2>" + dir.file("err.txt");
    const int status = std::system(cmd.c_str());
    out = test::read_text(dir.file("out.txt"));
    err = test::read_text(dir.file("err.txt"));
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  test::ScratchDir dir;
  std::string tool, out, err;
};

TEST_F(ZonetoolRecords, MakeThenDumpGivesTheTextBack) {
  const std::string text =
      "0 0 2\n1 0 2\n1 1 2\n0 1 2\n0 0 2\n\n"
      "0.1 -3.5e-07 1.5\n12345.678 -99997.5 1.5\n1e-30 3.4028235e+38 1.5\n\n"
      "7 8 -1\n";
  const std::string bin = dir.file("m.bin");
  ASSERT_EQ(run("make " + bin, text), 0) << err;
  const Bytes f = test::read_bytes(bin);
  EXPECT_EQ(f.size(), 2u + 20u * (3 + 9));  // a separator in front of each contour
  EXPECT_EQ(Bytes(f.begin(), f.begin() + 21), (Bytes{0x4b, 0x12, 0x80, 0x4f, 0xc3, 0x47, 0x80, 0x4f, 0xc3, 0x47, 0x80,
                                                   0x4f, 0xc3, 0x47, 0x17, 0xfc, 0xff, 0xff, 0x01, 0x00, 0x12}));
  ASSERT_EQ(run("dump " + bin), 0) << err;
  EXPECT_EQ(out, text);
  // No contours at all: the empty record file, and dump prints nothing.
  ASSERT_EQ(run("make " + bin, ""), 0);
  EXPECT_EQ(test::read_bytes(bin), (Bytes{0x4b, 0x82}));
  ASSERT_EQ(run("dump " + bin), 0);
  EXPECT_EQ(out, "");
}

TEST_F(ZonetoolRecords, DumpReadsEveryPointRecordSize) {
  for (std::size_t size : {12u, 16u, 18u}) {
    SCOPED_TRACE(size);
    test::write_bytes(dir.file("s.bin"),
                      test::record_file({test::separator(size), test::point(1, 2, 3, size), test::point(4, 5, 3, size),
                                         test::separator(size), test::point(0.5f, 0.25f, 1, size)}));
    ASSERT_EQ(run("dump " + dir.file("s.bin")), 0) << err;
    EXPECT_EQ(out, "1 2 3\n4 5 3\n\n0.5 0.25 1\n");
  }
}

TEST_F(ZonetoolRecords, DumpPointsShowsSeparatorsAsBlankLines) {
  const float pairs[] = {1, 2, 3.5f, -4, 99999, 99999, 0.1f, 0.2f, 90000, 0};
  Bytes b(sizeof pairs);
  std::memcpy(b.data(), pairs, sizeof pairs);
  test::write_bytes(dir.file("temp1"), b);
  ASSERT_EQ(run("dump --points " + dir.file("temp1")), 0) << err;
  EXPECT_EQ(out, "1 2\n3.5 -4\n\n0.1 0.2\n\n");
  b.pop_back();
  test::write_bytes(dir.file("temp1"), b);
  EXPECT_EQ(run("dump --points " + dir.file("temp1")), 14);
  EXPECT_NE(err.find("record 5"), std::string::npos) << err;
}

TEST_F(ZonetoolRecords, RefusesBadTextAndBadFiles) {
  const std::string bin = dir.file("bad.bin");
  EXPECT_EQ(run("make " + bin, "1 2\n"), 2);
  EXPECT_NE(err.find("contour 1, point 1"), std::string::npos) << err;
  EXPECT_EQ(run("make " + bin, "1 2 3\n\n1 1e39 3\n"), 2);
  EXPECT_NE(err.find("contour 2, point 1"), std::string::npos) << err;
  EXPECT_EQ(run("make " + bin, "99999 1 3\n"), 2);
  EXPECT_EQ(run("make " + bin, "1 nan 3\n"), 2);
  EXPECT_FALSE(std::filesystem::exists(bin));
  EXPECT_EQ(run("make"), 2);
  EXPECT_EQ(run("dump"), 2);

  test::write_bytes(bin, Bytes{'x', 0x82});
  EXPECT_EQ(run("dump " + bin), 13);
  EXPECT_NE(err.find("bad.bin\", record 0"), std::string::npos) << err;
  test::write_bytes(bin, test::record_file({test::separator(), Bytes(10, 0)}));
  EXPECT_EQ(run("dump " + bin), 15);
  EXPECT_NE(err.find("record 2: record shorter than three floats"), std::string::npos) << err;
}

}  // namespace
}  // namespace zt
