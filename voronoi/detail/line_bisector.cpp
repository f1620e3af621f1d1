// Bisector of two oriented segment lines (see line_bisector.hpp).
#include "voronoi/detail/line_bisector.hpp"

#include <cmath>

namespace zt::vd::geo {

bool line_bisector(const OrientedLine& l1, const SegSite& s1, const OrientedLine& l2, const SegSite& s2,
                   Point2d ref, LineBisector& out) {
  const Point2d n1 = l1.normal();
  const Point2d n2 = l2.normal();
  const Point2d diff = sub(n1, n2);
  // Where the normals agree the oriented distances differ by a constant:
  // there is no line of equal distances to follow.
  if (norm2(diff) <= kSameDirSq) return false;
  const bool facing = std::fabs(1.0 + dot(n1, n2)) <= kFacingTol;
  // Both choices are perpendicular to n1 − n2; the sum is better conditioned
  // unless the normals nearly cancel.
  out.v = facing ? Point2d{(l1.b - l2.b) / 2.0, (l2.a - l1.a) / 2.0} : Point2d{(l1.a + l2.a) / 2.0, (l1.b + l2.b) / 2.0};

  if (s1.i1 == s2.i1 || s1.i1 == s2.i2) {
    out.p0 = s1.p1;
    return true;
  }
  if (s1.i2 == s2.i1 || s1.i2 == s2.i2) {
    out.p0 = s1.p2;
    return true;
  }
  if (s1.arc >= 0 && s1.arc == s2.arc && std::fabs(l1.D(s1.arc_center) - l2.D(s1.arc_center)) <= kOnSiteTol) {
    out.p0 = s1.arc_center;
    return true;
  }
  const double det = l1.a * l2.b - l1.b * l2.a;
  if (!facing && std::fabs(det) > kDetTol) {
    const double mu = l2.D(s1.p1) / det;
    out.p0 = add(s1.p1, mul(Point2d{l1.b, -l1.a}, mu));
    return true;
  }
  // Facing or nearly parallel lines: the point of the bisector nearest ref,
  // where D1 − D2 = diff·P + c1 − c2 vanishes.
  const double gap = l1.D(ref) - l2.D(ref);
  out.p0 = sub(ref, mul(diff, gap / norm2(diff)));
  return true;
}

}  // namespace zt::vd::geo
