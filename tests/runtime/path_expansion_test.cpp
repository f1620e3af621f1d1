// Path expansion: forms, statuses, diagnostics, normalisation, buffers, the
// existence-testing form and deletion.
#include "runtime/path_expansion.hpp"

#include <cstring>
#include <random>
#include <string>

#include "runtime/environment.hpp"
#include "runtime_fixture.hpp"

namespace zt {
namespace {

using testing::RuntimeTest;

struct Expanded {
  std::int32_t status;
  std::string text;
};

Expanded expand(const std::string& input, std::int32_t capacity = 512) {
  std::string buffer(static_cast<std::size_t>(capacity > 0 ? capacity : 1), '\0');
  std::memcpy(buffer.data(), input.c_str(), std::min(input.size() + 1, buffer.size()));
  const std::int32_t status = expand_path(buffer.data(), capacity);
  return {status, buffer.c_str()};
}

class ExpansionTest : public RuntimeTest {};

TEST_F(ExpansionTest, FormsLiteralsAndNormalisation) {
  set_env("A", "va");
  set_env("PPATH", "vp");
  set_env("A_1", "long");
  set_env("D", "/d/");
  const struct {
    const char* input;
    const char* text;
  } cases[] = {
      {"<$A>", "<va>"}, {"<${A}>", "<va>"}, {"<$(A)>", "<va>"},
      {"?P", "vp"}, {"?{P}", "vp"}, {"?(P)", "vp"},
      {"$A_1.x", "long.x"},  // a bare name: the longest run of letters, digits, "_"
      {"$(A)}", "va}"},      // a bracketed name ends at the first matching closer
      {"$$HOME", "$HOME"}, {"??", "?"}, {"a$$$$b??c", "a$$b?c"},
      {"a//b/c", "a/b/c"}, {"a\\\\b\\c", "a/b/c"}, {"//\\x/\\/y", "/x/y"}, {"$D/f", "/d/f"},
  };
  for (const auto& c : cases) {
    const Expanded e = expand(c.input);
    EXPECT_EQ(e.status, kExpandOk) << c.input;
    EXPECT_EQ(e.text, c.text) << c.input;
  }
  EXPECT_TRUE(warnings.empty());
}

TEST_F(ExpansionTest, UnclosedBracketIsSyntaxErrorAndBufferUnchanged) {
  const Expanded e = expand("${A");
  EXPECT_EQ(e.status, kExpandSyntax);
  EXPECT_EQ(e.text, "${A");
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], "_Expand(\"${A\") = error -31 - syntax error");
  EXPECT_EQ(expand("?(P").status, kExpandSyntax);
}

TEST_F(ExpansionTest, UndefinedVariableVanishesWithStatus43) {
  const Expanded e = expand("x$A/y");
  EXPECT_EQ(e.status, kExpandUndefined);
  EXPECT_EQ(e.text, "x/y");
  EXPECT_TRUE(warnings.empty());  // -43 is no error
  set_env("KVLNULL", "<$>");
  EXPECT_EQ(expand("$A").text, "<A>");
  EXPECT_EQ(expand("$A").status, kExpandUndefined);
  set_env("KVLNULL", "none");
  EXPECT_EQ(expand("?Q").text, "none");
  set_env("KVLNULL", "$-$");  // only the first "$" is the name
  EXPECT_EQ(expand("${A}").text, "A-$");
}

TEST_F(ExpansionTest, CapacityBoundary) {
  set_env("V", "abcd");
  EXPECT_EQ(expand("$V", 5).status, kExpandOk);  // 4 characters and the zero
  const Expanded e = expand("$V", 4);
  EXPECT_EQ(e.status, kExpandTooSmall);
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], "_Expand(\"$V\") = error -32 - buffer size 4 too small");
  char out[5];
  std::int32_t status = 0;
  expand_name("abcd", 4, out, 5, status);
  EXPECT_EQ(status, kExpandOk);
  expand_name("abcde", 5, out, 5, status);
  EXPECT_EQ(status, kExpandTooSmall);
  EXPECT_STREQ(out, "abcd");  // unchanged
  // In place, the unchanged input is what stays.
  char buffer[8] = "$X";
  set_env("X", "12345678");
  EXPECT_EQ(expand_path(buffer, 8), kExpandTooSmall);
  EXPECT_STREQ(buffer, "$X");
}

TEST_F(ExpansionTest, InvalidArguments) {
  EXPECT_EQ(expand_path(nullptr, 10), kExpandInvalid);
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], "_Expand(<nullptr>) = error -44 - invalid argument");
  char unterminated[3] = {'a', 'b', 'c'};
  EXPECT_EQ(expand_path(unterminated, 3), kExpandInvalid);
  char out[16];
  std::int32_t status = 0;
  expand_name("x", -1, out, 16, status);
  EXPECT_EQ(status, kExpandInvalid);
  expand_name("x", 1, out, 0, status);
  EXPECT_EQ(status, kExpandInvalid);
}

