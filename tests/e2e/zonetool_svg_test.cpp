// zonetool svg, run as the built tool: panels per level with equal scales,
// one even-odd path per input and level, the legend. Its refusals are rows
// of data/zonetool.txt.
#include <gtest/gtest.h>

#include "e2e/e2e_support.hpp"

namespace zt::e2e {
namespace {

class ZonetoolSvg : public ::testing::Test {
 protected:
  int svg(const std::string& args) {
    const int status = test::run_command(test::zonetool_path() + " svg " + args + " 2>" + q(dir.file("err.txt"))).status;
    err = test::read_text(dir.file("err.txt"));
    out = test::read_text(dir.file("out.svg"));
    return status;
  }
  // Built piece by piece: "'" + std::string + "'" trips a false -Wrestrict
  // warning of GCC 12 inside the standard library.
  static std::string q(const std::string& path) {
    std::string r(1, '\'');
    r += path;
    r += '\'';
    return r;
  }
  static int count(const std::string& s, const std::string& what) {
    int n = 0;
    for (auto at = s.find(what); at != std::string::npos; at = s.find(what, at + 1)) ++n;
    return n;
  }

  test::ScratchDir dir;
  std::string out, err;
};

TEST_F(ZonetoolSvg, PanelsPerLevelEqualScalesHolesAsHoles) {
  // Level 10: a pocket with an island (one path of two subpaths); level 5:
  // a smaller square. Text input: one polyline at z 5, one without z.
  test::write_bytes(dir.file("a.bin"), records({{10, rectangle(0, 0, 100, 50)},
                                                {10, rectangle(40, 20, 60, 30, true)},
                                                {5, rectangle(10, 10, 20, 20)}}));
  test::write_text(dir.file("b & c.txt"), "# zones\n1 1 5\n2 1 5\n2 2 5\n\n0 0\n100 50\n");
  ASSERT_EQ(svg(q(dir.file("a.bin")) + " " + q(dir.file("b & c.txt")) + " -o " + q(dir.file("out.svg"))), 0)
      << err;
  EXPECT_EQ(out.rfind("<?xml", 0), 0u);
  EXPECT_NE(out.find("</svg>"), std::string::npos);
  EXPECT_NE(out.find(">z = 10</text>"), std::string::npos);
  EXPECT_NE(out.find(">z = 5</text>"), std::string::npos);
  EXPECT_LT(out.find(">z = 10</text>"), out.find(">z = 5</text>"));  // top first
  EXPECT_NE(out.find("b &amp; c.txt</text>"), std::string::npos);   // legend, escaped
  EXPECT_EQ(count(out, "fill-rule=\"evenodd\""), 4);  // a on 10 and 5; b on 5 and (no z) on 10
  // The pocket and its island are one path of two closed subpaths.
  const std::size_t pathAt = out.find("<path ");
  ASSERT_NE(pathAt, std::string::npos);
  const std::size_t dAt = out.find(" d=\"", pathAt);
  ASSERT_LT(dAt, out.find('>', pathAt));
  const std::size_t dEnd = out.find('"', dAt + 4);
  ASSERT_NE(dEnd, std::string::npos);
  const std::string d = out.substr(dAt + 4, dEnd - dAt - 4);
  EXPECT_EQ(count(d, "M"), 2);
  EXPECT_EQ(count(d, "Z"), 2);
  // Both panel frames have the same size: 100 x 50 drawn 420 x 210.
  EXPECT_EQ(count(out, "width=\"420.00\" height=\"210.00\" fill=\"none\""), 2);

  ASSERT_EQ(svg(q(dir.file("a.bin")) + " --level 5.00001 -o " + q(dir.file("out.svg"))), 0) << err;
  EXPECT_EQ(count(out, "font-weight=\"bold\""), 1);
  EXPECT_NE(out.find(">z = 5</text>"), std::string::npos);
  // The scale fits what is drawn: the square 10..20 fills the panel.
  EXPECT_EQ(count(out, "width=\"420.00\" height=\"420.00\" fill=\"none\""), 1);
}

}  // namespace
}  // namespace zt::e2e
