// The configuration files: syntax, conditions, "+" references, the order of
// the ?ENV overloads, installation lookup, and the diagnostics' routing.
#include "runtime/environment.hpp"

#include <algorithm>
#include <random>
#include <string>

#include "runtime/detail/runtime_state.hpp"
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

TEST_F(ConfigFileTest, SectionsEntriesAndComments) {
  ASSERT_TRUE(load("  # a comment\n"
                   "A = before any section\n"
                   "[var]\r\n"
                   "  NAME   =   spaced value   \n"
                   "HASH = a##b # comment\n"
                   "EMPTY =\n"
                   "EQ = x=y\n"
                   "[path]\n"
                   "NAME = other\n"));
  EXPECT_EQ(table_.value("", "A"), "before any section");
  EXPECT_EQ(var("NAME"), "spaced value");
  EXPECT_EQ(var("name"), "spaced value");
  EXPECT_EQ(var("HASH"), "a#b");
  EXPECT_EQ(var("EMPTY"), "");
  EXPECT_EQ(var("EQ"), "x=y");
  EXPECT_EQ(table_.value("path", "NAME"), "other");
  EXPECT_FALSE(table_.value("VAR", "NAME").has_value());  // sections match exactly
  EXPECT_EQ(table_.origin("var", "NAME"), "from '" + path("test.cfg") + "' line 4");
  EXPECT_TRUE(fatals.empty());
  EXPECT_TRUE(warnings.empty());
}

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

TEST_F(ConfigFileTest, ConditionsSelectLines) {
  set_env("MODE", "fast");
  ASSERT_TRUE(load("[var]\n"
                   "/if MODE\nA = defined\n/else\nA = undefined\n/endif\n"
                   "/if NOPE\nB = defined\n/else\nB = undefined\n/endif\n"
                   "/if (MODE == fast)\nC = eq\n/endif\n"
                   "/if {MODE != fast}\nD = ne\n/else\nD = not ne\n/endif\n"
                   "/if MODE==slow\nE = 1\n/else\n  /if MODE\n  E = nested\n  /endif\n/endif\n"
                   "X = 1\n/if X == 1\nF = from table\n/endif\n"));
  EXPECT_EQ(var("A"), "defined");
  EXPECT_EQ(var("B"), "undefined");
  EXPECT_EQ(var("C"), "eq");
  EXPECT_EQ(var("D"), "not ne");
  EXPECT_EQ(var("E"), "nested");
  EXPECT_EQ(var("F"), "from table");
  EXPECT_TRUE(warnings.empty());
  // A compared variable that is not defined: warned, and the condition is false.
  ASSERT_TRUE(load("/if NOPE == 1\n[var]\nG = 1\n/else\n[var]\nG = 2\n/endif\n"));
  EXPECT_EQ(var("G"), "2");
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0],
            "load_messages: file '" + path("test.cfg") + "' line 1, unknown variable : 'NOPE'\n");
  // Conditions inside a skipped block are not evaluated.
  warnings.clear();
  ASSERT_TRUE(load("/if NOPE\n/if OTHER == 1\n/endif\n/endif\n"));
  EXPECT_TRUE(warnings.empty());
}

TEST_F(ConfigFileTest, SevenNestedConditionsAndNoMore) {
  set_env("ON", "1");
  std::string seven;
  for (int i = 0; i < 7; ++i) seven += "/if ON\n";
  seven += "[var]\nDEEP = yes\n";
  for (int i = 0; i < 7; ++i) seven += "/endif\n";
  ASSERT_TRUE(load(seven));
  EXPECT_EQ(var("DEEP"), "yes");
  EXPECT_FALSE(load("/if ON\n" + seven + "/endif\n"));
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], fatal_text(8, "too many nested conditions: /if ON"));
}

TEST_F(ConfigFileTest, StructureErrorsAreFatal) {
  const std::pair<const char*, std::string> cases[] = {
      {"/else\n", fatal_text(1, "'/else' without '/if'")},
      {"\n/endif\n", fatal_text(2, "'/endif' without '/if'")},
      {"/include x\n", fatal_text(1, "Unknown keyword : '/include'")},
      {"/if A = 1\n/endif\n", fatal_text(1, "invalid condition: /if A = 1")},
      {"/if (A\n/endif\n", fatal_text(1, "invalid condition: /if (A")},
      {"/if\n/endif\n", fatal_text(1, "invalid condition: /if")},
      {"/if A\n/else\n/else\n/endif\n", fatal_text(3, "'/else' without '/if'")},
      {"/if A\n[var]\nX = 1\n", fatal_text(-1, "'/if' without '/endif' at end of file.")},
  };
  for (const auto& [content, expected] : cases) {
    fatals.clear();
    EXPECT_FALSE(load(content)) << content;
    ASSERT_EQ(fatals.size(), 1u) << content;
    EXPECT_EQ(fatals[0], expected);
  }
  fatals.clear();
  table_.clear();
  EXPECT_FALSE(load_messages(path("absent.cfg"), table_));
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "load_messages: file '" + path("absent.cfg") +
                           "', line 0 : Error opening file - No such file or directory");
}

