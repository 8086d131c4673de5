#include "eval/pcs_encoding.h"

#include "colour/colour_math.h"

namespace vantrel {

void DecodeDirection0(const CProfil& p, const double* t, double* lab) {
    Lab out;
    if (IsXyzPcs(p.m_Lut[0])) {
        XYZ xyz{t[0] / kXyzToTable, t[1] / kXyzToTable, t[2] / kXyzToTable};
        if (p.m_UseMediaWhite[0]) xyz = p.AdaptToAbsolute(xyz.X, xyz.Y, xyz.Z, 0);
        out = p.XYZToLab(xyz.X, xyz.Y, xyz.Z);
    } else {
        const double half = p.m_Precision[0] < 1 ? 128.0 : 127.5;
        out = Lab{t[0] / kLightnessScale, t[1] - half, t[2] - half};
        if (p.m_UseMediaWhite[0]) out = p.LabToAbsolute(out.L, out.a, out.b, 0);
    }
    const double scaled = out.L * kLightnessScale;
    lab[0] = scaled > 255.0 ? 255.0 : scaled;
    lab[1] = out.a;
    lab[2] = out.b;
}

namespace {

// XYZ (white Y = 1) through a 3x3 table matrix into 0..255 table units.
void XyzThroughMatrix(const LutSlot& lut, const XYZ& xyz, double* table) {
    const double v[3] = {xyz.X * 100.0, xyz.Y * 100.0, xyz.Z * 100.0};
    for (int r = 0; r < 3; ++r) {
        const double sum = lut.matrix[r][0] * v[0] + lut.matrix[r][1] * v[1] + lut.matrix[r][2] * v[2];
        table[r] = Clamp(sum * kXyz100ToTable, 0.0, 255.0);
    }
}

}  // namespace

void EncodeForDirection1(CProfil& p, double* lab, bool xyzPath) {
    lab[0] = Clamp(lab[0], 0.0, 255.0);
    lab[1] = Clamp(lab[1], -128.0, 127.0);
    lab[2] = Clamp(lab[2], -128.0, 127.0);
    const LutSlot& lut = p.m_Lut[1];
    Lab in{lab[0] / kLightnessScale, lab[1], lab[2]};
    double* e = p.m_Eval;
    if (xyzPath && IsXyzPcs(lut)) {
        XYZ xyz = p.LabToXYZ(in.L, in.a, in.b);
        if (p.m_UseMediaWhite[1]) xyz = p.AdaptToRelative(xyz.X, xyz.Y, xyz.Z, 1);
        XyzThroughMatrix(lut, xyz, e);
        return;
    }
    if (p.m_UseMediaWhite[1]) in = p.LabToRelative(in.L, in.a, in.b, 1);
    const double half = LabHalf(p, 1);
    e[0] = Clamp(in.L * kLightnessScale, 0.0, 255.0);
    e[1] = Clamp(in.a + half, 0.0, 255.0);
    e[2] = Clamp(in.b + half, 0.0, 255.0);
}

void EncodeForNode(const CProfil& p, int slot, const double* lab, double aLow, double* table) {
    Lab in{Clamp(lab[0], 0.0, 255.0) / kLightnessScale, Clamp(lab[1], aLow, 127.0), Clamp(lab[2], aLow, 127.0)};
    const LutSlot& lut = p.m_Lut[slot];
    if (IsXyzPcs(lut)) {
        XYZ xyz = p.LabToXYZ(in.L, in.a, in.b);
        if (p.m_UseMediaWhite[slot]) xyz = p.AdaptToRelative(xyz.X, xyz.Y, xyz.Z, slot);
        XyzThroughMatrix(lut, xyz, table);
        return;
    }
    if (p.m_UseMediaWhite[slot]) in = p.LabToRelative(in.L, in.a, in.b, slot);
    const double half = LabHalf(p, slot);
    table[0] = in.L * kLightnessScale;
    table[1] = in.a + half;
    table[2] = in.b + half;
    for (int k = 0; k < 3; ++k)
        if (table[k] < 0.0) table[k] = 0.0;
}

}  // namespace vantrel
