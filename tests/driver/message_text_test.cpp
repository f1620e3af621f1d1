// Message texts beyond the cases of data/messages.cases: the buffer form's
// cutting and padding, and the not-found text of a missing general file.
#include <gtest/gtest.h>

#include "driver/message_text.hpp"
#include "suite_env.hpp"

namespace zt {
namespace {

class MessageText : public test::SuiteEnv {};

TEST_F(MessageText, BufferFormCutsPadsAndMeasures) {
  const std::string f = tmp.file("long.txt");
  std::string lines;  // 200 lines of 90 characters
  for (int i = 1; i <= 200; ++i) lines += ("line " + std::to_string(i) + std::string(90, 'x')).substr(0, 90) + "\n";
  test::write_text(f, lines);
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

TEST_F(MessageText, MissingGeneralFile) {
  char buffer[80];
  std::int32_t length = 0;
  message_text(139, buffer, 80, length);
  std::string expected = ("No text in file \"" + txt("textg.fr") + "\" at line 139(file not found)").substr(0, 70);
  while (expected.back() == ' ') expected.pop_back();
  EXPECT_EQ(std::string(buffer, static_cast<std::size_t>(length)), expected);
}

}  // namespace
}  // namespace zt
