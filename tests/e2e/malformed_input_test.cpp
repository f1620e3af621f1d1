// A corpus of malformed inputs, each run through the real program: every run
// ends by itself (no signal, no hang, no sanitizer report) in one of the ways
// the suite understands, and where the way is known it is checked exactly.
//
// The ways: a record fault (its exit status, a message on standard error
// naming the file, marker left, no result); a stop (a French message in the
// message file, marker left, no result); a normal end (marker removed, a
// complete result file).
#include <gtest/gtest.h>

#include <cmath>
#include <functional>

#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

enum class End { kFault, kStop, kNormal, kEither };

struct Case {
  const char* name;
  std::function<void(ProgramRun&)> make;
  End end;
  int status = 0;            // kFault: the exit status
  const char* detail = "";   // kFault: the file named; kStop: the message
};

Bytes without_end_marker(Bytes b) {
  b.pop_back();
  return b;
}
Bytes cut(Bytes b, std::size_t keep) {
  b.resize(keep);
  return b;
}

// The usual run: a pocket on levels 10, 5, 0 and rest material on each.
void usual(ProgramRun& r) {
  r.parameters();
  r.put("contour.bin", pocket({10, 5, 0}));
  r.put("stock1.bin", rest({10, 5, 0}));
}
std::function<void(ProgramRun&)> with(const char* file, Bytes bytes) {
  return [file, bytes](ProgramRun& r) {
    usual(r);
    r.put(file, bytes);
  };
}
std::function<void(ProgramRun&)> with_stock(std::vector<Contour> stock) {
  return with("stock1.bin", records(stock));
}

const float kNan = std::nanf("");
const float kHuge = 1e30f;

std::vector<Case> corpus() {
  const Bytes contours = pocket({10, 5, 0});
  const Bytes stock = rest({10, 5, 0});
  Bytes badSegment = stock;
  badSegment[1 + 1 + kPointRecordBytes] = 17;  // trailing length of the first record
  return {
      {"EmptyContourFile", with("contour.bin", {}), End::kFault, 13, "contour.bin"},
      {"ContourWrongFirstByte", with("contour.bin", [&] { Bytes b = contours; b[0] = 'L'; return b; }()),
       End::kFault, 13, "contour.bin"},
      {"StockWrongFirstByte", with("stock1.bin", [&] { Bytes b = stock; b[0] = 0; return b; }()), End::kFault, 13,
       "stock1.bin"},
      {"ContourTruncatedInARecord", with("contour.bin", cut(contours, 50)), End::kFault, 14, "contour.bin"},
      {"StockTruncatedInARecord", with("stock1.bin", cut(stock, stock.size() - 7)), End::kFault, 14, "stock1.bin"},
      {"ContourWithoutEndMarker", with("contour.bin", without_end_marker(contours)), End::kFault, 14, "contour.bin"},
      {"StockWithoutEndMarker", with("stock1.bin", without_end_marker(stock)), End::kFault, 14, "stock1.bin"},
      {"SegmentLengthsDisagree", with("stock1.bin", badSegment), End::kFault, 14, "stock1.bin"},
      {"RecordShorterThanThreeFloats",
       with("stock1.bin", test::record_file({test::separator(), Bytes(8, 0)})), End::kFault, 15, "stock1.bin"},
      {"NanInRestMaterial", with_stock({{0, {{40, 40}, {60, 40}, {60, kNan}, {40, 60}, {40, 40}}}}), End::kFault, 16,
       "stock1.bin"},
      {"InfiniteFinishingZ", with("contour.bin", records({{INFINITY, rectangle(0, 0, 100, 100)}})), End::kFault, 16,
       "contour.bin"},
      {"HugeRestMaterial",
       with_stock({{0, {{-kHuge, -kHuge}, {kHuge, -kHuge}, {kHuge, kHuge}, {-kHuge, kHuge}, {-kHuge, -kHuge}}}}),
       End::kEither},
      {"HugeFinishingContour", with("contour.bin", records({{0, {{0, 0}, {kHuge, 0}, {kHuge, kHuge}, {0, kHuge}, {0, 0}}}})),
       End::kEither},
      {"HugeZ", with_stock({{kHuge, rectangle(40, 40, 60, 60)}}), End::kStop, 0, "Erreur dans wf_add_level"},
      {"NoPointRecordsInStock", with("stock1.bin", test::record_file({test::separator(), test::separator()})),
       End::kNormal},
      {"NoPointRecordsInContours", with("contour.bin", test::record_file({test::separator()})), End::kStop, 0,
       "Erreur dans wf_add_level"},
      {"EmptyRecordsInStock", with("stock1.bin", test::record_file({Bytes{}, Bytes{}})), End::kFault, 15,
       "stock1.bin"},
      {"ContourOfOnePoint", with_stock({{0, {{50, 50}}}}), End::kNormal},
      {"ContoursOfTwoAndThreePoints", with_stock({{5, {{40, 40}, {60, 60}}}, {0, {{40, 40}, {60, 40}, {50, 60}}}}),
       End::kNormal},
      {"TwoOpenContoursOfThreePoints",
       with_stock({{0, {{40, 40}, {60, 40}, {50, 60}}}, {0, {{20, 20}, {30, 20}, {25, 30}}}}), End::kEither},
      {"AllPointsEqual", with_stock({{0, {{50, 50}, {50, 50}, {50, 50}, {50, 50}, {50, 50}}}}), End::kEither},
      {"SelfTouchingRestMaterial",
       with_stock({{0, {{40, 40}, {50, 50}, {60, 40}, {60, 60}, {50, 50}, {40, 60}, {40, 40}}}}), End::kEither},
      {"CrossingRestMaterial", with_stock({{0, {{40, 40}, {60, 60}, {60, 40}, {40, 60}, {40, 40}}}}), End::kEither},
      {"SelfTouchingFinishingContour",
       with("contour.bin", records({{0, {{0, 0}, {50, 50}, {100, 0}, {100, 100}, {50, 50}, {0, 100}, {0, 0}}}})),
       End::kEither},
      {"RestMaterialOutsideThePocket", with_stock({{0, rectangle(200, 200, 220, 220)}}), End::kNormal},
      {"RestMaterialClockwise", with_stock({{0, rectangle(40, 40, 60, 60, true)}}), End::kEither},
      {"StockLevelsOutOfOrder", with("stock1.bin", rest({0, 10, 5})), End::kStop, 0,
       "Niveaux de Zones de Reprise non ordonnes en Z"},
      {"ContourLevelsOutOfOrder", with("contour.bin", pocket({5, 10, 0})), End::kStop, 0,
       "Niveaux de Finition non ordonnes en Z"},
      {"StockLevelTwice", with("stock1.bin", rest({10, 5, 10})), End::kStop, 0,
       "Niveaux de Zones de Reprise non ordonnes en Z"},
      {"StockBetweenFinishingLevels", with("stock1.bin", rest({7})), End::kStop, 0, "Erreur dans wf_add_level"},
      {"UnreadableParameterFiles",
       [](ProgramRun& r) {
         usual(r);
         r.put("zstock.ok", std::string("abc"));
         r.put("grid.tmp", std::string("x y z"));
       },
       End::kNormal},
      {"ParameterFilesAreDirectories",
       [](ProgramRun& r) {
         r.put("contour.bin", pocket({0}));
         r.put("stock1.bin", rest({0}));
         std::filesystem::create_directory(r.path("zstock.ok"));
         std::filesystem::create_directory(r.path("grid.tmp"));
       },
       End::kStop, 0, "Erreur dans wf_fin_czone"},
      {"ContourFileIsADirectory",
       [](ProgramRun& r) {
         usual(r);
         std::filesystem::remove(r.path("contour.bin"));
         std::filesystem::create_directory(r.path("contour.bin"));
       },
       End::kFault, 10, "contour.bin"},
  };
}

