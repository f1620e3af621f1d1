// The quadratic solver shared by every node construction of the segment
// phase: A·t² + B·t + C = 0 for a parameter t along a line.
//
// Promises: tiny coefficient triples are first scaled by powers of 128 (exact
// in binary floating point), so the roots do not depend on the scale of the
// input; roots are computed in the cancellation-free form (q/A and C/q);
// no root, a double root, one root of a linear equation, or two roots are told
// apart by the thresholds below, never by exact comparison with zero.
#pragma once

namespace zt::vd::geo {

// Coefficients up to this magnitude count as "small" for the rescaling.
inline constexpr double kQuadSmall = 1.0 / 128.0;
// The power-of-two factor applied while all coefficients are small.
inline constexpr double kQuadScale = 128.0;
// |A| and |B| at or below this are treated as zero (degenerate equation).
inline constexpr double kQuadZeroCoef = 1e-50;
// A discriminant within ± this is a double root.
inline constexpr double kQuadZeroDisc = 1e-100;

struct QuadCoefs {
  double a = 0.0;
  double b = 0.0;
  double c = 0.0;
};

// Multiplies the three coefficients by 128 while they are all small and not
// all zero. Returns the number of multiplications done.
int normalize_quadratic(QuadCoefs& q);

struct QuadRoots {
  int count = 0;  // 0: no usable root (the caller falls back), 1 or 2
  double t1 = 0.0;
  double t2 = 0.0;
};

// Normalises a copy of the coefficients and solves.
QuadRoots solve_quadratic(QuadCoefs q);

}  // namespace zt::vd::geo
