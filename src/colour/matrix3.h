#pragma once

namespace vantrel {

// 3x3 matrices, row-major, as the colorant and LUT matrices of a profile hold them.

// The inverse of `m` by cofactors. False, and `inverse` untouched, when `m` is singular or not
// finite.
bool InvertMatrix3(const double (&m)[3][3], double (&inverse)[3][3]);

// x with m x = y, by Cramer's rule. False, and x = y, when `m` is singular or not finite.
bool SolveMatrix3(const double (&m)[3][3], const double* y, double* x);

}  // namespace vantrel
