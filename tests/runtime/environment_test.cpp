// The configuration files beyond the cases of data/configuration.cases:
// malformed and overlong lines, self-extending references, random files, and the
// diagnostics' routing.
#include "runtime/environment.hpp"

#include <random>
#include <string>

#include "runtime/diagnostics.hpp"
#include "runtime/path_expansion.hpp"
#include "runtime_fixture.hpp"

namespace zt {
namespace {

class ConfigFileTest : public testing::RuntimeTest {
 protected:
  // Loads `content` as a file of its own into a fresh table.
  bool load(const std::string& content) {
    write_file("test.cfg", content);
    table_.clear();
    return load_messages(path("test.cfg"), table_);
  }
  std::string var(const std::string& name) { return table_.value("var", name).value_or("<none>"); }
  std::string fatal_text(int line, const std::string& text) {
    return "load_messages: file '" + path("test.cfg") + "', line " + std::to_string(line) +
           " : " + text;
  }
  ConfigTable table_;
};

TEST_F(ConfigFileTest, MalformedLinesWarnAndAreSkipped) {
  ASSERT_TRUE(load("[var]\nno equals sign\n" + std::string(1025, 'x') + "=1\nOK = 1\n"));
  ASSERT_EQ(warnings.size(), 2u);
  EXPECT_EQ(warnings[0], "load_messages: [file '" + path("test.cfg") +
                             "' line 2] Warning - incorrect format (missing '='): [var] no equals sign\n");
  EXPECT_EQ(warnings[1], fatal_text(3, "Input line too long"));
  EXPECT_EQ(var("OK"), "1");
  ASSERT_TRUE(load("[var]\n" + std::string(1022, 'y') + "=1\n"));  // 1024 characters fit
  EXPECT_EQ(var(std::string(1022, 'y')), "1");
  // A section name of 100 characters or more: its entries are skipped, not
  // filed under the previous section.
  warnings.clear();
  ASSERT_TRUE(load("[var]\n[" + std::string(100, 's') + "]\nLOST = 1\n[var]\nKEPT = 1\n"));
  EXPECT_EQ(var("LOST"), "<none>");
  EXPECT_EQ(var("KEPT"), "1");
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], fatal_text(2, "Section name too long"));
}

// A long chain of self-extending entries resolves in linear time and is cut
// at a fixed size instead of exhausting memory.
TEST_F(ConfigFileTest, DoublingReferencesAreCut) {
  std::string content = "[var]\nX = ab\n";
  for (int i = 0; i < 80; ++i) content += "X = ++\n";  // literal "+": no reference
  ASSERT_TRUE(load(content));
  EXPECT_EQ(var("X"), "+");
  content = "[var]\nX = ab\n";
  for (int i = 0; i < 40; ++i) content += "X = +|+\n";  // 2^40 copies if uncut
  ASSERT_TRUE(load(content));
  EXPECT_LE(var("X").size(), kMaxResolvedValue);
  EXPECT_FALSE(warnings.empty());
}

// Random lines of configuration syntax: the reader ends every file with a
// result, whatever the diagnostics (recorded here, so fatal ones return).
TEST_F(ConfigFileTest, RandomFilesNeverCrash) {
  const char* const pieces[] = {"/if ", "/else", "/endif", "/ifx", "(", ")", "{", "}", "==", "!=",
                                "[var]", "[", "]", "=", "+", "++", "#", "##", " ", "\t", "\r",
                                "\n", "X", "Y", "1", "\x01", "\xff"};
  std::mt19937 random(777);
  for (int round = 0; round < 100; ++round) {
    std::string content;
    for (int i = 0; i < 60; ++i) content += pieces[random() % std::size(pieces)];
    load(content);
    var("X");
    var("Y");
  }
  SUCCEED();
}

class EnvironmentTest : public testing::RuntimeTest {};

TEST_F(EnvironmentTest, DefaultHandlersRouteByVerboseMode) {
  set_warning_handler(nullptr);
  set_trace_handler(nullptr);
  ::testing::internal::CaptureStdout();
  ::testing::internal::CaptureStderr();
  diagnose_warning("w1");
  diagnose_trace("t1");
  set_env("KVL_KVLFILES_VERBOSE", "off");
  diagnose_trace("t2");
  set_diagnostics_quiet(true);
  diagnose_warning("w2");
  set_env("KVL_KVLFILES_VERBOSE", "on");
  diagnose_warning("w3");
  diagnose_trace("t3");
  set_diagnostics_quiet(false);
  unset_env("KVL_KVLFILES_VERBOSE");
  set_diagnostics_to_stdout(true);
  diagnose_warning("w4");
  set_diagnostics_to_stdout(false);
  const std::string err = ::testing::internal::GetCapturedStderr();
  const std::string out = ::testing::internal::GetCapturedStdout();
  EXPECT_EQ(err, "w1\n");
  EXPECT_EQ(out, "w3\nt3\nw4\n");
}

}  // namespace
}  // namespace zt
