#include "icc/spline.h"

#include <cmath>

namespace vantrel {

void FitSpline(const std::vector<double>& x, const std::vector<double>& y, NaturalSpline& spline) {
    const size_t n = x.size() < y.size() ? x.size() : y.size();
    spline.x.assign(x.begin(), x.begin() + static_cast<std::ptrdiff_t>(n));
    spline.y.assign(y.begin(), y.begin() + static_cast<std::ptrdiff_t>(n));
    spline.m.assign(n, 0.0f);
    if (n < 3) return;
    const std::vector<float>& xs = spline.x;
    const std::vector<float>& ys = spline.y;
    std::vector<float>& m = spline.m;
    std::vector<float> u(n, 0.0f);
    // Forward sweep of the tridiagonal system; the natural ends keep m[0] = m[n-1] = 0.
    for (size_t i = 1; i + 1 < n; ++i) {
        const float sig = (xs[i] - xs[i - 1]) / (xs[i + 1] - xs[i - 1]);
        const float p = sig * m[i - 1] + 2.0f;
        m[i] = (sig - 1.0f) / p;
        const float slopes = (ys[i + 1] - ys[i]) / (xs[i + 1] - xs[i]) - (ys[i] - ys[i - 1]) / (xs[i] - xs[i - 1]);
        u[i] = (6.0f * slopes / (xs[i + 1] - xs[i - 1]) - sig * u[i - 1]) / p;
    }
    m[n - 1] = 0.0f;
    for (size_t k = n - 1; k-- > 0;) m[k] = m[k] * m[k + 1] + u[k];
}

namespace {

float EvaluateOn(const NaturalSpline& spline, size_t k, float position) {
    const float h = spline.x[k + 1] - spline.x[k];
    const float t = (position - spline.x[k]) / h;
    const float s = 1.0f - t;
    const float c0 = h * h * spline.m[k] / 6.0f;
    const float c1 = h * h * spline.m[k + 1] / 6.0f;
    return (spline.y[k] - c0) * s + (spline.y[k + 1] - c1) * t + c0 * s * s * s + c1 * t * t * t;
}

}  // namespace

float EvaluateSpline(const NaturalSpline& spline, double position) {
    const size_t n = spline.x.size();
    if (n == 0) return 0.0f;
    if (n == 1) return spline.y[0];
    const float p = static_cast<float>(position);
    size_t k = 0;
    while (k + 2 < n && !(spline.x[k] <= p && p < spline.x[k + 1])) ++k;
    if (p < spline.x[0]) k = 0;
    return EvaluateOn(spline, k, p);
}

void EvaluateSplineGrid(const NaturalSpline& spline, std::vector<double>& grid) {
    const int positions = NaturalSpline::kGridPositions;
    grid.assign(positions, 0.0);
    const size_t n = spline.x.size();
    if (n == 0) return;
    const int first = static_cast<int>(std::lround(spline.x.front()));
    const int last = static_cast<int>(std::lround(spline.x.back()));
    size_t k = 0;
    for (int p = 0; p < positions; ++p) {
        double value;
        if (p < first || n == 1) {
            value = spline.y.front();
        } else if (p > last) {
            value = spline.y.back();
        } else {
            // Positions rise, so the interval only moves forward.
            while (k + 2 < n && static_cast<float>(p) >= spline.x[k + 1]) ++k;
            value = EvaluateOn(spline, k, static_cast<float>(p));
        }
        if (p == positions - 1) value = spline.y.back();
        grid[static_cast<size_t>(p)] = value < 0 ? 0 : value > positions - 1 ? positions - 1 : value;
    }
}

}  // namespace vantrel
