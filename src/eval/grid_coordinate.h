#pragma once

#include <cstdint>

#include "eval/lut_view.h"

namespace vantrel {

// An input-curve position this close to the next entry is taken as that entry.
constexpr double kInputSnap = 0.9999;
// A grid fraction this close to the next node is taken as that node.
constexpr double kGridSnap = 0.998;

// Maps input value x (0..255) of channel i through its input curve onto the grid: a
// coordinate between 0 and G - 1. Values outside 0..255 (and NaN) are held to the range so
// that the curve is never indexed outside its channel.
inline double GridCoordinate(const LutView& t, int i, double x, bool snapInput) {
    if (!(x > 0.0)) x = 0.0;
    if (x > 255.0) x = 255.0;
    const int first = i * t.inputEntries;
    const int last = first + t.inputEntries - 1;
    const double p = first + (t.inputEntries - 1) * x * (1.0 / 255.0);
    int k = static_cast<int>(p);
    double u = p - k;
    if (snapInput && u > kInputSnap) {
        ++k;
        u = 0.0;
    }
    double v;
    if (k >= last) {
        v = t.inputCurves[last];
    } else {
        const double lo = t.inputCurves[k];
        v = lo + (t.inputCurves[k + 1] - lo) * u;
    }
    return v * t.gridScale;
}

// Splits a grid coordinate into the cell's lower index and the fraction inside it. A point
// on (or numerically past) the last grid point sits there with fraction 0, so that no
// corner beyond the grid ever carries weight.
inline void SplitGridCoordinate(const LutView& t, double g, int32_t& index, double& fraction) {
    int32_t j = static_cast<int32_t>(g);
    double f = g - j;
    if (f > kGridSnap) {
        ++j;
        f = 0.0;
    }
    if (j >= t.grid - 1) {
        j = t.grid - 1;
        f = 0.0;
    }
    if (j < 0) {
        j = 0;
        f = 0.0;
    }
    index = j;
    fraction = f;
}

// Locates the cell of the inputs in scratch.vector: per channel the lower grid index, the
// fraction (also into f) and its complement. Returns the CLUT offset of the cell's first node.
// kInputs > 0 fixes the input count at compile time.
template <int kInputs = 0>
inline int32_t LocateKernelCell(const LutView& t, KernelScratch& s, double* f) {
    const int n = kInputs > 0 ? kInputs : t.inputs;
    int32_t base = 0;
    for (int i = 0; i < n; ++i) {
        const double g = GridCoordinate(t, i, s.vector[i], true);
        WorkRecord& r = s.records[i];
        SplitGridCoordinate(t, g, r.index, r.fraction);
        f[i] = r.fraction;
        s.complement[i] = 1.0 - r.fraction;
        base += r.index * t.clutStrides[i];
    }
    return base;
}

}  // namespace vantrel