TEST_F(ExpansionTest, ValuesAreExpandedRecursively) {
  set_env("A", "$B/x");
  set_env("B", "?{C}");
  set_env("CPATH", "y");
  EXPECT_EQ(expand("$A").text, "y/x");
  set_env("B", "$U");  // an undefined reference deep inside still gives -43
  EXPECT_EQ(expand("$A").status, kExpandUndefined);
  set_env("B", "${U");
  EXPECT_EQ(expand("$A").status, kExpandSyntax);
}

// Regression: a variable whose value refers to itself used to recurse until
// the stack overflowed.
TEST_F(ExpansionTest, SelfReferenceStopsAtFixedDepth) {
  set_env("A", "x$A");
  const Expanded e = expand("$A");
  EXPECT_EQ(e.status, kExpandSyntax);
  EXPECT_EQ(e.text, "$A");
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], "_Expand(\"$A\") = error -31 - syntax error");
  // 32 levels of nesting still expand.
  const auto var = [](char letter, int i) { return std::string(1, letter) + std::to_string(i); };
  const auto ref = [&](char letter, int i) { return std::string(1, '$') += var(letter, i); };
  for (int i = 0; i < 32; ++i) set_env(var('L', i), ref('L', i + 1));
  set_env("L32", "end");
  EXPECT_EQ(expand("$L0").text, "end");
  set_env("L32", "$L33");
  set_env("L33", "end");
  EXPECT_EQ(expand("$L0").status, kExpandSyntax);
  // Values that double at each level are cut off, not left to run for hours.
  for (int i = 0; i < 30; ++i)
    set_env(var('M', i), ref('M', i + 1) += ref('M', i + 1));
  set_env("M30", "");
  EXPECT_EQ(expand("$M0").status, kExpandSyntax);
}

TEST_F(ExpansionTest, ConfigurationValuesAndPathVariables) {
  write_install_config("[var]\nFOO = bar \t\n[path]\nTXT = /texts  \n");
  EXPECT_EQ(expand("$FOO/?TXT").text, "bar/texts");
  set_env("FOO", "env");  // the environment comes first
  EXPECT_EQ(expand("$foo$FOO").text, "barenv");  // entry names match without case
  set_env("TXTPATH", "/env-texts");
  EXPECT_EQ(expand("?TXT").text, "/env-texts");
  EXPECT_EQ(expand("$WINDOWS$PC").text, "11");
}

TEST_F(ExpansionTest, ZoneChangeHookRunsBeforeKvlzoneLookup) {
  static int calls = 0;
  calls = 0;
  set_zone_change_hook([](const char* name) {
    ++calls;
    EXPECT_STREQ(name, "KVLZONE");
    ::setenv("KVLZONE", "/zone", 1);
  });
  unset_env("KVLZONE");
  EXPECT_EQ(expand("$KVLZONE/a").text, "/zone/a");
  EXPECT_EQ(calls, 1);
  set_zone_change_hook(nullptr);
}

TEST_F(ExpansionTest, DriverFormsTrimBlankPaddedNames) {
  set_env("A", "dir");
  char out[32];
  std::int32_t status = 1;
  const char name[] = "$A/f.bin       ";
  expand_name(name, static_cast<std::int32_t>(sizeof name - 1), out, 32, status);
  EXPECT_EQ(status, kExpandOk);
  EXPECT_STREQ(out, "dir/f.bin");
  std::string converted;
  EXPECT_EQ(expand_to_string("$A//x", converted), kExpandOk);
  EXPECT_EQ(converted, "dir/x");
}

TEST_F(ExpansionTest, ExpandExistingStatuses) {
  set_env("D", dir_);
  write_file("here.txt", "x");
  char out[512];
  std::int32_t status = 0;
  const std::string present = "$D/here.txt";
  expand_existing(present.c_str(), static_cast<std::int32_t>(present.size()), out, 512, status);
  EXPECT_EQ(status, kExpandOk);
  EXPECT_EQ(std::string(out), path("here.txt"));
  expand_existing("$D", 2, out, 512, status);  // a directory counts
  EXPECT_EQ(status, kExpandOk);
  expand_existing("    ", 4, out, 512, status);
  EXPECT_EQ(status, kExpandNotFound);
  expand_existing("${D", 3, out, 512, status);
  EXPECT_EQ(status, kExpandSyntax);
}

