// Multilinear interpolation (trilinear and its generalisation) of tables of up to seven inputs.
#include "eval/interpolation.h"

#include "icc/corner_order.h"
#include "eval/grid_coordinate.h"

namespace vantrel {

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
        s.vector[j] = curves ? t.OutputCurveAt(j, sum) : sum;
    }
}

}  // namespace vantrel
