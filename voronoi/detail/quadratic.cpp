// Quadratic solver of the node constructions (see quadratic.hpp).
#include "voronoi/detail/quadratic.hpp"

#include <cmath>

namespace zt::vd::geo {

int normalize_quadratic(QuadCoefs& q) {
  int steps = 0;
  // Stops on its own: a non-zero coefficient grows by 128 each turn, and a
  // NaN fails every comparison.
  while (q.a <= kQuadSmall && std::fabs(q.a) <= kQuadSmall && std::fabs(q.b) <= kQuadSmall &&
         std::fabs(q.c) <= kQuadSmall && !(q.a == 0.0 && q.b == 0.0 && q.c == 0.0)) {
    q.a *= kQuadScale;
    q.b *= kQuadScale;
    q.c *= kQuadScale;
    ++steps;
  }
  return steps;
}

QuadRoots solve_quadratic(QuadCoefs q) {
  normalize_quadratic(q);
  QuadRoots r;
  if (!std::isfinite(q.a) || !std::isfinite(q.b) || !std::isfinite(q.c)) return r;
  if (std::fabs(q.a) > kQuadZeroCoef) {
    const double disc = q.b * q.b - 4.0 * q.a * q.c;
    if (disc > kQuadZeroDisc) {
      const double root = std::sqrt(disc);
      const double qq = q.b > 0.0 ? -(q.b + root) / 2.0 : -(q.b - root) / 2.0;
      if (std::fabs(qq) <= kQuadZeroCoef) {
        r.count = 1;
        r.t1 = qq / q.a;
      } else {
        r.count = 2;
        r.t1 = qq / q.a;
        r.t2 = q.c / qq;
      }
    } else if (disc >= -kQuadZeroDisc) {
      r.count = 1;
      r.t1 = -q.b / (2.0 * q.a);
    }
    return r;
  }
  if (std::fabs(q.b) <= kQuadZeroCoef) return r;
  r.count = 1;
  r.t1 = -q.c / q.b;
  return r;
}

}  // namespace zt::vd::geo