// Regression: a missing file used to leave the output empty, so the callers
// that create the file (open modes 2 and 3) had no name.
TEST_F(ExpansionTest, ExpandExistingDeliversNameOfMissingFile) {
  set_env("D", dir_);
  char out[512] = "stale";
  std::int32_t status = 0;
  expand_existing("$D/new.bin", 10, out, 512, status);
  EXPECT_EQ(status, kExpandNotFound);
  EXPECT_EQ(std::string(out), path("new.bin"));
}

TEST_F(ExpansionTest, ExpandExistingSearchesPathVariableList) {
  write_file("d2/sub/t.txt", "2");
  write_file("d3/sub/t.txt", "3");
  set_env("D", dir_);
  set_env("TXTPATH", path("d1") + "; $D/d2 ," + path("d3"));
  char out[512];
  std::int32_t status = 0;
  expand_existing("?TXT/sub/t.txt", 14, out, 512, status);
  EXPECT_EQ(status, kExpandOk);
  EXPECT_EQ(std::string(out), path("d2/sub/t.txt"));
  expand_existing("?TXT\\none.txt", 13, out, 512, status);
  EXPECT_EQ(status, kExpandNotFound);
  EXPECT_EQ(std::string(out), path("d1/none.txt"));  // the first candidate
  set_env("PPATH", dir_);
  expand_existing("?P/d3", 5, out, 512, status);
  EXPECT_EQ(std::string(out), path("d3"));
  EXPECT_EQ(status, kExpandOk);
}

TEST_F(ExpansionTest, DeleteFileByExpandableName) {
  set_env("D", dir_);
  write_file("gone.tmp", "x");
  std::int32_t status = 1;
  delete_file("$D/gone.tmp  ", 13, status);
  EXPECT_EQ(status, kExpandOk);
  EXPECT_FALSE(exists("gone.tmp"));
  delete_file("$D/gone.tmp", 11, status);
  EXPECT_EQ(status, kExpandNotFound);
  write_file("a,b", "x");
  delete_file("$D/a,b", 6, status);
  EXPECT_EQ(status, kExpandOk);
  EXPECT_FALSE(exists("a,b"));
}

// Random texts over the expansion's alphabet: only the documented statuses,
// the buffer untouched on error, and a result that is a normalised path.
TEST_F(ExpansionTest, RandomTextsKeepTheInvariants) {
  set_env("A", "a/");
  set_env("B", "$A\\$A");
  set_env("CPATH", "?{B}");
  const std::string alphabet = "$?{}()/\\ABCxy_";
  std::mt19937 random(12345);
  for (int round = 0; round < 3000; ++round) {
    std::string input;
    const int length = static_cast<int>(random() % 12);
    for (int i = 0; i < length; ++i) input.push_back(alphabet[random() % alphabet.size()]);
    const std::int32_t capacity = 1 + static_cast<std::int32_t>(random() % 24);
    if (input.size() + 1 > static_cast<std::size_t>(capacity)) continue;
    const Expanded e = expand(input, capacity);
    switch (e.status) {
      case kExpandOk:
      case kExpandUndefined:
        EXPECT_LT(e.text.size(), static_cast<std::size_t>(capacity)) << input;
        EXPECT_EQ(e.text.find('\\'), std::string::npos) << input;
        EXPECT_EQ(e.text.find("//"), std::string::npos) << input;
        break;
      case kExpandSyntax:
      case kExpandTooSmall:
        EXPECT_EQ(e.text, input);
        break;
      default:
        ADD_FAILURE() << input << " gave " << e.status;
    }
  }
}

TEST_F(ExpansionTest, SmallBufferHuntingAids) {
  set_env("KVL_EXPAND_MIN_BUFFER_SIZE", "-512");
  set_env("KVL_EXPAND_LOGFILE_NAME", path("expand.log"));
  expand("a", 512);  // in place: 512 is below 513
  char out[600];
  std::int32_t status;
  expand_name("b", 1, out, 600, status);  // large enough: not logged
  const std::string log = read_file("expand.log").value_or("");
  EXPECT_EQ(log.rfind(" expanding 'a'", 0), 0u) << log;
  EXPECT_NE(log.find("MinBufferSize="), std::string::npos);
  EXPECT_EQ(log.find("'b'"), std::string::npos);
  set_env("KVL_EXPAND_WATCH", "watched");
  EXPECT_DEATH(expand("watched/name", 16), "");
  unset_env("KVL_EXPAND_MIN_BUFFER_SIZE");
  set_env("KVL_BUFFER_TOO_SMALL_OPTION", "crash");
  EXPECT_DEATH(expand_name("toolong", 7, out, 4, status), "");
  expand_name("fits", 4, out, 5, status);
  EXPECT_EQ(status, kExpandOk);
}

}  // namespace
}  // namespace zt
