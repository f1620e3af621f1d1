// A suite environment for tests that expand names: $TMP is a scratch
// directory (KVLTMPDIR), ?TXT a second one (TXTPATH), KVLLANG "fr", an
// installation directory with an empty configuration so that undefined
// variables never reach a real one, and no message texts read yet.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <string>

#include "driver/detail/message_tables.hpp"
#include "test_files.hpp"

namespace zt::test {

class SuiteEnv : public ::testing::Test {
 protected:
  void SetUp() override {
    std::filesystem::create_directories(home.path() / "config");
    write_text((home.path() / "config" / "environ.cfg").string(), "[var]\n");
    std::filesystem::create_directories(txt_dir());
    ::setenv("KVLHOME", home.path().c_str(), 1);
    ::setenv("KVLTMPDIR", tmp.path().c_str(), 1);
    ::setenv("TXTPATH", txt_dir().c_str(), 1);
    ::setenv("KVLLANG", "fr", 1);
    ::unsetenv("KVLNULL");
    detail::reset_message_tables();
  }
  std::string txt_dir() const { return (home.path() / "txt").string(); }
  std::string txt(const std::string& name) const { return txt_dir() + "/" + name; }

  ScratchDir home;
  ScratchDir tmp;
};

}  // namespace zt::test
