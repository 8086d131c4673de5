#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <random>

#include "icc/spline.h"
#include "icc/tone_curve.h"

using namespace vantrel;

namespace {

// The natural cubic spline computed directly: the tridiagonal system of the second derivatives
// solved by Gaussian elimination in double precision, then the textbook interval formula.
double DirectSpline(const std::vector<double>& x, const std::vector<double>& y, double at) {
    const size_t n = x.size();
    std::vector<std::vector<double>> a(n, std::vector<double>(n + 1, 0.0));
    a[0][0] = a[n - 1][n - 1] = 1;
    for (size_t i = 1; i + 1 < n; ++i) {
        a[i][i - 1] = (x[i] - x[i - 1]) / 6;
        a[i][i] = (x[i + 1] - x[i - 1]) / 3;
        a[i][i + 1] = (x[i + 1] - x[i]) / 6;
        a[i][n] = (y[i + 1] - y[i]) / (x[i + 1] - x[i]) - (y[i] - y[i - 1]) / (x[i] - x[i - 1]);
    }
    for (size_t i = 0; i < n; ++i)
        for (size_t r = i + 1; r < n; ++r) {
            const double f = a[r][i] / a[i][i];
            for (size_t c = i; c <= n; ++c) a[r][c] -= f * a[i][c];
        }
    std::vector<double> m(n);
    for (size_t i = n; i-- > 0;) {
        double s = a[i][n];
        for (size_t c = i + 1; c < n; ++c) s -= a[i][c] * m[c];
        m[i] = s / a[i][i];
    }
    size_t k = 0;
    while (k + 2 < n && at >= x[k + 1]) ++k;
    const double h = x[k + 1] - x[k];
    const double A = (x[k + 1] - at) / h, B = (at - x[k]) / h;
    return A * y[k] + B * y[k + 1] + ((A * A * A - A) * m[k] + (B * B * B - B) * m[k + 1]) * h * h / 6;
}

}  // namespace

TEST(Spline, AgreesWithDirectNaturalSpline) {
    std::mt19937 random(7);
    std::uniform_real_distribution<double> step(20, 400), value(0, 4000);
    std::vector<double> x{0}, y{value(random)};
    while (x.back() < 3600) {
        x.push_back(x.back() + step(random));
        y.push_back(value(random));
    }
    NaturalSpline spline;
    FitSpline(x, y, spline);
    for (double at = 0; at <= x.back(); at += 13.7)
        EXPECT_NEAR(EvaluateSpline(spline, at), DirectSpline(x, y, at), 0.05) << at;  // single precision
    std::vector<double> grid;
    EvaluateSplineGrid(spline, grid);
    ASSERT_EQ(grid.size(), 4080u);
    const int last = static_cast<int>(std::lround(x.back()));
    for (int p = 0; p <= last; p += 37) {
        const double direct = std::clamp(DirectSpline(x, y, p), 0.0, 4079.0);
        EXPECT_NEAR(grid[static_cast<size_t>(p)], direct, 0.05) << p;
    }
    for (int p = last + 1; p < 4080; ++p) EXPECT_FLOAT_EQ(static_cast<float>(grid[static_cast<size_t>(p)]), static_cast<float>(y.back()));
}

// Gamma curves of real profiles are checked against lcms2 with the matrix/TRC profiles; here the
// cases no real profile has.
TEST(ToneCurve, GammaBelowZeroIsTakenAsAThousandth) {
    std::vector<double> curve;
    BuildGammaCurveFor(-1.0, 1, curve);  // no infinite cell index
    EXPECT_TRUE(std::is_sorted(curve.begin(), curve.end()));
    BuildGammaCurveFor(0.0, 0, curve);
    EXPECT_NEAR(curve[1], 255 * std::pow(1 / 255.0, 0.001), 1e-9);
}

// Curves shorter than 256 samples go through the spline, forward and inverse.
TEST(ToneCurve, ShortSampledCurves) {
    const std::vector<uint16_t> squares = {0, 4096, 16384, 36864, 65535};
    std::vector<double> curve;
    BuildSampledCurve(squares.data(), 5, curve);
    ASSERT_EQ(curve.size(), 256u);
    EXPECT_NEAR(curve[0], 0, 1e-9);
    EXPECT_NEAR(curve[255], 255, 1e-3);
    for (int i = 0; i < 255; i += 16)  // the samples follow a square law; natural ends bend a little
        EXPECT_NEAR(curve[static_cast<size_t>(i)], 255 * std::pow(16 * i / 4079.0, 2), 1.5) << i;
    EXPECT_TRUE(std::is_sorted(curve.begin(), curve.end()));

    const std::vector<uint16_t> two = {0, 65535};
    BuildInverseCurve(two.data(), 2, curve);
    ASSERT_EQ(curve.size(), 256u);
    EXPECT_TRUE(std::is_sorted(curve.begin(), curve.end()));
    for (int j = 0; j < 256; j += 17) EXPECT_NEAR(curve[static_cast<size_t>(j)], j, 1.0);
}

// A curve that saturates early: its inverse still rises to 255.
TEST(ToneCurve, InverseOfASaturatingCurve) {
    std::vector<uint16_t> saturating(1024);
    for (int k = 0; k < 1024; ++k)
        saturating[static_cast<size_t>(k)] = static_cast<uint16_t>(std::min(65535.0, 65535 * 1.3 * k / 1023.0));
    std::vector<double> curve;
    BuildInverseCurve(saturating.data(), 1024, curve);
    EXPECT_TRUE(std::is_sorted(curve.begin(), curve.end()));
    EXPECT_EQ(curve[255], 255);
    EXPECT_NEAR(curve[128], 128 / 1.3, 1.0);
}
