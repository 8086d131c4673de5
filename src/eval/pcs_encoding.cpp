#include "eval/pcs_encoding.h"

#include "colour/colour_math.h"

namespace vantrel {

Lab LabOfTableXyz(const CProfil& p, int slot, XYZ xyz) {
    if (p.m_UseMediaWhite[slot]) xyz = p.AdaptToAbsolute(xyz.X, xyz.Y, xyz.Z, slot);
    return p.XYZToLab(xyz.X, xyz.Y, xyz.Z);
}

Lab LabOfTableLab(const CProfil& p, int slot, const double* t, double half) {
    const Lab lab{t[0] / kLightnessScale, t[1] - half, t[2] - half};
    return p.m_UseMediaWhite[slot] ? p.LabToAbsolute(lab.L, lab.a, lab.b, slot) : lab;
}

Lab DecodePcs(const CProfil& p, int slot, const double* t) {
    if (!IsXyzPcs(p.m_Lut[slot])) return LabOfTableLab(p, slot, t, LabHalf(p, slot));
    return LabOfTableXyz(p, slot, XYZ{t[0] / kXyzToTable, t[1] / kXyzToTable, t[2] / kXyzToTable});
}

void DecodeDirection0(CProfil& p, double* lab) {
    ScaleTableOutputs(p, 0, 3);
    StoreScaledLab(DecodePcs(p, 0, p.m_Eval), lab);
}

void EncodePcs(const CProfil& p, int slot, const double* lab, double aLow, double* table, bool asLab) {
    Lab in{Clamp(lab[0], 0.0, 255.0) / kLightnessScale, Clamp(lab[1], aLow, 127.0), Clamp(lab[2], aLow, 127.0)};
    const LutSlot& lut = p.m_Lut[slot];
    if (!asLab && IsXyzPcs(lut)) {
        XYZ xyz = p.LabToXYZ(in.L, in.a, in.b);
        if (p.m_UseMediaWhite[slot]) xyz = p.AdaptToRelative(xyz.X, xyz.Y, xyz.Z, slot);
        // Y = 1 to the 0..100 scale, through the table's matrix, to table units.
        const double v[3] = {xyz.X * 100.0, xyz.Y * 100.0, xyz.Z * 100.0};
        for (int r = 0; r < 3; ++r) {
            const double sum = lut.matrix[r][0] * v[0] + lut.matrix[r][1] * v[1] + lut.matrix[r][2] * v[2];
            table[r] = Clamp(sum * kXyz100ToTable, 0.0, 255.0);
        }
        return;
    }
    if (p.m_UseMediaWhite[slot]) in = p.LabToRelative(in.L, in.a, in.b, slot);
    const double half = LabHalf(p, slot);
    table[0] = Clamp(in.L * kLightnessScale, 0.0, 255.0);
    table[1] = Clamp(in.a + half, 0.0, 255.0);
    table[2] = Clamp(in.b + half, 0.0, 255.0);
}

void EncodeForDirection1(CProfil& p, double* lab, bool xyzPath) {
    lab[0] = Clamp(lab[0], 0.0, 255.0);
    lab[1] = Clamp(lab[1], -128.0, 127.0);
    lab[2] = Clamp(lab[2], -128.0, 127.0);
    EncodePcs(p, 1, lab, -128.0, p.m_Eval, !xyzPath);
}

}  // namespace vantrel
