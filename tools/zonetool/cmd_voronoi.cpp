// zonetool voronoi FILE: the Voronoi diagram of the sites of a text file,
// computed through the engine's facade exactly as the zone builder drives
// it, printed node by node and edge by edge in user coordinates.
#include <charconv>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "commands.hpp"
#include "text_io.hpp"
#include "voronoi/engine.hpp"

namespace {

bool ParseNumber(std::istringstream& in, double& v) {
  std::string word;
  if (!(in >> word)) return false;
  const auto r = std::from_chars(word.data(), word.data() + word.size(), v);
  return r.ec == std::errc() && r.ptr == word.data() + word.size() && std::isfinite(v);
}

bool ParseIndex(std::istringstream& in, long& v) {
  std::string word;
  if (!(in >> word)) return false;
  const auto r = std::from_chars(word.data(), word.data() + word.size(), v);
  return r.ec == std::errc() && r.ptr == word.data() + word.size();
}

int Fail(const std::string& message) { return zonetool::usage_error("voronoi", message.c_str()); }

}  // namespace

int zonetool::cmd_voronoi(int argc, char** argv) {
  if (argc != 1) return usage_error("voronoi", "usage: zonetool voronoi FILE");
  std::ifstream file(argv[0]);
  if (!file) return Fail(std::string("cannot read ") + argv[0]);

  zt::VD_Initialize();
  zt::VD_Reset();
  std::vector<std::int32_t> pointIndex;  // file number -> engine index
  std::int32_t segments = 0;
  std::string line;
  int lineNo = 0;
  while (std::getline(file, line)) {
    ++lineNo;
    if (!line.empty() && line.back() == '\r') line.pop_back();
    std::istringstream in(line);
    std::string kind;
    if (!(in >> kind) || kind[0] == '#') continue;
    const std::string where = std::string(argv[0]) + ":" + std::to_string(lineNo) + ": ";
    std::string rest;
    if (kind == "p") {
      double x = 0, y = 0;
      if (!ParseNumber(in, x) || !ParseNumber(in, y) || (in >> rest))
        return Fail(where + "expected \"p x y\" with finite numbers");
      const auto tag = static_cast<std::int32_t>(pointIndex.size());
      pointIndex.push_back(zt::API_AddPoint(x, y, tag));
    } else if (kind == "s") {
      long i = 0, j = 0;
      if (!ParseIndex(in, i) || !ParseIndex(in, j) || (in >> rest))
        return Fail(where + "expected \"s i j\" with two point numbers");
      const long n = static_cast<long>(pointIndex.size());
      if (i < 0 || j < 0 || i >= n || j >= n) return Fail(where + "a segment end names no point given before it");
      if (zt::API_AddSegment(pointIndex[i], pointIndex[j], segments) < 0)
        return Fail(where + "segment refused by the engine");
      ++segments;
    } else {
      return Fail(where + "a line starts with \"p\", \"s\" or \"#\"");
    }
  }
  if (pointIndex.empty()) return Fail("no point in " + std::string(argv[0]));

  if (!zt::VD_ComputeDiagram(false, 1, false, false, 0, 0, 0.0, 0.0, true)) {
    std::fputs("zonetool voronoi: the diagram could not be computed (coordinates beyond 1e15?)\n", stderr);
    return 1;
  }
  using zonetool::format_number;
  // Sites are printed by their number in the file (the tag given to the
  // engine); points the engine made itself (corners, repairs) read -1.
  const auto siteTag = [](std::int32_t site, std::int32_t kind) -> long {
    if (site < 0) return -1;
    return kind == 2 ? zt::VD_GetPointTag(site) : kind == 0 ? zt::VD_GetSegmentTag(site) : -1;
  };
  for (std::int32_t i = 0; i < zt::VD_GetNodeCount(); ++i) {
    const zt::VD_NodeInfo n = zt::VD_GetNode(i);
    if (!n.live) continue;
    std::printf("node %d %s %s %s\n", i, format_number(n.x).c_str(), format_number(n.y).c_str(),
                format_number(n.r).c_str());
  }
  for (std::int32_t i = 0; i < zt::VD_GetEdgeCount(); ++i) {
    const zt::VD_EdgeInfo e = zt::VD_GetEdge(i);
    if (!e.live) continue;
    std::printf("edge %d %d %d %ld %d %ld %d\n", i, e.n1, e.n2, siteTag(e.lft, e.ltype), e.ltype,
                siteTag(e.rgt, e.rtype), e.rtype);
  }
  std::printf("restarts %d recovery %d\n", zt::VD_GetRestartCount(), zt::VD_InRecoveryMode() ? 1 : 0);
  return 0;
}
