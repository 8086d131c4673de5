#pragma once

#include "colour/colour_values.h"
#include "colour/companding.h"

namespace vantrel {

// pi as the hue computations of the library take it.
constexpr double kHuePi = 3.1415926535;

// Hue in degrees, 0 <= h < 360; 0 for a = b = 0.
double HueAngle(double a, double b);
// L clamped to 0..255 (scaled Lab allowed), a and b to -128..127; h = 0 when C = 0.
LCh LabToLCh(double L, double a, double b);
// a = C cos h, b = C sin h; L clamped to 0..255, a and b to -128..127.
Lab LChToLab(double L, double C, double h);
// The CIE 1976 colour difference, the only one of the library.
double DeltaE(double L1, double a1, double b1, double L2, double a2, double b2);
inline double DeltaE(const Lab& p, const Lab& q) { return DeltaE(p.L, p.a, p.b, q.L, q.a, q.b); }
inline double Square(double x) { return x * x; }

// XYZ to Lab and back against a white (Xw, Yw, Zw); a white with a zero component gives Lab 0.
Lab XYZToLabAgainst(const XYZ& value, const double white[3]);
XYZ LabToXYZAgainst(const Lab& value, const double white[3]);
// Bradford adaptation of `value` from the white `from` to the white `to`.
XYZ Bradford(const XYZ& value, const double from[3], const double to[3]);

}  // namespace vantrel
