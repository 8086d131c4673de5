#include "icc/tone_curve.h"

#include <cmath>
#include <new>

#include "icc/profil.h"
#include "icc/spline.h"
#include "support/rounding.h"

namespace vantrel {
namespace {

constexpr int kPositions = NaturalSpline::kGridPositions;  // the working grid: value x 16
constexpr int kLastPosition = kPositions - 1;


// A natural spline through `count` samples spread evenly over the working grid, their values
// divided by 257 and multiplied by `scale`, evaluated at every grid position.
void SplineThroughSamples(const uint16_t* samples, int count, double scale, std::vector<double>& grid) {
    std::vector<double> x(static_cast<size_t>(count));
    std::vector<double> y(static_cast<size_t>(count));
    for (int k = 0; k < count; ++k) {
        x[static_cast<size_t>(k)] = k * static_cast<double>(kLastPosition) / (count - 1);
        y[static_cast<size_t>(k)] = scale * samples[k] / 257.0;
    }
    NaturalSpline spline;
    FitSpline(x, y, spline);
    EvaluateSplineGrid(spline, grid);
}

// Inverts a table of cells (0 = empty) into the 256-entry curve: read directly when every cell
// from 1 on is filled, else through a spline over the filled cells and the origin.
// `scale` divides the cell values on their way into the curve.
void CurveFromCells(const std::vector<double>& cells, double scale, std::vector<double>& curve) {
    bool full = true;
    for (int p = 1; p < kPositions && full; ++p) full = cells[static_cast<size_t>(p)] != 0;
    std::vector<double> values;
    if (full) {
        values = cells;
    } else {
        std::vector<double> x{0.0};
        std::vector<double> y{0.0};
        for (int p = 1; p < kPositions; ++p)
            if (cells[static_cast<size_t>(p)] != 0) {
                x.push_back(p);
                y.push_back(cells[static_cast<size_t>(p)]);
            }
        NaturalSpline spline;
        FitSpline(x, y, spline);
        EvaluateSplineGrid(spline, values);
    }
    std::vector<double> built(256);
    for (int j = 0; j < 255; ++j) built[static_cast<size_t>(j)] = values[static_cast<size_t>(16 * j)] / scale;
    built[255] = 255.0;
    curve.swap(built);
}

}  // namespace

void BuildGammaCurveFor(double gamma, int slot, std::vector<double>& curve) {
    if (!(gamma > 0)) gamma = 0.001;
    try {
        if (gamma == 1.0) {
            std::vector<double> identity(256);
            for (int i = 0; i < 256; ++i) identity[static_cast<size_t>(i)] = i;
            curve.swap(identity);
            return;
        }
        if (slot == 0) {
            std::vector<double> forward(256, 0.0);
            for (int i = 1; i < 256; ++i) forward[static_cast<size_t>(i)] = 255.0 * std::pow(i / 255.0, gamma);
            curve.swap(forward);
            return;
        }
        // The inverse: each device value i marks the cell of its linear value on the working grid.
        std::vector<double> cells(kPositions, 0.0);
        for (int i = 0; i < 256; ++i) {
            const int cell = RoundHalfUp(kLastPosition * std::pow(i / 255.0, gamma));
            if (cell >= 0 && cell < kPositions) cells[static_cast<size_t>(cell)] = i;
        }
        CurveFromCells(cells, 1.0, curve);
    } catch (const std::bad_alloc&) {
        // The curve stays as it was.
    }
}

void CProfil::BuildGammaCurve(int slot, int channel) {
    if (slot < 0 || slot >= kSlots || channel < 0 || channel > 2) return;
    BuildGammaCurveFor(m_Trc[slot].gamma[channel], slot, m_Trc[slot].curve[channel]);
}

void BuildSampledCurve(const uint16_t* samples, int count, std::vector<double>& curve) {
    if (!samples || count < 2) return;
    try {
        std::vector<double> built(256, 0.0);
        if (count >= 256) {
            // Decimation: a sample is taken whenever the counter has fallen to 1 or below.
            const double step = count / 255.0;
            double counter = 0;
            int taken = 0;
            for (int k = 0; k < count && taken < 256; ++k) {
                if (counter <= 1) {
                    built[static_cast<size_t>(taken++)] = samples[k] / 257.0;
                    counter += step;
                }
                counter -= 1;
            }
            built[255] = samples[count - 1] / 257.0;
        } else {
            std::vector<double> grid;
            SplineThroughSamples(samples, count, 1.0, grid);
            for (int i = 0; i < 255; ++i) built[static_cast<size_t>(i)] = grid[static_cast<size_t>(16 * i)];
            built[255] = grid[kLastPosition];
        }
        curve.swap(built);
    } catch (const std::bad_alloc&) {
    }
}

void BuildInverseCurve(const uint16_t* samples, int count, std::vector<double>& curve) {
    if (!samples || count < 2) return;
    try {
        std::vector<double> cells(kPositions, 0.0);
        if (count >= 256) {
            int lastFilled = 0;
            for (int k = 0; k < count; ++k) {
                const int y = 16 * static_cast<int>(samples[k] / 257.0);
                // The top value 255 lands at 4080, one past the grid; the last cell is set below.
                if (y > lastFilled && y < kPositions) {
                    cells[static_cast<size_t>(y)] = k * static_cast<double>(kLastPosition) / (count - 1);
                    lastFilled = y;
                }
            }
            cells[kLastPosition] = kPositions;
        } else {
            std::vector<double> forward;
            SplineThroughSamples(samples, count, 16.0, forward);
            for (int i = 0; i < kPositions; ++i)
                cells[static_cast<size_t>(RoundHalfUp(forward[static_cast<size_t>(i)]))] = i;
        }
        CurveFromCells(cells, 16.0, curve);
    } catch (const std::bad_alloc&) {
    }
}

}  // namespace vantrel
