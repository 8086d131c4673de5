#include "colour/colour_math.h"

#include <algorithm>
#include <cmath>

#include "colour/cube_root_table.h"

namespace vantrel {
namespace {

// Cone response of the Bradford transform and its inverse, to four decimals.
constexpr double kCone[3][3] = {{0.8951, 0.2664, -0.1614}, {-0.7502, 1.7135, 0.0367}, {0.0389, -0.0685, 1.0296}};
constexpr double kConeInverse[3][3] = {{0.987, -0.1471, 0.16}, {0.4323, 0.5184, 0.0493}, {-0.0085, 0.04, 0.9685}};

constexpr double kSixteenOver116 = 16.0 / 116.0;

// The inverse companding: f^3 above 6/29, a straight line below.
double InverseF(double f) {
    return f >= 6.0 / 29.0 ? f * f * f : (f - kSixteenOver116) * (108.0 / 841.0);
}

}  // namespace

double CieF(double t) {
    if (!(t > 0.008856)) return 7.787 * t + kSixteenOver116;  // also NaN, which no table may index
    if (t > 1.0) return std::pow(t, 1.0 / 3.0);
    // Linear interpolation in the single-precision cube-root table.
    const float s = static_cast<float>(t * 1024.0);
    const int k = static_cast<int>(s);
    const float u = s - static_cast<float>(k);
    return kCubeRootTable[k + 1] * u + kCubeRootTable[k] * (1.0f - u);
}

Lab XYZToLabAgainst(const XYZ& value, const double white[3]) {
    if (white[0] == 0 || white[1] == 0 || white[2] == 0) return {};
    const double fx = CieF(value.X / white[0]);
    const double fy = CieF(value.Y / white[1]);
    const double fz = CieF(value.Z / white[2]);
    return {116.0 * fy - 16.0, 500.0 * (fx - fy), 200.0 * (fy - fz)};
}

XYZ LabToXYZAgainst(const Lab& value, const double white[3]) {
    const double fy = (value.L + 16.0) / 116.0;
    const double fx = fy + value.a / 500.0;
    const double fz = fy - value.b / 200.0;
    return {InverseF(fx) * white[0], InverseF(fy) * white[1], InverseF(fz) * white[2]};
}

XYZ Bradford(const XYZ& value, const double from[3], const double to[3]) {
    const double v[3] = {value.X, value.Y, value.Z};
    double cone[3];
    for (int r = 0; r < 3; ++r) {
        auto dot = [r](const double* w) { return kCone[r][0] * w[0] + kCone[r][1] * w[1] + kCone[r][2] * w[2]; };
        // A white without a cone response (a profile that has read nothing) adapts nothing.
        if (dot(from) == 0) return value;
        cone[r] = dot(to) / dot(from) * dot(v);
    }
    double out[3];
    for (int r = 0; r < 3; ++r)
        out[r] = kConeInverse[r][0] * cone[0] + kConeInverse[r][1] * cone[1] + kConeInverse[r][2] * cone[2];
    return {out[0], out[1], out[2]};
}

double HueAngle(double a, double b) {
    if (a == 0) return b > 0 ? 90.0 : b < 0 ? 270.0 : 0.0;
    if (b == 0) return a < 0 ? 180.0 : 0.0;
    const double degrees = std::atan(b / a) * 180.0 / kHuePi;
    if (a < 0) return degrees + 180.0;
    return b > 0 ? degrees : degrees + 360.0;
}

LCh LabToLCh(double L, double a, double b) {
    L = std::clamp(L, 0.0, 255.0);
    a = std::clamp(a, -128.0, 127.0);
    b = std::clamp(b, -128.0, 127.0);
    const double C = std::sqrt(a * a + b * b);
    return {L, C, C == 0 ? 0.0 : HueAngle(a, b)};
}

Lab LChToLab(double L, double C, double h) {
    double a = 0, b = 0;
    if (C != 0) {
        a = C * std::cos(h * kHuePi / 180.0);
        b = C * std::sin(h * kHuePi / 180.0);
    }
    return {std::clamp(L, 0.0, 255.0), std::clamp(a, -128.0, 127.0), std::clamp(b, -128.0, 127.0)};
}

double DeltaE(double L1, double a1, double b1, double L2, double a2, double b2) {
    return std::sqrt(Square(L1 - L2) + Square(a1 - a2) + Square(b1 - b2));
}

}  // namespace vantrel
