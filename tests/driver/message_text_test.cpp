// Message texts by number: lookup, the not-found text, the fixed general
// file, loading once, and the limits of the shared tables.
#include <gtest/gtest.h>
#include <unistd.h>

#include "driver/detail/message_tables.hpp"
#include "driver/message_text.hpp"
#include "suite_env.hpp"

namespace zt {
namespace {

class MessageText : public test::SuiteEnv {
 protected:
  void SetUp() override {
    test::SuiteEnv::SetUp();
    detail::reset_message_tables();
  }
  std::string numbered(int lines, std::size_t width = 0) {
    std::string s;
    for (int i = 1; i <= lines; ++i) {
      std::string line = "line " + std::to_string(i);
      if (width > line.size()) line += std::string(width - line.size(), 'x');
      s += line + "\n";
    }
    return s;
  }
};

TEST_F(MessageText, LinesByNumberAndTheNotFoundText) {
  const std::string f = tmp.file("three.txt");
  test::write_text(f, "first\n\nthird   \r\n");
  EXPECT_EQ(chtext(f, 1), "first");
  EXPECT_EQ(chtext(f, 2), "");  // blank lines count
  EXPECT_EQ(chtext(f, 3), "third");
  EXPECT_EQ(chtext(f, 4), "No text in file \"" + f + "\" at line 4");
  EXPECT_EQ(chtext(f, 0), "No text in file \"" + f + "\" at line 0");

  const std::string m = "$TMP/none.txt";
  EXPECT_EQ(chtext(m, 2), "No text in file \"$TMP/none.txt\" at line 2(file not found)");
  // Loaded once, also when missing: a file that appears later is not read.
  test::write_text(tmp.file("none.txt"), "a\nb\n");
  EXPECT_EQ(chtext(m, 2), "No text in file \"$TMP/none.txt\" at line 2(file not found)");
  test::write_text(f, "changed\n");
  EXPECT_EQ(chtext(f, 1), "first");
}

TEST_F(MessageText, BufferFormCutsPadsAndMeasures) {
  const std::string f = tmp.file("long.txt");
  test::write_text(f, numbered(200, 90));
  char buffer[80];
  std::int32_t length = -1;
  const std::string name = f + "      ";
  chtext(name.data(), static_cast<std::int32_t>(name.size()), 139, buffer, 80, length);
  const std::string expected = ("line 139" + std::string(90, 'x')).substr(0, 70);
  EXPECT_EQ(length, 70);
  EXPECT_EQ(std::string(buffer, 80), expected + std::string(10, ' '));
  char small[5];
  chtext(name.data(), static_cast<std::int32_t>(name.size()), 2, small, 5, length);
  EXPECT_EQ(std::string(small, 5), "line ");
  EXPECT_EQ(length, 4);
  // A long name: the not-found text is cut at 70 characters.
  const std::string far = "$TMP/" + std::string(100, 'n');
  EXPECT_EQ(chtext(far, 3).size(), 70u);
}

TEST_F(MessageText, GeneralFileIsExpandedOnceAndRemembered) {
  test::write_text(txt("textg.fr"), numbered(139) + "more\n");
  test::write_text(txt("texte.fr"), "twin one\n");
  char buffer[80];
  std::int32_t length = 0;
  message_text(139, buffer, 80, length);
  EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)), "line 139");
  message_text_e(1, buffer, 80, length);
  EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)), "twin one");
  ::setenv("KVLLANG", "en", 1);
  message_text(140, buffer, 80, length);
  EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)), "more");
}

TEST_F(MessageText, MissingGeneralFile) {
  char buffer[80];
  std::int32_t length = 0;
  message_text(139, buffer, 80, length);
  std::string expected = ("No text in file \"" + txt("textg.fr") + "\" at line 139(file not found)").substr(0, 70);
  while (expected.back() == ' ') expected.pop_back();
  EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)), expected);
}

// Regression: the tables are never written past. The eleventh file and the
// 1001st line are refused with the fatal stop that says so (the file name's
// "%" left as it is).
TEST_F(MessageText, RegressionTableLimitsAreRefusedClearly) {
  for (int i = 0; i < kMaxMessageFiles; ++i) chtext(tmp.file(std::string("f").append(std::to_string(i))), 1);
  const std::string eleventh = tmp.file("100%.txt");
  auto load_eleventh = [&] {
    ::dup2(2, 1);
    chtext(eleventh, 1);
  };
  EXPECT_EXIT(load_eleventh(), ::testing::ExitedWithCode(0),
              "^ Fatal error in chtext \\(\\$RCSfile: chtexg,v \\$\\) : \n Cannot load \".*/100%.txt\" - maximum of "
              "10 files only.\n Program terminated.\n$");

  detail::reset_message_tables();
  test::write_text(tmp.file("a.txt"), numbered(600));
  test::write_text(tmp.file("b.txt"), numbered(400));
  test::write_text(tmp.file("c.txt"), numbered(1));
  EXPECT_EQ(chtext(tmp.file("a.txt"), 600), "line 600");
  EXPECT_EQ(chtext(tmp.file("b.txt"), 400), "line 400");  // exactly 1000 lines in all
  EXPECT_EQ(chtext(tmp.file("a.txt"), 1), "line 1");
  auto overflow = [&] {
    ::dup2(2, 1);
    chtext(tmp.file("c.txt"), 1);
  };
  EXPECT_EXIT(overflow(), ::testing::ExitedWithCode(0),
              "Internal array \"texte\" too small \\(1000\\) to load file \".*c.txt\".\n Program terminated.\n$");
}

}  // namespace
}  // namespace zt
