// zonetool run as a program on the rows of data/zonetool.txt: exact output
// bytes, messages and exit statuses.
#include <gtest/gtest.h>

#include "support/data_table.hpp"
#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"

namespace zt::test {
namespace {

const std::string kData = ZT_TEST_DATA_DIR;

void expect_stream(const std::string& got, const std::string& want, const char* which) {
  if (want.starts_with('~')) {
    EXPECT_NE(got.find(want.substr(1)), std::string::npos) << which << got;
  } else if (want != "*") {
    EXPECT_EQ(got, want.starts_with('@') ? read_text(kData + "/" + want.substr(1)) : unescape(want)) << which;
  }
}

class ZonetoolRuns : public ::testing::TestWithParam<Row> {};

TEST_P(ZonetoolRuns, AsListed) {
  const Row& row = GetParam();
  ScratchDir dir;
  write_text(dir.file("in"), unescape(row[2]));
  std::string args = row[1];
  for (std::size_t at; (at = args.find("$D")) != std::string::npos;) args.replace(at, 2, kData);
  for (std::size_t at; (at = args.find("$T")) != std::string::npos;) args.replace(at, 2, dir.path().string());
  const CommandRun r =
      run_command(zonetool_path() + " " + args + " <'" + dir.file("in") + "' 2>'" + dir.file("err") + "'");
  EXPECT_EQ(r.status, std::stoi(row[3]));
  expect_stream(r.out, row[4], "standard output");
  expect_stream(read_text(dir.file("err")), row[5], "standard error");
}

INSTANTIATE_TEST_SUITE_P(Rows, ZonetoolRuns, ::testing::ValuesIn(read_table("zonetool.txt", 6)), row_name);

}  // namespace
}  // namespace zt::test
