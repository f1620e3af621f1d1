// The driver side's fatal stop: layout of its three lines, filling of "%",
// exit status.
#include <gtest/gtest.h>
#include <unistd.h>

#include "driver/fatal_stop.hpp"

namespace zt {
namespace {

// The template pieces are filled in order. Regression: a "%" in an inserted
// file name is never filled, and a "%" left when the values run out stays as
// it is instead of reading past them.
TEST(FatalStop, RegressionInsertedTextAndMissingValues) {
  const std::int32_t v[] = {2, 4};
  EXPECT_EQ(fatal_stop_text({stop_template("Fichier "), stop_inserted("/t/100%_%d.txt"),
                             stop_template(" iomode= %, err= %")},
                            v),
            "Fichier /t/100%_%d.txt iomode= 2, err= 4");
  const std::int32_t one[] = {7}, negative[] = {-12};
  EXPECT_EQ(fatal_stop_text({stop_template("a=% b=% c=%")}, one), "a=7 b=% c=%");
  EXPECT_EQ(fatal_stop_text({stop_template("mode=%")}, negative), "mode=-12");
  EXPECT_EQ(fatal_stop_text({stop_template("100%")}, {}), "100%");
}

// The lines go to standard output; the child sends them to its standard error
// so the death test can see them.
TEST(FatalStop, PrintsThreeLinesAndStopsWithZero) {
  const std::int32_t v[] = {1, 3};
  auto stop = [&] {
    ::dup2(2, 1);
    fatal_stop("opensq", {stop_template("Fichier "), stop_inserted("x%y"), stop_template(" iomode= %, err= %")}, v);
  };
  EXPECT_EXIT(stop(),
      ::testing::ExitedWithCode(0),
      "^ Fatal error in opensq : \n Fichier x%y iomode= 1, err= 3\n Program terminated.\n$");
  // A blank routine leaves out the first line; the buffer form trims the message.
  const char routine[] = "   ";
  const char message[] = "mode=%    ";
  const std::int32_t rl = 3, ml = 10, count = 1;
  const std::int32_t four[] = {4};
  auto stop_blank = [&] {
    ::dup2(2, 1);
    fatal_stop(routine, rl, message, ml, four, count);
  };
  EXPECT_EXIT(stop_blank(),
      ::testing::ExitedWithCode(0), "^ mode=4\n Program terminated.\n$");
}

}  // namespace
}  // namespace zt
