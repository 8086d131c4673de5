#pragma once

#include <cstdint>

#include "icc/profil.h"

namespace vantrel {

// What the interpolation kernels read of one loaded lookup-table slot: counts, scales and
// the unpacked 16-bit curves and grid. A view owns nothing; it points into the profile.
// Its fields are set together by whoever makes the view (SlotView, or a test); a view of no
// inputs is left alone by every kernel.
struct LutView {
    int inputs;         // n
    int outputs;        // m
    int inputEntries;   // E, entries per input curve (256 or more)
    int outputEntries;  // O, entries per output curve
    int grid;           // G, grid points per dimension
    double gridScale;    // input-curve value to grid coordinate
    double outputScale;  // grid value to output-curve position
    bool outputIdentity;
    const uint16_t* inputCurves;   // n x E, channel-major
    const uint16_t* clut;          // G^n x m, first input slowest
    const uint16_t* outputCurves;  // m x O, channel-major
    const int32_t* clutStrides;    // per input channel: G^(n-1-i) x m
    const int32_t* cornerOffsets;  // 2^n cell corners, by raised-channel count then channel

    // The output curves act only when they are long enough to be real curves and are not the identity.
    bool UsesOutputCurves() const { return outputEntries >= 256 && !outputIdentity; }

    // Output curve j at a CLUT value, interpolated between its entries.
    double OutputCurveAt(int j, double value) const {
        const int first = j * outputEntries;
        const int last = first + outputEntries - 1;
        const double q = value * outputScale + first;
        int k = static_cast<int>(q);
        if (k < first) k = first;
        if (k > last) k = last;
        const double u = q - k;
        if (u > 0.0 && k < last) return outputCurves[k] + (outputCurves[k + 1] - outputCurves[k]) * u;
        return outputCurves[k];
    }
};

// The working fields an evaluation writes: they live in the profile being evaluated.
struct KernelScratch {
    static constexpr int kVectorSize = 20;
    static constexpr int kMaxCorners = 128;

    double* vector = nullptr;      // 20: inputs on 0..255 in, outputs in table units out
    WorkRecord* records = nullptr; // 20: grid index and fraction per input channel
    double* complement = nullptr;  // 20: 1 - fraction
    double* weights = nullptr;     // 128: corner weights of the multilinear kernel
};

}  // namespace vantrel
