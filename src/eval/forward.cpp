#include "eval/forward.h"

#include "colour/colour_math.h"
#include "eval/interpolation.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

// The matrix/TRC set of direction 0: R, G, B through their tone curves and the colorant
// matrix to XYZ, left in the evaluation vector as the table-encoded Lab of an 8-bit table.
void MatrixTrcForward(CProfil& p) {
    double* e = p.m_Eval;
    const MatrixTrc& trc = p.m_Trc[0];
    double lin[3];
    for (int c = 0; c < 3; ++c) {
        const int k = static_cast<int>(Clamp(e[c], 0.0, 255.0) + 0.5);
        lin[c] = trc.curve[c].size() == 256 ? trc.curve[c][k] : e[c];
    }
    const auto& m = p.m_Lut[0].matrix;
    const double X = (m[0][0] * lin[0] + m[0][1] * lin[1] + m[0][2] * lin[2]) / 255.0;
    const double Y = (m[1][0] * lin[0] + m[1][1] * lin[1] + m[1][2] * lin[2]) / 255.0;
    const double Z = (m[2][0] * lin[0] + m[2][1] * lin[1] + m[2][2] * lin[2]) / 255.0;
    const Lab lab = p.XYZToLab(X, Y, Z);
    e[0] = Clamp(lab.L * kLightnessScale, 0.0, 255.0);
    e[1] = Clamp(lab.a + 128.0, 0.0, 255.0);
    e[2] = Clamp(lab.b + 128.0, 0.0, 255.0);
}

}  // namespace

int CmykToLab(CProfil& p, double* v) {
    double* e = p.m_Eval;
    e[0] = v[0];
    e[1] = v[1];
    e[2] = v[2];
    e[3] = v[3];
    InterpolateSimplex(p, 0);
    DecodeDirection0(p, v);
    return 1;
}

int MultiToLab(CProfil& p, double* v) {
    for (int k = 0; k < CProfil::kEvalSize; ++k) p.m_Eval[k] = v[k];
    InterpolateMultilinear(p, 0);
    DecodeDirection0(p, v);
    return 1;
}

int RgbToLab(CProfil& p, double* v) {
    double* e = p.m_Eval;
    e[0] = v[0];
    e[1] = v[1];
    e[2] = v[2];
    if (!IsMatrixTrc(p.m_Lut[0])) {
        InterpolateSimplex(p, 0);
        DecodeDirection0(p, v);
        return 1;
    }
    MatrixTrcForward(p);
    ScaleTableOutputs(p, 0, 3);
    // The matrix path hands over 8-bit table Lab, whatever the slot's PCS name says.
    StoreScaledLab(LabOfTableLab(p, 0, p.m_Eval, 128.0), v);
    return 1;
}

int DeviceToLab(CProfil& p, double* v, int channels) {
    if (channels == 3) return RgbToLab(p, v);
    if (channels >= 5) return MultiToLab(p, v);
    return CmykToLab(p, v);
}

int EvaluateDirection1(CProfil& p, double* v) {
    const LutSlot& lut = p.m_Lut[1];
    const int n = lut.inputChannels;
    const int m = lut.outputChannels;
    if (n < 1 || n > CProfil::kEvalSize || m < 1 || m > CProfil::kEvalSize) return 1;
    double* e = p.m_Eval;
    for (int k = 0; k < n; ++k) e[k] = v[k];
    InterpolateSlot(p, 1);
    ScaleTableOutputs(p, 1, m);
    for (int k = 0; k < m; ++k) v[k] = e[k];
    return 1;
}

int LabThroughTable(CProfil& p, double* v, int slot) {
    double* e = p.m_Eval;
    if (slot == 1) {
        EncodeForDirection1(p, v, true);
        InterpolateSimplex(p, 1);
        ScaleTableOutputs(p, 1, 3);
        const double half = LabHalf(p, 1);
        v[0] = e[0] > 255.0 ? 255.0 : e[0];
        v[1] = e[1] - half;
        v[2] = e[2] - half;
        return 1;
    }
    e[0] = v[0];
    e[1] = v[1] + LabHalf(p, 0);
    e[2] = v[2] + LabHalf(p, 0);
    InterpolateSimplex(p, 0);
    DecodeDirection0(p, v);
    return 1;
}

}  // namespace vantrel