TEST_F(ConfigFileTest, PlusRefersToReplacedEntry) {
  write_file("a.cfg", "[var]\nLIST = a\nPLAIN = a+b++c\nCase = 1\n");
  write_file("b.cfg", "[var]\nLIST = +;b\nCASE = 2\n");
  write_file("c.cfg", "[var]\nLIST = c;+;++\n");
  ConfigTable table;
  for (const char* f : {"a.cfg", "b.cfg", "c.cfg"}) ASSERT_TRUE(load_messages(path(f), table));
  EXPECT_EQ(table.value("var", "LIST"), "c;a;b;+");
  EXPECT_EQ(table.value("var", "PLAIN"), "ab+c");  // nothing to refer to: "+" dropped
  EXPECT_EQ(table.value("var", "case"), "2");      // replaced by the exact name only,
  EXPECT_EQ(table.value("var", "Case"), "2");      // but the newest entry answers
  EXPECT_EQ(table.origin("var", "LIST"), "from '" + path("c.cfg") + "' line 2");
  const auto references = std::count_if(traces.begin(), traces.end(), [](const std::string& t) {
    return t.rfind("   ", 0) == 0 && t.find(" -> from '") != std::string::npos;
  });
  EXPECT_GE(references, 2);
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

TEST_F(EnvironmentTest, OverloadsFromLastEnvDirectoryToFirst) {
  write_install_config("[var]\nWHO = install\nLIST = i\n[path]\nENV = " + path("first") + ";" +
                       path("home/config") + "/ ;" + path("missing") + "," + path("second") + ";" +
                       path("FIRST") + "\n");
  write_file("first/environ.cfg", "[var]\nWHO = first\nLIST = +;f\n/if WINDOWS\nWIN = yes\n/endif\n");
  write_file("second/environ.cfg", "[var]\nWHO = second\nLIST = +;s\n");
  load_environment();
  EXPECT_EQ(traces.front(), "LOADING ENVIRONMENT FILES ....");
  EXPECT_EQ(traces.back(), "LOADING ENVIRONMENT FILES ....done.");
  EXPECT_STREQ(get_variable("WHO"), "first");
  EXPECT_STREQ(get_variable("LIST"), "i;s;f");
  EXPECT_STREQ(get_variable("WIN"), "yes");
  EXPECT_EQ(configuration().origin("var", "PC"), "set by program");
  const auto overloads = std::count_if(traces.begin(), traces.end(), [](const std::string& t) {
    return t.rfind("Overloading '", 0) == 0;
  });
  EXPECT_EQ(overloads, 3);  // first, second, missing; the repeats are skipped
  EXPECT_TRUE(fatals.empty());
}

TEST_F(EnvironmentTest, InstallationDirectory) {
  EXPECT_EQ(detail::installation_directory_from("/opt/k/exe/msw/restzones"), "/opt/k");
  EXPECT_EQ(detail::installation_directory_from("/opt/k/EXE/Linux/restzones"), "/opt/k");
  EXPECT_EQ(detail::installation_directory_from("/opt/k\\exe\\msw\\p"), "/opt/k");
  EXPECT_EQ(detail::installation_directory_from("/opt/k/bin/restzones"), "");
  EXPECT_EQ(detail::installation_directory_from("/exe/msw/p"), "/");
  EXPECT_EQ(detail::installation_directory_from("p"), "");

  unset_env("KVLHOME");
  set_env("KVLHOME_LS", path("home"));
  write_install_config("[var]\nFROM = ls\n");
  EXPECT_STREQ(get_variable("FROM"), "ls");
  EXPECT_STREQ(std::getenv("KVLHOME"), path("home").c_str());
}

TEST_F(EnvironmentTest, MissingInstallationIsFatal) {
  unset_env("KVLHOME");
  EXPECT_EQ(get_variable("ANYTHING"), nullptr);
  ASSERT_EQ(fatals.size(), 1u);
  EXPECT_EQ(fatals[0], "The environment variable 'KVLHOME' is not defined\n");

  fatals.clear();
  detail::reset_runtime_state();
  set_env("KVLHOME", path("nowhere/"));
  load_environment();
  ASSERT_EQ(fatals.size(), 2u);
  EXPECT_EQ(fatals[1], "Error loading '" + path("nowhere/config/environ.cfg"));
}

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
