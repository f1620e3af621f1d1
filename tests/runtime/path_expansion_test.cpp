// Path expansion beyond the cases of data/expansion.cases: arguments no text
// can carry, deep and doubling references, the zone hook, random texts, the
// small-buffer hunting aids, and the default fatal end of a missing workzone
// (and of a tracked block's fault).
#include "runtime/path_expansion.hpp"

#include <cstring>
#include <random>
#include <string>

#include "runtime/environment.hpp"
#include "runtime/tracked_alloc.hpp"
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

TEST_F(ExpansionTest, InvalidArguments) {
  EXPECT_EQ(expand_path(nullptr, 10), kExpandInvalid);
  ASSERT_EQ(warnings.size(), 1u);
  EXPECT_EQ(warnings[0], "_Expand(<nullptr>) = error -44 - invalid argument");
  char unterminated[3] = {'a', 'b', 'c'};
  EXPECT_EQ(expand_path(unterminated, 3), kExpandInvalid);
}

// Regression: a self-referring value used to recurse until the stack
// overflowed (the direct case is in the data); 32 levels of nesting still expand.
TEST_F(ExpansionTest, SelfReferenceStopsAtFixedDepth) {
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

TEST_F(ExpansionTest, DefaultFatalHandlerEndsWithStatusMinusOne) {
  EXPECT_EXIT(
      {
        set_fatal_handler(nullptr);
        temp_directory();
      },
      ::testing::ExitedWithCode(255), "KVLZONE is not defined");
  // The tracked allocator's faults end the same way.
  EXPECT_EXIT(
      {
        set_fatal_handler(nullptr);
        int local = 0;
        tracked_free(&local);
      },
      ::testing::ExitedWithCode(255), "Trying to free unallocated or corrupt memory");
}

}  // namespace
}  // namespace zt
