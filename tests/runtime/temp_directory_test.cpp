// The workzone temporary directory: KVLTMPDIR, the workzone number files and
// their counter, and the failures that must never yield a directory at the
// filesystem root.
#include <filesystem>
#include <string>

#include "runtime/path_expansion.hpp"
#include "runtime_fixture.hpp"

namespace zt {
namespace {

class TempDirectoryTest : public testing::RuntimeTest {
 protected:
  // A workzone whose own number file does not exist yet.
  void new_workzone(const std::string& counter) {
    std::filesystem::create_directories(path("zone"));
    write_file("conf/workzone.num", counter);
    set_env("KVLZONE", path("zone"));
    set_env("KVLCONF", path("conf"));
    set_env("KVLTMP", path("tmp"));
  }
  std::string tmp_expansion(std::int32_t& status) {
    std::string out = "untouched";
    status = expand_to_string("$TMP/erreur.tmp", out);
    return out;
  }
};

TEST_F(TempDirectoryTest, KvltmpdirIsTakenAsIs) {
  set_env("KVLTMPDIR", path("forced"));
  ASSERT_NE(temp_directory(), nullptr);
  EXPECT_EQ(std::string(temp_directory()), path("forced"));
  std::int32_t status;
  EXPECT_EQ(tmp_expansion(status), path("forced/erreur.tmp"));
  EXPECT_EQ(status, kExpandOk);
  EXPECT_TRUE(fatals.empty());          // KVLZONE is unset: it was never needed
  EXPECT_FALSE(exists("forced"));       // and nothing is created
  // An empty KVLTMPDIR would put $TMP at the filesystem root: it counts as unset.
  set_env("KVLTMPDIR", "");
  EXPECT_EQ(temp_directory(), nullptr);
  EXPECT_EQ(fatals.at(0), "KVLZONE is not defined\n");
}

TEST_F(TempDirectoryTest, NewWorkzoneTakesNextCounterNumber) {
  new_workzone("0000000f\n");
  const char* dir = temp_directory();
  ASSERT_NE(dir, nullptr) << (fatals.empty() ? "" : fatals[0]);
  EXPECT_EQ(std::string(dir), path("tmp/00000010"));
  EXPECT_TRUE(std::filesystem::is_directory(dir));
  EXPECT_EQ(read_file("conf/workzone.num"), "00000010\n");
  EXPECT_EQ(read_file("zone/workzone.num"), "00000010\n");
  // Later uses keep the number; a removed directory is created again.
  std::filesystem::remove(dir);
  EXPECT_EQ(std::string(temp_directory()), path("tmp/00000010"));
  EXPECT_TRUE(std::filesystem::is_directory(path("tmp/00000010")));
  EXPECT_EQ(read_file("conf/workzone.num"), "00000010\n");
  EXPECT_TRUE(fatals.empty());
}

TEST_F(TempDirectoryTest, CounterWithCrlfAndJunk) {
  new_workzone("0000000f\r\nsecond line\r\n");
  ASSERT_NE(temp_directory(), nullptr);
  EXPECT_EQ(read_file("conf/workzone.num"), "00000010\n");  // shorter file: truncated
  testing::RuntimeTest::TearDown();
  testing::RuntimeTest::SetUp();
  new_workzone("not hex\n");
  ASSERT_NE(temp_directory(), nullptr);
  EXPECT_EQ(read_file("zone/workzone.num"), "00000001\n");
}

TEST_F(TempDirectoryTest, ExistingWorkzoneNumberIsKept) {
  new_workzone("0000000f\n");
  write_file("zone/workzone.num", "0000002a  \r\n");
  ASSERT_NE(temp_directory(), nullptr);
  EXPECT_EQ(std::string(temp_directory()), path("tmp/0000002a"));
  EXPECT_EQ(read_file("conf/workzone.num"), "0000000f\n");
}

TEST_F(TempDirectoryTest, CounterFallsBackToInstallation) {
  new_workzone("");
  unset_env("KVLCONF");
  write_file("home/client/kvlconf/workzone.num", "000000ff\n");
  ASSERT_NE(temp_directory(), nullptr);
  EXPECT_EQ(std::string(temp_directory()), path("tmp/00000100"));
  EXPECT_EQ(read_file("home/client/kvlconf/workzone.num"), "00000100\n");
  EXPECT_TRUE(fatals.empty());
}

// Regression: an undefined KVLZONE, KVLCONF or KVLTMP expanded to a name at
// the filesystem root ("/workzone.num", "/00000010").
TEST_F(TempDirectoryTest, UndefinedWorkzoneVariablesAreErrors) {
  set_env("KVLTMP", path("tmp"));
  set_env("KVLNULL", "");
  EXPECT_EQ(temp_directory(), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "KVLZONE is not defined\n");
  std::int32_t status;
  EXPECT_EQ(tmp_expansion(status), "untouched");
  EXPECT_NE(status, kExpandOk);
  EXPECT_NE(status, kExpandUndefined);

  fatals.clear();
  set_env("KVLZONE", "");  // empty is no better than undefined
  EXPECT_EQ(temp_directory(), nullptr);
  EXPECT_EQ(fatals.at(0), "KVLZONE is not defined\n");

  fatals.clear();
  new_workzone("0\n");
  set_env("KVLTMP", "");
  EXPECT_EQ(temp_directory(), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "KVLTMP is not defined\n");

  fatals.clear();
  std::filesystem::remove(path("zone/workzone.num"));
  set_env("KVLTMP", path("tmp"));
  unset_env("KVLCONF");
  set_env("KVLHOME", "");  // neither KVLCONF nor an installation counter
  EXPECT_EQ(temp_directory(), nullptr);
  ASSERT_FALSE(fatals.empty());
  EXPECT_FALSE(exists("/workzone.num"));
}

TEST_F(TempDirectoryTest, FileFailuresAreFatal) {
  new_workzone("1\n");
  std::filesystem::remove(path("conf/workzone.num"));
  EXPECT_EQ(temp_directory(), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "Error opening '" + path("conf/workzone.num") + "' file\n");

  fatals.clear();
  write_file("conf/workzone.num", "");
  EXPECT_EQ(temp_directory(), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "Error reading '" + path("conf/workzone.num") + "' file\n");

  fatals.clear();
  write_file("conf/workzone.num", "1\n");
  write_file("tmp", "a file where the directory should go");
  EXPECT_EQ(temp_directory(), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "Could not create temporary directory '" + path("tmp/00000002") + "'");
}

TEST_F(TempDirectoryTest, DefaultFatalHandlerEndsWithStatusMinusOne) {
  EXPECT_EXIT(
      {
        set_fatal_handler(nullptr);
        temp_directory();
      },
      ::testing::ExitedWithCode(255), "KVLZONE is not defined");
}

}  // namespace
}  // namespace zt
