// restzones run as the suite runs it: every stop of its main sequence, the
// stock levels that reach the zone builder, the normal end, and what a
// record fault or an interrupted result write leave behind.
#include <gtest/gtest.h>

#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

// A stop: exit status 0, the message alone on its console line and in the
// message file, the status marker left, no result.
void expect_stop(const ProgramRun& r, int status, const std::string& message) {
  EXPECT_EQ(status, 0) << r.err;
  EXPECT_NE(r.out.find(message + "\n"), std::string::npos) << r.out;
  EXPECT_EQ(r.messages(), message);
  EXPECT_TRUE(r.marker_left());
  EXPECT_FALSE(r.has("stock2.bin"));
}

TEST(MainFlowStops, NoContourFile) {
  ProgramRun r;
  r.put("stock1.bin", rest({0}));
  expect_stop(r, r.run(), "Pas de Finition en Z");
  EXPECT_EQ(r.out, "Pas de Finition en Z\n");  // before the banner
  EXPECT_FALSE(r.has("temp1"));
}

TEST(MainFlowStops, ZoneBuilderCannotStart) {
  ProgramRun r;
  r.put("contour.bin", pocket({0}));
  r.put("stock1.bin", rest({0}));
  std::filesystem::create_directory(r.path("temp1"));  // its scratch file cannot be created
  expect_stop(r, r.run(), "Erreur dans wf_init_czone");
  EXPECT_EQ(r.out, "Erreur dans wf_init_czone\n");
}

TEST(MainFlowStops, NoStockFile) {
  ProgramRun r;
  r.put("contour.bin", pocket({0}));
  expect_stop(r, r.run(), "Pas de Zones de Reprise");
  EXPECT_EQ(r.out, "Pas de Zones de Reprise\n");
  EXPECT_TRUE(r.has("temp1"));  // the zone builder had started
}

TEST(MainFlowStops, StockLevelWithoutFinishingLevel) {
  ProgramRun r;
  r.parameters();
  r.put("contour.bin", pocket({10}));
  r.put("stock1.bin", rest({5}));
  expect_stop(r, r.run(), "Erreur dans wf_add_level");
  EXPECT_EQ(r.out.rfind(banner_and_scale(), 0), 0u) << r.out;
}

TEST(MainFlowStops, AssemblyFailsWithoutGridFileAndLeavesNoResult) {
  ProgramRun r;
  r.put("contour.bin", pocket({0}));
  r.put("stock1.bin", rest({0}));
  r.put("stock2.bin", std::string("result of an earlier run"));
  expect_stop(r, r.run(), "Erreur dans wf_fin_czone");
  EXPECT_GT(r.bytes("temp1").size(), 0u);  // the level was computed
}

TEST(MainFlowStops, LevelsNotFromTheTopDown) {
  {
    ProgramRun r;
    r.parameters();
    r.put("contour.bin", pocket({0, 5, 10}));
    r.put("stock1.bin", rest({10, 5, 0}));
    expect_stop(r, r.run(), "Niveaux de Finition non ordonnes en Z");
    EXPECT_FALSE(r.has("temp1"));
  }
  {
    ProgramRun r;
    r.parameters();
    r.put("contour.bin", pocket({10, 5, 0}));
    r.put("stock1.bin", rest({0, 5, 10}));
    expect_stop(r, r.run(), "Niveaux de Zones de Reprise non ordonnes en Z");
    EXPECT_EQ(r.out, "Niveaux de Zones de Reprise non ordonnes en Z\n");
  }
}

// A stock level whose finishing level is missing fails in wf_add_level: so a
// normal end shows the level never reached it.
TEST(MainFlowLevels, FourRecordsNeverReachTheZoneBuilderFiveDo) {
  const std::vector<std::vector<Contour>> four = {
      {{5, {{40, 40}, {60, 40}, {50, 60}, {40, 40}}}},       // a closed triangle
      {{5, {{40, 40}, {60, 40}}}, {5, {{50, 60}}}},           // 2 + separator + 1
  };
  const std::vector<std::vector<Contour>> five = {
      {{5, rectangle(40, 40, 60, 60)}},
      {{5, {{40, 40}, {60, 40}}}, {5, {{50, 60}, {45, 50}}}},  // 2 + separator + 2
  };
  for (const auto& stock : four) {
    ProgramRun r;
    r.parameters();
    r.put("contour.bin", pocket({10}));
    r.put("stock1.bin", records(stock));
    EXPECT_EQ(r.run(), 0) << r.err;
    EXPECT_FALSE(r.marker_left()) << r.out;
    EXPECT_EQ(r.bytes("temp1").size(), 0u);
  }
  for (const auto& stock : five) {
    ProgramRun r;
    r.parameters();
    r.put("contour.bin", pocket({10}));
    r.put("stock1.bin", records(stock));
    expect_stop(r, r.run(), "Erreur dans wf_add_level");
  }
}

TEST(MainFlowLevels, NoStockLevelsStillAssemble) {
  for (const Bytes& stock : {test::record_file({}), test::record_file({test::separator(), test::separator()})}) {
    ProgramRun r;
    r.parameters();
    r.put("contour.bin", pocket({0}));
    r.put("stock1.bin", stock);
    ASSERT_EQ(r.run(), 0) << r.err;
    EXPECT_EQ(r.out.rfind(banner_and_scale(), 0), 0u) << r.out;
    EXPECT_EQ(r.out.find('*'), std::string::npos) << r.out;
    EXPECT_FALSE(r.marker_left());
    EXPECT_TRUE(r.has("temp2"));  // wf_fin_czone ran
    EXPECT_EQ(r.bytes("stock2.bin"), (Bytes{kRecordFileMarker, kRecordEndMarker}));
  }
}

