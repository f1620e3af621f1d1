// zonetool dxf read back by an independent reader, GDAL's ogrinfo (Debian
// package gdal-bin, test only): per layer the contours of the inputs in
// order, closed where they were closed, with the coordinates `dump` prints.
// Without ogrinfo the test is skipped with a message saying so.
#include <gtest/gtest.h>

#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "support/scratch_dir.hpp"
#include "support/subprocess.hpp"

namespace zt::test {
namespace {

using Contour = std::vector<std::vector<float>>;  // points x y z, as single-precision values
using Layers = std::map<std::string, std::vector<Contour>>;

// Text polylines: a closed triangle and an open polyline at z 5, a single
// point at z 5, a polyline without z.
const char* kText =
    "1 1 5\n2 1 5\n2 2 5\n1 1 5\n\n0 0 5\n3 0 5\n3 3 5\n\n7 7 5\n\n0 0\n100 50.25\n";

std::vector<float> numbers(const std::string& text) {
  std::vector<float> v;
  std::istringstream in(text);
  for (double d; in >> d;) v.push_back(static_cast<float>(d));
  return v;
}

// The layers as the drawing should hold them, from `dump` of the record files
// (z in shortest form, "." as "p") and the text polylines above.
Layers expected(const std::vector<std::string>& records) {
  Layers want;
  for (const std::string& path : records) {
    const CommandRun r = run_command(zonetool_path() + " dump '" + path + "'");
    EXPECT_EQ(r.status, 0);
    std::string stem = path.substr(path.rfind('/') + 1);
    stem.resize(stem.rfind('.'));
    std::istringstream in(r.out + "\n");
    Contour c;
    for (std::string line; std::getline(in, line);) {
      if (!line.empty()) {
        c.push_back(numbers(line));
        continue;
      }
      if (c.empty()) continue;
      const std::string z = c[0][2] == static_cast<int>(c[0][2]) ? std::to_string(static_cast<int>(c[0][2])) : "";
      EXPECT_FALSE(z.empty()) << "the example's levels are whole numbers";
      want[stem + "_z" + z].push_back(c);
      c.clear();
    }
  }
  want["text_z5"] = {{{1, 1, 5}, {2, 1, 5}, {2, 2, 5}, {1, 1, 5}}, {{0, 0, 5}, {3, 0, 5}, {3, 3, 5}}, {{7, 7, 5}}};
  want["text"] = {{{0, 0, 0}, {100, 50.25f, 0}}};
  return want;
}

// ogrinfo's features: "Layer (String) = NAME" then the geometry's WKT.
Layers read_back(const std::string& ogr) {
  Layers got;
  std::istringstream in(ogr);
  std::string layer;
  for (std::string line; std::getline(in, line);) {
    const auto at = line.find("Layer (String) = ");
    if (at != std::string::npos) layer = line.substr(at + 17);
    const auto open = line.find(" Z (");
    if (open == std::string::npos) continue;
    Contour c;
    std::string points = line.substr(open + 4);
    for (char& ch : points)
      if (ch == ',' || ch == ')') ch = '\n';
    std::istringstream ps(points);
    for (std::string p; std::getline(ps, p);)
      if (!numbers(p).empty()) c.push_back(numbers(p));
    got[layer].push_back(c);
  }
  return got;
}

// Closed polylines (flag 1) per layer, straight from the group codes.
std::map<std::string, int> closed_flags(const std::string& dxf) {
  std::map<std::string, int> closed;
  std::istringstream in(dxf);
  std::vector<std::string> g;
  for (std::string line; std::getline(in, line);) g.push_back(line.substr(line.find_first_not_of(' ')));
  for (std::size_t i = 0; i + 1 < g.size(); i += 2) {
    if (g[i] != "0" || g[i + 1] != "POLYLINE") continue;
    std::string layer;
    for (std::size_t k = i + 2; k + 1 < g.size() && g[k] != "0"; k += 2) {
      if (g[k] == "8") layer = g[k + 1];
      if (g[k] == "70" && g[k + 1] == "1") ++closed[layer];
    }
  }
  return closed;
}

TEST(ZonetoolDxf, AnIndependentReaderGetsEveryContourOnItsLayer) {
  if (run_command("command -v ogrinfo >/dev/null 2>&1").status != 0)
    GTEST_SKIP() << "ogrinfo (Debian package gdal-bin) not found: the DXF reader check is SKIPPED";
  ScratchDir dir;
  const std::string pocket = std::string(ZT_SOURCE_DIR) + "/examples/pocket/";
  const std::vector<std::string> records = {pocket + "contour.bin", pocket + "stock1.bin"};
  write_text(dir.file("text.txt"), kText);
  const std::string out = dir.file("zones.dxf");
  ASSERT_EQ(run_command(zonetool_path() + " dxf '" + records[0] + "' '" + records[1] + "' '" + dir.file("text.txt") +
                        "' -o '" + out + "'")
                .status,
            0);
  const CommandRun ogr = run_command("ogrinfo -ro -al -q '" + out + "' 2>&1");
  ASSERT_EQ(ogr.status, 0) << ogr.out;

  const Layers want = expected(records), got = read_back(ogr.out);
  ASSERT_EQ(got.size(), want.size());
  std::map<std::string, int> closedWanted;
  for (const auto& [layer, contours] : want) {
    ASSERT_TRUE(got.count(layer)) << layer;
    const std::vector<Contour>& back = got.at(layer);
    ASSERT_EQ(back.size(), contours.size()) << layer;
    for (std::size_t k = 0; k < contours.size(); ++k) {
      EXPECT_EQ(back[k], contours[k]) << layer << " contour " << k;
      if (contours[k].size() > 2 && contours[k].front() == contours[k].back()) ++closedWanted[layer];
    }
  }
  EXPECT_EQ(closed_flags(read_text(out)), closedWanted);
}

}  // namespace
}  // namespace zt::test
