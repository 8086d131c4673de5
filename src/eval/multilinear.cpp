// Multilinear interpolation (trilinear and its generalisation) of tables of up to seven inputs.
#include "eval/interpolation.h"

#include "eval/corner_order.h"
#include "eval/grid_coordinate.h"

namespace vantrel {
namespace {

// Maps an interpolated grid value through output curve j, interpolating between entries.
double ThroughOutputCurve(const LutView& t, int j, double sum) {
    const int first = j * t.outputEntries;
    const int last = first + t.outputEntries - 1;
    const double q = sum * t.outputScale + first;
    int k = static_cast<int>(q);
    if (k < first) k = first;
    if (k > last) k = last;
    const double u = q - k;
    const uint16_t* curve = t.outputCurves;
    if (u > 0.0 && k < last) return curve[k] + (curve[k + 1] - curve[k]) * u;
    return curve[k];
}

}  // namespace

void InterpolateMultilinear(const LutView& t, KernelScratch& s) {
    const int n = t.inputs;
    if (n < 1 || n > CornerOrder::kMaxInputs || t.outputs < 1 || t.outputs > KernelScratch::kVectorSize) return;
    double f[CornerOrder::kMaxInputs];
    const int32_t base = LocateKernelCell(t, s, f);

    // Corner weights: product of the fraction of each raised channel and the complement of
    // each other one. A corner past the last grid point always has weight 0.
    const int corners = 1 << n;
    for (int k = 0; k < corners; ++k) {
        const unsigned mask = CornerOrder::Mask(n, k);
        double w = 1.0;
        for (int i = 0; i < n; ++i) w *= ((mask >> i) & 1u) ? f[i] : s.complement[i];
        s.weights[k] = w;
    }

    const bool curves = t.UsesOutputCurves();
    for (int j = 0; j < t.outputs; ++j) {
        const uint16_t* clut = t.clut + base + j;
        double sum = 0.0;
        for (int k = 0; k < corners; ++k) {
            if (s.weights[k] > 0.0) sum += s.weights[k] * clut[t.cornerOffsets[k]];
        }
        s.vector[j] = curves ? ThroughOutputCurve(t, j, sum) : sum;
    }
}

}  // namespace vantrel
