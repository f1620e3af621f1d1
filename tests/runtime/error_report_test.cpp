// The error report's ends of the process: a stop that leaves the empty
// marker, and the fatal report with its exit status (the marker, the
// message file and the console echo of a running process: data/report.cases).
#include "runtime/error_report.hpp"

#include <sys/stat.h>

#include <cctype>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "runtime_fixture.hpp"

namespace zt {
namespace {

class ErrorReportTest : public testing::RuntimeTest {
 protected:
  void SetUp() override {
    RuntimeTest::SetUp();
    std::filesystem::create_directories(path("tmp"));
    set_env("KVLTMPDIR", path("tmp"));
  }
};

TEST_F(ErrorReportTest, StopOnErrorLeavesEmptyMarker) {
  EXPECT_EXIT(
      {
        const std::int32_t length = 23;
        report_begin(nullptr);
        report_message("Pas de Zones de Reprise", length);
        std::exit(0);
      },
      ::testing::ExitedWithCode(0), "");
  EXPECT_EQ(read_file("tmp/erreur.tmp"), std::nullopt);
  // The child's marker carries the child's pid: exactly one marker, empty.
  int markers = 0;
  for (const auto& entry : std::filesystem::directory_iterator(path("tmp"))) {
    const std::string name = entry.path().filename().string();
    if (name.rfind("erreur.tmp.", 0) != 0) continue;
    ++markers;
    EXPECT_EQ(std::filesystem::file_size(entry.path()), 0u);
  }
  EXPECT_EQ(markers, 1);
  EXPECT_EQ(read_file("tmp/kvlerror.prg"), "Pas de Zones de Reprise");
}

// Why a marker could not be made, for the one line the program shows; and a
// message file that is a FIFO without a reader fails at once, never waits.
TEST_F(ErrorReportTest, FailuresSayWhyAndNeverWait) {
  std::string reason;
  set_env("KVLTMPDIR", path("missing"));
  EXPECT_EQ(report_begin(nullptr, reason), -1);
  EXPECT_NE(reason.find(path("missing") + "/erreur.tmp."), std::string::npos) << reason;
  EXPECT_NE(reason.find("No such file or directory"), std::string::npos) << reason;
  set_env("KVLTMPDIR", path("tmp"));
  EXPECT_EQ(report_begin(nullptr, reason), 0);
  EXPECT_EQ(reason, "");
  EXPECT_EQ(report_end(), 0);
  ASSERT_EQ(::mkfifo(path("tmp/kvlerror.prg").c_str(), 0600), 0);
  EXPECT_EQ(report_message("x", 1), -1);
}

TEST_F(ErrorReportTest, FatalReportAndExitStatus) {
  EXPECT_EXIT(
      {
        const std::string text = "boom   ";
        report_fatal(7, text.data(), static_cast<std::int32_t>(text.size()));
      },
      ::testing::ExitedWithCode(7), "");
  const std::optional<std::string> file = read_file("tmp/kvlerror.prg");
  ASSERT_TRUE(file.has_value());
  // "dd-mm-yyyy hh:mm:ss", then the number, the message and the program.
  const std::string stamp_shape = "00-00-0000 00:00:00";
  ASSERT_GT(file->size(), stamp_shape.size());
  for (std::size_t i = 0; i < stamp_shape.size(); ++i)
    EXPECT_EQ(std::isdigit(static_cast<unsigned char>((*file)[i])) ? '0' : (*file)[i], stamp_shape[i]);
  const std::string rest = file->substr(stamp_shape.size());
  const std::string head = "\nError number 7: boom\n in program /";
  EXPECT_EQ(rest.substr(0, head.size()), head);
  EXPECT_EQ(rest.substr(rest.size() - 13), "runtime_tests");

  std::filesystem::remove(path("tmp/kvlerror.prg"));
  EXPECT_EXIT(report_fatal(0, "x", 1), ::testing::ExitedWithCode(255), "");
  EXPECT_EXIT(report_fatal(-3, "x", 1), ::testing::ExitedWithCode(253), "");
  // Regression: 256 used to end with the status 0 of a normal end.
  EXPECT_EXIT(report_fatal(256, "x", 1), ::testing::ExitedWithCode(255), "");
  EXPECT_NE(read_file("tmp/kvlerror.prg")->find("Error number -3: x"), std::string::npos);
}

}  // namespace
}  // namespace zt
