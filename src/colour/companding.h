#pragma once

#include <cmath>

namespace vantrel {

// The CIELAB companding function f(t) in the three forms the library uses, side by side:
// - CieF: the library's own conversions (every profile's Lab and XYZ), the cube root from a
//   single-precision table up to 1;
// - CieFExact: measured XYZ when no profile is loaded, the cube root by the power function;
// - WhitePointF: the Lab of a profile's media white, whose straight part ends in 0.138, not
//   16/116, so that a white point reads as the tools that wrote it intended.
// All three are linear (7.787 t + c) below t = 0.008856.

double CieF(double t);

inline double CieFExact(double t) { return t > 0.008856 ? std::pow(t, 1.0 / 3.0) : 7.787 * t + 16.0 / 116.0; }

inline double WhitePointF(double t) { return t > 0.008856 ? std::pow(t, 1.0 / 3.0) : 7.787 * t + 0.138; }

}  // namespace vantrel
