#include "eval/inverse.h"

#include <algorithm>

#include "colour/colour_math.h"
#include "eval/device_search.h"
#include "eval/forward.h"
#include "eval/interpolation.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

// Starts this far off (a ΔE no real colour pair reaches) are first replaced by channel scans,
// and a little further off by a coarse lattice search as well.
constexpr double kScanBeyond = 300.2;
constexpr double kLatticeBeyond = 300.5;
// The lattice of that last resort: step and most colourants at once, black held at the start's.
constexpr double kLatticeStep = 12.25;
constexpr int kLatticeInks = 3;

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

// The difference between the target and the forward evaluation of w (20 values).
double DeltaTo(CProfil& p, const double* target, const double* w, int channels) {
    double lab[CProfil::kEvalSize];
    for (int k = 0; k < CProfil::kEvalSize; ++k) lab[k] = w[k];
    DeviceToLab(p, lab, channels);
    return DeltaE(target[0], target[1], target[2], lab[0] / kLightnessScale, lab[1], lab[2]);
}

// Coordinate descent on channels 0..2, each channel walking up while below the phase's upper
// bound and then down while above its lower one, keeping only strict improvements; rounds repeat
// while they help and the difference stays above the phase's threshold.
void Descend(CProfil& p, const double* target, double* w, int channels, double& best, const DescentPhase& ph) {
    RepeatRounds(ph, best, [&] {
        for (const double step : {ph.step, -ph.step}) {
            for (int c = 0; c < 3; ++c) {
                while (step > 0.0 ? w[c] < ph.high : w[c] > ph.low) {
                    const double keep = w[c];
                    w[c] = keep + step;
                    const double e = DeltaTo(p, target, w, channels);
                    if (!(e < best)) {
                        w[c] = keep;
                        break;
                    }
                    best = e;
                }
            }
        }
    });
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
    const int m = std::clamp(p.m_Lut[1].outputChannels, 0, CProfil::kEvalSize);
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

double* InverseSearch(CProfil& p, double L, double a, double b, const double* start, double* result,
                      double& deltaE) {
    const double target[3] = {L, a, b};
    // The forward evaluation takes as many channels as the direction-0 table has inputs. (The
    // direction-1 table's outputs say the same for an output profile, but not for a printer model
    // loaded with its forward table in both slots, whose slot 1 gives three Lab outputs.)
    int channels = p.m_Lut[0].inputChannels;
    if (channels < 1) channels = 4;
    double w[CProfil::kEvalSize] = {start[0], start[1], start[2], start[3]};
    const double startDelta = DeltaTo(p, target, w, channels);

    // A start this far off is replaced by scans and a coarse lattice before the descent.
    double best = startDelta;
    if (startDelta > kScanBeyond) {
        for (int c = 0; c < 3; ++c) w[c] = ScanChannel(p, target, w, c, 0.0, 255.0);
    }
    if (startDelta > kLatticeBeyond) {
        const int inUse[7] = {start[0] >= 0.5, start[1] >= 0.5, start[2] >= 0.5, 1, 0, 0, 0};
        const double from[7] = {w[0], w[1], w[2], w[3], 0, 0, 0};
        GridSearchRequest request;
        request.target = target;
        request.start = from;
        request.blackLow = start[3] - 0.5;
        request.blackHigh = start[3] + 0.5;
        request.step = kLatticeStep;
        request.limit = kLatticeInks;
        request.flags = inUse;
        request.lightnessRule = true;
        double found[7];
        double gridDelta = startDelta;
        ConstrainedGridSearch(p, request, gridDelta, found);
        std::copy(found, found + 4, w);
    }
    if (startDelta > kScanBeyond) best = DeltaTo(p, target, w, channels);
    for (const DescentPhase& ph : kDescentPhases) Descend(p, target, w, channels, best, ph);

    const bool improved = best < startDelta;
    const double* answer = improved ? w : start;
    std::copy(answer, answer + 4, result);
    deltaE = improved ? best : startDelta;
    return result;
}

}  // namespace vantrel
