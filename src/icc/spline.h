#pragma once

#include <vector>

namespace vantrel {

// A natural cubic spline in single precision, the gap filler of the tone-curve builders. Its
// knots and the curves it fills live on the working grid of 4080 positions (value x 16).
struct NaturalSpline {
    static constexpr int kGridPositions = 4080;

    std::vector<float> x;  // increasing
    std::vector<float> y;
    std::vector<float> m;  // second derivatives, 0 at both ends
};

// Fits the spline through knots (x[k], y[k]) with strictly increasing x. Throws std::bad_alloc.
void FitSpline(const std::vector<double>& x, const std::vector<double>& y, NaturalSpline& spline);
// The spline's value at `position`, on the first interval whose left knot is at or below it
// (the first or last interval outside the knots).
float EvaluateSpline(const NaturalSpline& spline, double position);
// The spline at every working-grid position: positions before the first knot take its value,
// positions after the last knot (and position 4079) the last value; all clamped to 0..4079.
void EvaluateSplineGrid(const NaturalSpline& spline, std::vector<double>& grid);

}  // namespace vantrel
