// zonetool run as a program on the rows of data/zonetool.txt: exact output
// bytes, what the output holds (svg drawings), messages and exit statuses.
#include <gtest/gtest.h>

#include "support/case_rows.hpp"
#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"

namespace zt::test {
namespace {

const std::string kData = ZT_TEST_DATA_DIR;

// TEXT exactly, @FILE the bytes of a data file, ~TEXT held, ^TEXT at the
// start, #N TEXT held N times, * anything.
void expect_stream(const std::string& got, const std::string& want, const char* which) {
  const std::string text = want.empty() ? "" : Unescape(want.substr(1));
  if (want.starts_with('~')) {
    EXPECT_NE(got.find(text), std::string::npos) << which << got;
  } else if (want.starts_with('^')) {
    EXPECT_EQ(got.rfind(text, 0), 0u) << which << got;
  } else if (want.starts_with('#')) {
    const std::string what = text.substr(text.find(' ') + 1);
    int n = 0;
    for (auto at = got.find(what); at != std::string::npos; at = got.find(what, at + 1)) ++n;
    EXPECT_EQ(n, std::stoi(text)) << which << got;
  } else if (want != "*") {
    EXPECT_EQ(got, want.starts_with('@') ? read_text(kData + "/" + want.substr(1)) : Unescape(want)) << which;
  }
}

class ZonetoolRuns : public CaseRows {};

TEST_P(ZonetoolRuns, AsListed) {
  ScratchDir dir;
  write_text(dir.file("in"), Unescape(row().field(1)));
  std::string args = row().field(0);
  for (std::size_t at; (at = args.find("$D")) != std::string::npos;) args.replace(at, 2, kData);
  for (std::size_t at; (at = args.find("$T")) != std::string::npos;) args.replace(at, 2, dir.path().string());
  const CommandRun r =
      run_command(zonetool_path() + " " + args + " <'" + dir.file("in") + "' 2>'" + dir.file("err") + "'");
  EXPECT_EQ(r.status, std::stoi(row().field(2)));
  expect_stream(r.out, row().field(3), "standard output");
  expect_stream(read_text(dir.file("err")), row().field(4), "standard error");
}

INSTANTIATE_TEST_SUITE_P(Rows, ZonetoolRuns, RowsOf("zonetool.txt"), RowName);

}  // namespace
}  // namespace zt::test
