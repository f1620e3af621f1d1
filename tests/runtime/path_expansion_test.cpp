// Path expansion: forms, statuses, diagnostics, normalisation, buffers, the
// existence-testing form and deletion.
#include "runtime/path_expansion.hpp"

#include <cstring>
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

TEST_F(ExpansionTest, DoubledSigilsAreLiterals) {
  EXPECT_EQ(expand("$$HOME").text, "$HOME");
  EXPECT_EQ(expand("??").text, "?");
  EXPECT_EQ(expand("a$$$$b??c").text, "a$$b?c");
}

TEST_F(ExpansionTest, EveryReferenceForm) {
  set_env("A", "va");
  set_env("PPATH", "vp");
  for (const char* form : {"$A", "${A}", "$(A)"}) {
    const Expanded e = expand(std::string("<") + form + ">");
    EXPECT_EQ(e.status, kExpandOk) << form;
    EXPECT_EQ(e.text, "<va>") << form;
  }
  for (const char* form : {"?P", "?{P}", "?(P)"}) EXPECT_EQ(expand(form).text, "vp") << form;
  // A bare name is the longest run of letters, digits and "_".
  set_env("A_1", "long");
  EXPECT_EQ(expand("$A_1.x").text, "long.x");
  // The bracketed name runs to the first matching closer, other brackets included.
  set_env("B", "vb");
  EXPECT_EQ(expand("$(B)}").text, "vb}");
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

TEST_F(ExpansionTest, SeparatorRunsBecomeOneSlash) {
  EXPECT_EQ(expand("a//b/c").text, "a/b/c");
  EXPECT_EQ(expand("a\\\\b\\c").text, "a/b/c");
  EXPECT_EQ(expand("//\\x/\\/y").text, "/x/y");
  set_env("D", "/d/");
  EXPECT_EQ(expand("$D/f").text, "/d/f");
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

}  // namespace
}  // namespace zt
