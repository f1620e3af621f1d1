// The configuration files beyond the cases of data/configuration.cases:
// random files.
#include "runtime/environment.hpp"

#include <random>
#include <string>

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

}  // namespace
}  // namespace zt
