// The configuration files beyond the cases of data/configuration.cases:
// random files, and the diagnostics' routing.
#include "runtime/environment.hpp"

#include <random>
#include <string>

#include "runtime/diagnostics.hpp"
#include "runtime/path_expansion.hpp"
#include "runtime_fixture.hpp"

namespace zt {
namespace {

class EnvironmentTest : public testing::RuntimeTest {};

// Random lines of configuration syntax: the reader ends every file with a
// result, whatever the diagnostics (recorded here, so fatal ones return).
TEST_F(EnvironmentTest, RandomConfigurationFilesNeverCrash) {
  const char* const pieces[] = {"/if ", "/else", "/endif", "/ifx", "(", ")", "{", "}", "==", "!=",
                                "[var]", "[", "]", "=", "+", "++", "#", "##", " ", "\t", "\r",
                                "\n", "X", "Y", "1", "\x01", "\xff"};
  std::mt19937 random(777);
  for (int round = 0; round < 100; ++round) {
    std::string content;
    for (int i = 0; i < 60; ++i) content += pieces[random() % std::size(pieces)];
    write_file("test.cfg", content);
    ConfigTable table;
    load_messages(path("test.cfg"), table);
    table.value("var", "X");
    table.value("var", "Y");
  }
  SUCCEED();
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
