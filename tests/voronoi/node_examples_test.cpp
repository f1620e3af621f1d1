// Node constructions on hand-made edges: the worked examples, the degenerate
// inputs that must name their suspect pair, and the orientation memory.
#include <gtest/gtest.h>

#include <cmath>

#include "voronoi/detail/node_check.hpp"
#include "voronoi/detail/node_constructions.hpp"

namespace zt::vd::geo {
namespace {

PointSite pt(std::int32_t i, double x, double y) { return {i, {x, y}}; }
SegSite seg(std::int32_t index, const PointSite& a, const PointSite& b) {
  return SegSite::make(index, a.index, a.p, b.index, b.p);
}
EdgeEnd end(Point2d p, double r, bool deleted) { return {p, r, deleted}; }

struct Outcome {
  bool ok = false;
  NodeResult out;
  SuspectPair suspect;
};

Outcome run(const EdgeFrame& e, const SiteRef& fresh, NodeMemory* memory = nullptr) {
  NodeMemory local;
  Outcome r;
  r.out.copied = true;  // compute_node must clear it
  r.out.on_point = 99;
  r.ok = compute_node(e, fresh, memory ? *memory : local, r.suspect, r.out);
  return r;
}

TEST(NodeExamples, PpsLinearCase) {
  // p = (0, 1), q = (2, 1), segment y = 0: A vanishes and the node is (1, 1).
  const PointSite p = pt(2, 0, 1), q = pt(3, 2, 1);
  const SegSite s = seg(0, pt(4, -5, 0), pt(5, 5, 0));
  EdgeFrame e{end({1, 3}, std::sqrt(5.0), false), end({1, 0.5}, std::sqrt(1.25), true), SiteRef::point(q),
              SiteRef::point(p)};
  const Outcome r = run(e, SiteRef::segment(s));
  ASSERT_TRUE(r.ok);
  EXPECT_FALSE(r.out.copied);
  EXPECT_EQ(r.out.on_point, -1);
  EXPECT_NEAR(r.out.n.x, 1.0, 1e-15);
  EXPECT_NEAR(r.out.n.y, 1.0, 1e-15);
  EXPECT_NEAR(r.out.r, 1.0, 1e-15);
}

TEST(NodeExamples, PpsFromSegmentStart) {
  // p = (0, 0) starts the segment to (4, 0); q = (0, 2): the node is (0, 1).
  const PointSite p = pt(2, 0, 0), q = pt(4, 0, 2), s_end = pt(3, 4, 0);
  const SegSite s = seg(0, p, s_end);
  EdgeFrame e{end({-1, 1}, std::sqrt(2.0), false), end({1, 1}, std::sqrt(2.0), true), SiteRef::point(p),
              SiteRef::point(q)};
  const Outcome r = run(e, SiteRef::segment(s));
  ASSERT_TRUE(r.ok);
  EXPECT_FALSE(r.out.copied);
  EXPECT_NEAR(r.out.n.x, 0.0, 1e-15);
  EXPECT_NEAR(r.out.n.y, 1.0, 1e-15);
  EXPECT_NEAR(r.out.r, 1.0, 1e-15);
}

TEST(NodeExamples, PpsPointOnSegmentNamesThePair) {
  const PointSite p = pt(2, 0, 0), q = pt(3, 1, 1e-12);
  const SegSite s = seg(7, pt(4, -1, 0), pt(5, 2, 0));
  EdgeFrame e{end({0.5, 1}, 1, false), end({1, -1}, 1, true), SiteRef::point(p), SiteRef::point(q)};
  const Outcome r = run(e, SiteRef::segment(s));
  EXPECT_FALSE(r.ok);
  ASSERT_TRUE(r.suspect.set);
  // p lies on the segment as well and comes first in index order.
  EXPECT_EQ(r.suspect.site1, 7);
  EXPECT_EQ(r.suspect.kind1, kKindSeg);
  EXPECT_EQ(r.suspect.site2, 2);
  EXPECT_EQ(r.suspect.kind2, kKindPnt);
}

TEST(NodeExamples, PpsCoincidentPointsNameThePair) {
  const PointSite p = pt(6, 0.5, 0.5), q = pt(3, 0.5, 0.5 + 1e-12);
  const SegSite s = seg(1, pt(4, 0, 0), pt(5, 1, 0));
  EdgeFrame e{end({0, 1}, 1, false), end({1, 0.5}, 1, true), SiteRef::point(p), SiteRef::point(q)};
  const Outcome r = run(e, SiteRef::segment(s));
  EXPECT_FALSE(r.ok);
  ASSERT_TRUE(r.suspect.set);
  EXPECT_EQ(r.suspect.site1, 3);
  EXPECT_EQ(r.suspect.site2, 6);
  EXPECT_EQ(r.suspect.kind1, kKindPnt);
  // The same point twice is no construction at all.
  EdgeFrame same{e.n1, e.n2, SiteRef::point(p), SiteRef::segment(s)};
  SuspectPair sp;
  NodeResult out;
  EXPECT_FALSE(node_pps(same, SiteRef::point(p), p, p, s, sp, out));
  EXPECT_FALSE(sp.set);
}

TEST(NodeExamples, PssAtCommonEndPoint) {
  const PointSite p = pt(2, 0.5, 0.5), a = pt(3, 0, 0), b = pt(4, 1, 0);
  const SegSite s1 = seg(0, a, p), s2 = seg(1, p, b);
  EdgeFrame e{end({0.5, 0.9}, 0.4, false), end({0.5, 0.2}, 0.1, true), SiteRef::point(p), SiteRef::segment(s1)};
  const Outcome r = run(e, SiteRef::segment(s2));
  ASSERT_TRUE(r.ok);
  EXPECT_FALSE(r.out.copied);
  EXPECT_EQ(r.out.n.x, 0.5);
  EXPECT_EQ(r.out.n.y, 0.5);
  EXPECT_EQ(r.out.r, 0.0);
  EXPECT_EQ(r.out.on_point, 2);
}

TEST(NodeExamples, DuplicateSegmentsNameThePair) {
  const PointSite p = pt(2, 0.5, 0.8), a = pt(3, 0, 0), b = pt(4, 1, 0);
  // Stored twice, in opposite orientation.
  const SegSite s1 = seg(5, a, b), s2 = seg(2, b, a);
  EdgeFrame e{end({0.5, 0.6}, 0.2, false), end({0.5, 0.3}, 0.5, true), SiteRef::point(p), SiteRef::segment(s1)};
  const Outcome r = run(e, SiteRef::segment(s2));
  EXPECT_FALSE(r.ok);
  ASSERT_TRUE(r.suspect.set);
  EXPECT_EQ(r.suspect.site1, 2);
  EXPECT_EQ(r.suspect.site2, 5);
  EXPECT_EQ(r.suspect.kind2, kKindSeg);
  // Three segments where two repeat.
  const SegSite s3 = seg(9, pt(6, 0, 1), pt(7, 1, 1));
  EdgeFrame e3{e.n1, e.n2, SiteRef::segment(s3), SiteRef::segment(s1)};
  const Outcome r3 = run(e3, SiteRef::segment(s2));
  EXPECT_FALSE(r3.ok);
  EXPECT_TRUE(r3.suspect.set);
}

TEST(NodeExamples, SssCommonEndPoint) {
  const PointSite c = pt(2, 0.5, 0.5);
  const SegSite s1 = seg(0, c, pt(3, 1, 0.5)), s2 = seg(1, pt(4, 0, 0.5), c), s3 = seg(2, c, pt(5, 0.5, 1));
  EdgeFrame e{end({0.7, 0.3}, 0.2, false), end({0.5, 0.45}, 0.05, true), SiteRef::segment(s1), SiteRef::segment(s2)};
  const Outcome r = run(e, SiteRef::segment(s3));
  ASSERT_TRUE(r.ok);
  EXPECT_EQ(r.out.on_point, 2);
  EXPECT_EQ(r.out.r, 0.0);
}

TEST(NodeExamples, ArcsAndThreePointsAreNotConstructedHere) {
  const PointSite p = pt(2, 0, 0), q = pt(3, 1, 0), x = pt(4, 0, 1);
  EdgeFrame e{end({0.5, 1}, 1, false), end({0.5, -1}, 1, true), SiteRef::point(p), SiteRef::point(q)};
  EXPECT_FALSE(run(e, SiteRef::point(x)).ok);
  SiteRef arc;
  arc.kind = kKindArc;
  EXPECT_FALSE(run(e, arc).ok);
}

TEST(NodeExamples, NoNodeOnTheEdgeCopiesTheKeptEnd) {
  // The new segment is far from the whole edge: no sign change along it.
  const PointSite p = pt(2, 0, 0), q = pt(3, 1, 0);
  const SegSite s = seg(0, pt(4, 0, 5), pt(5, 1, 5));
  EdgeFrame e{end({0.5, 1}, std::sqrt(1.25), true), end({0.5, 0.2}, std::sqrt(0.29), false), SiteRef::point(p),
              SiteRef::point(q)};
  const Outcome r = run(e, SiteRef::segment(s));
  ASSERT_TRUE(r.ok);
  EXPECT_TRUE(r.out.copied);
  EXPECT_EQ(r.out.n.x, 0.5);
  EXPECT_EQ(r.out.n.y, 0.2);  // n2 is kept since n1 is DELETED
  EXPECT_EQ(r.out.r, std::sqrt(0.29));
}

TEST(NodeExamples, OrientationMemoryIsSetOnlyByDegenerateLinesAndCanBeReset) {
  // p on the line of s2 beyond its end, and the kept node on that line too:
  // nothing orients the line; the memory stays set until reset.
  const PointSite p = pt(2, 2, 0);
  const SegSite s1 = seg(0, pt(3, 0, 1), pt(4, 1, 1));
  const SegSite s2 = seg(1, pt(5, 0, 0), pt(6, 1, 0));
  EdgeFrame e{end({1.5, 0}, 0.5, false), end({1.5, 0.4}, 0.6, true), SiteRef::point(p), SiteRef::segment(s1)};
  NodeMemory memory;
  const Outcome r = run(e, SiteRef::segment(s2), &memory);
  EXPECT_TRUE(r.ok);
  EXPECT_TRUE(memory.orient_by_kept);
  memory.reset();
  EXPECT_FALSE(memory.orient_by_kept);
}

}  // namespace
}  // namespace zt::vd::geo