TEST(MainFlowEnd, ZonesWrittenMarkerRemoved) {
  ProgramRun r;
  r.parameters();
  r.put("contour.bin", pocket({10, 5, 0}));
  r.put("stock1.bin", rest({5}));
  ASSERT_EQ(r.run(), 0) << r.err;
  EXPECT_EQ(r.out.rfind(banner_and_scale(), 0), 0u) << r.out;
  EXPECT_NE(r.out.find("******************************\r\n\n"), std::string::npos);
  EXPECT_FALSE(r.marker_left());
  EXPECT_EQ(r.messages(), "");
  std::vector<Contour> zones;
  ASSERT_TRUE(read_result(r.bytes("stock2.bin"), zones));
  // Level 5 has zones; level 0 below has none and is left out; level 10
  // above gets a copy of level 5's. Top first.
  ASSERT_EQ(zones.size(), 2u);
  EXPECT_EQ(zones[0].z, 10.0f);
  EXPECT_EQ(zones[1].z, 5.0f);
  for (const Contour& c : zones) {
    ASSERT_GE(c.points.size(), 4u);
    EXPECT_EQ(c.points.front().x, c.points.back().x);
    EXPECT_EQ(c.points.front().y, c.points.back().y);
    for (const Pt& p : c.points) {  // the grown square stays inside the pocket
      EXPECT_GE(p.x, 0.0f);
      EXPECT_LE(p.x, 100.0f);
    }
  }
}

void copy_example(const ProgramRun& r) {
  for (const auto& e : std::filesystem::directory_iterator(std::string(ZT_SOURCE_DIR) + "/examples/pocket"))
    std::filesystem::copy_file(e.path(), r.path(e.path().filename().string()),
                               std::filesystem::copy_options::overwrite_existing);
}

// The bundled example, twice in one directory (the second run finds the
// first one's scratch files and result) and once in a fresh one: the same
// bytes each time.
TEST(MainFlowEnd, ExampleGivesTheSameResultEveryRun) {
  ProgramRun r, fresh;
  copy_example(r);
  copy_example(fresh);
  ASSERT_EQ(r.run(), 0) << r.err;
  ASSERT_FALSE(r.marker_left()) << r.out;
  EXPECT_NE(r.out.find("Calcul des zones de reprise par niveau"), std::string::npos);
  const Bytes result = r.bytes("stock2.bin");
  std::vector<Contour> zones;
  ASSERT_TRUE(read_result(result, zones));
  float previous = 1e30f;
  for (const Contour& c : zones) {
    EXPECT_LE(c.z, previous);  // from the top down
    previous = c.z;
  }
  EXPECT_EQ(zones.front().z, -1.0f);
  EXPECT_EQ(zones.back().z, -20.0f);
  ASSERT_EQ(r.run(), 0) << r.err;
  EXPECT_EQ(r.bytes("stock2.bin"), result);
  ASSERT_EQ(fresh.run(), 0) << fresh.err;
  EXPECT_EQ(fresh.bytes("stock2.bin"), result);
}

TEST(MainFlowFaults, NonFiniteCoordinateEndsLikeARecordFault) {
  const float nan = std::nanf(""), inf = INFINITY;
  struct Case {
    const char* file;
    Bytes bytes;
    const char* record;
  };
  const Case cases[] = {
      {"stock1.bin", records({{0, {{40, 40}, {nan, 40}, {60, 60}, {40, 60}, {40, 40}}}}), "record 3"},
      {"contour.bin", records({{0, {{0, 0}, {100, inf}, {100, 100}, {0, 100}, {0, 0}}}}), "record 3"},
      {"contour.bin", records({{0, rectangle(0, 0, 100, 100)}, {-inf, rectangle(0, 0, 100, 100)}}), "record 8"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.file);
    ProgramRun r;
    r.parameters();
    r.put("contour.bin", pocket({0}));
    r.put("stock1.bin", rest({0}));
    r.put(c.file, c.bytes);
    EXPECT_EQ(r.run(), 16);
    EXPECT_NE(r.err.find(c.file), std::string::npos) << r.err;
    EXPECT_NE(r.err.find(c.record), std::string::npos) << r.err;
    EXPECT_TRUE(r.marker_left());
    EXPECT_FALSE(r.has("stock2.bin"));
  }
}

// The result file grows beyond what the process may write: the record layer
// stops the program, and the half-written result goes with it. The example's
// scratch files stay below the limit, its result does not.
TEST(MainFlowFaults, InterruptedResultWriteLeavesNoResult) {
  constexpr std::size_t kLimitKiB = 100;
  ProgramRun r;
  copy_example(r);
  const std::string bytes = std::to_string(kLimitKiB * 1024);
  const int status = r.run("trap '' XFSZ", "prlimit --fsize=" + bytes + ":" + bytes);
  ASSERT_LT(r.bytes("temp2").size(), kLimitKiB * 1024) << "the example outgrew this test";
  EXPECT_TRUE(status == 11 || status == 12) << status << r.out << r.err;
  EXPECT_NE(r.err.find("stock2.bin"), std::string::npos) << r.err;
  EXPECT_TRUE(r.marker_left());
  EXPECT_FALSE(r.has("stock2.bin"));
}

}  // namespace
}  // namespace zt::e2e
