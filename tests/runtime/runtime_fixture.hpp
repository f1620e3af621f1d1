// Shared fixture of the runtime tests: a fresh directory per test, the
// process environment saved and restored, the runtime's process state reset,
// and diagnostics recorded instead of printed (a recorded fatal text returns,
// so the code under test must carry on safely).
#pragma once

#include <gtest/gtest.h>

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "support/scratch_dir.hpp"

namespace zt::testing {

class RuntimeTest : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  void set_env(const std::string& name, const std::string& value);
  void unset_env(const std::string& name);

  // Paths are relative to the test's directory.
  std::string path(const std::string& relative) const { return dir_ + "/" + relative; }
  void write_file(const std::string& relative, const std::string& content) const;
  std::optional<std::string> read_file(const std::string& relative) const;

  static std::vector<std::string> fatals;
  static std::vector<std::string> warnings;
  static std::vector<std::string> traces;

  std::string dir_;

 private:
  test::ScratchDir scratch_;
  std::map<std::string, std::optional<std::string>> saved_env_;
};

}  // namespace zt::testing