class MalformedInput : public ::testing::TestWithParam<Case> {};

TEST_P(MalformedInput, EndsWithAMessageOrAResult) {
  const Case& c = GetParam();
  ProgramRun r;
  c.make(r);
  const int status = r.run();
  ASSERT_NE(status, kTimedOut) << "hang";
  ASSERT_LT(status, 128) << "killed by signal " << status - 128;
  EXPECT_EQ(r.err.find("Sanitizer"), std::string::npos) << r.err;
  EXPECT_EQ(r.err.find("runtime error"), std::string::npos) << r.err;

  const bool normal = !r.marker_left();
  std::vector<Contour> zones;
  if (normal) {
    EXPECT_EQ(status, 0);
    EXPECT_EQ(r.messages(), "");
    EXPECT_TRUE(read_result(r.bytes("stock2.bin"), zones)) << "incomplete result";
  } else {
    EXPECT_FALSE(r.has("stock2.bin"));
    EXPECT_TRUE(!r.messages().empty() || !r.err.empty()) << "stopped without a message";
  }
  switch (c.end) {
    case End::kFault:
      EXPECT_EQ(status, c.status) << r.err;
      EXPECT_FALSE(normal);
      EXPECT_NE(r.err.find(c.detail), std::string::npos) << r.err;
      break;
    case End::kStop:
      EXPECT_EQ(status, 0) << r.err;
      EXPECT_EQ(r.messages(), c.detail);
      break;
    case End::kNormal:
      EXPECT_TRUE(normal) << r.out << r.messages();
      break;
    case End::kEither:
      EXPECT_TRUE(status == 0 || (status >= 1 && status <= 2) || status == 255) << status;
      break;
  }
}

INSTANTIATE_TEST_SUITE_P(Corpus, MalformedInput, ::testing::ValuesIn(corpus()),
                         [](const ::testing::TestParamInfo<Case>& i) { return std::string(i.param.name); });

}  // namespace
}  // namespace zt::e2e
