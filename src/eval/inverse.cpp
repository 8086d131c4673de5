#include "eval/inverse.h"

#include "colour/colour_math.h"
#include "eval/device_search.h"
#include "eval/forward.h"
#include "eval/interpolation.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

// The inverse matrix/TRC set of direction 1: the table-encoded Lab of the evaluation vector to
// XYZ, through the inverse colorant matrix and the inverse tone curves to R, G, B.
void MatrixTrcInverse(CProfil& p) {
    double* e = p.m_Eval;
    const double half = LabHalf(p, 1);
    const XYZ xyz = p.LabToXYZ(e[0] / kLightnessScale, e[1] - half, e[2] - half);
    const auto& m = p.m_Lut[1].matrix;
    const MatrixTrc& trc = p.m_Trc[1];
    const double in[3] = {xyz.X, xyz.Y, xyz.Z};
    for (int c = 0; c < 3; ++c) {
        const double linear = (m[c][0] * in[0] + m[c][1] * in[1] + m[c][2] * in[2]) * 255.0;
        const double clamped = Clamp(linear, 0.0, 255.0);
        const int k = static_cast<int>(clamped + 0.5);
        e[c] = trc.curve[c].size() == 256 ? trc.curve[c][k] : clamped;
    }
}

void CopyCapped(const double* from, double* to, int count) {
    for (int k = 0; k < count; ++k) to[k] = from[k] > 255.0 ? 255.0 : from[k];
}

}  // namespace

int LabToCmyk(CProfil& p, double* v) {
    EncodeForDirection1(p, v, true);
    InterpolateSimplex(p, 1);
    ScaleTableOutputs(p, 1, 4);
    CopyCapped(p.m_Eval, v, 4);
    return 1;
}

int LabToMulti(CProfil& p, double* v) {
    EncodeForDirection1(p, v, true);
    InterpolateMultilinear(p, 1);
    // Only the table's outputs are device values; the entries past them are cleared so that the
    // vector can go straight back into a multi-channel forward evaluation.
    int m = p.m_Lut[1].outputChannels;
    if (m < 0) m = 0;
    if (m > CProfil::kEvalSize) m = CProfil::kEvalSize;
    ScaleTableOutputs(p, 1, m);
    CopyCapped(p.m_Eval, v, m);
    for (int k = m; k < CProfil::kEvalSize; ++k) v[k] = 0.0;
    return 1;
}

void LabToRgb(CProfil& p, double* v) {
    const bool matrix = IsMatrixTrc(p.m_Lut[1]);
    EncodeForDirection1(p, v, !matrix);
    if (matrix) {
        MatrixTrcInverse(p);
    } else {
        InterpolateSimplex(p, 1);
    }
    ScaleTableOutputs(p, 1, 3);
    CopyCapped(p.m_Eval, v, 3);
}

void LabToDevice(CProfil& p, double* v, int channels) {
    if (channels == 3) {
        LabToRgb(p, v);
    } else if (channels >= 5) {
        LabToMulti(p, v);
    } else {
        LabToCmyk(p, v);
    }
}

namespace {

// Coordinate descent on channels 0..2 in steps of `step`, each channel walking up while below
// `high` and then down while above `low`, keeping only strict improvements; rounds repeat
// while they help and the difference stays above `enough`.
void Descend(CProfil& p, const double* target, double* w, int channels, double& best, double step, double high,
             double low, double enough) {
    double lab[CProfil::kEvalSize];
    auto evaluate = [&]() {
        for (int k = 0; k < CProfil::kEvalSize; ++k) lab[k] = w[k];
        DeviceToLab(p, lab, channels);
        return DeltaE(target[0], target[1], target[2], lab[0] / kLightnessScale, lab[1], lab[2]);
    };
    for (;;) {
        const double roundStart = best;
        for (int c = 0; c < 3; ++c) {
            while (w[c] < high) {
                const double keep = w[c];
                w[c] = keep + step;
                const double e = evaluate();
                if (e < best) {
                    best = e;
                } else {
                    w[c] = keep;
                    break;
                }
            }
        }
        for (int c = 0; c < 3; ++c) {
            while (w[c] > low) {
                const double keep = w[c];
                w[c] = keep - step;
                const double e = evaluate();
                if (e < best) {
                    best = e;
                } else {
                    w[c] = keep;
                    break;
                }
            }
        }
        if (!(best < roundStart && best > enough)) return;
    }
}

}  // namespace

double* InverseSearch(CProfil& p, double L, double a, double b, const double* start, double* result,
                      double& deltaE) {
    const double target[3] = {L, a, b};
    int channels = p.m_Lut[1].outputChannels;
    if (channels < 1) channels = 4;
    double w[CProfil::kEvalSize] = {start[0], start[1], start[2], start[3]};
    int inUse[7] = {0, 0, 0, 1, 0, 0, 0};
    for (int c = 0; c < 3; ++c) inUse[c] = start[c] >= 0.5;

    double lab[CProfil::kEvalSize];
    for (int k = 0; k < CProfil::kEvalSize; ++k) lab[k] = w[k];
    DeviceToLab(p, lab, channels);
    const double startDelta = DeltaE(L, a, b, lab[0] / kLightnessScale, lab[1], lab[2]);

    // A start this far off is replaced by scans and a coarse lattice before the descent.
    double best = startDelta;
    if (startDelta > 300.2) {
        for (int c = 0; c < 3; ++c) w[c] = ScanChannel(p, target, w, c, 0.0, 255.0);
    }
    if (startDelta > 300.5) {
        double from[7] = {w[0], w[1], w[2], w[3], 0, 0, 0};
        double found[7];
        double gridDelta = startDelta;
        ConstrainedGridSearch(p, target, from, start[3] - 0.5, start[3] + 0.5, gridDelta, 12.25, 3, inUse, true,
                              found);
        for (int c = 0; c < 4; ++c) w[c] = found[c];
    }

    if (startDelta > 300.2) {
        for (int k = 0; k < CProfil::kEvalSize; ++k) lab[k] = w[k];
        DeviceToLab(p, lab, channels);
        best = DeltaE(L, a, b, lab[0] / kLightnessScale, lab[1], lab[2]);
    }
    Descend(p, target, w, channels, best, 1.0, 254.0, 1.0, 0.2);
    Descend(p, target, w, channels, best, 0.1, 254.9, 0.1, 0.1);

    if (best < startDelta) {
        for (int c = 0; c < 4; ++c) result[c] = w[c];
        deltaE = best;
    } else {
        for (int c = 0; c < 4; ++c) result[c] = start[c];
        deltaE = startDelta;
    }
    return result;
}

}  // namespace vantrel
