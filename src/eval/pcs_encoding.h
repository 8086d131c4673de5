#pragma once

#include <cstring>
#include <string>

#include "icc/profil.h"

namespace vantrel {

// XYZ with white Y = 1 to the 0..255 units of a table (32768 x 255 / 65535), and the same for
// XYZ on the 0..100 scale.
constexpr double kXyzToTable = 127.50194552529183;
constexpr double kXyz100ToTable = 1.2750194552529184;

inline double Clamp(double v, double lo, double hi) { return v < lo ? lo : (v > hi ? hi : v); }

inline bool IsXyzPcs(const LutSlot& lut) {
    return lut.pcs.size() >= 3 && std::memcmp(lut.pcs.data(), "XYZ", 3) == 0;
}
inline bool IsMatrixTrc(const LutSlot& lut) {
    return lut.type.size() == 4 && std::memcmp(lut.type.data(), "MATR", 4) == 0;
}
// True when the four-character data colour space matches; "RGB" also matches "RGB ".
inline bool SpaceIs(const std::string& space, const char* four) {
    const size_t n = std::strlen(four);
    if (space.size() >= n) return std::memcmp(space.data(), four, n) == 0;
    return n == 4 && four[3] == ' ' && space.size() == 3 && std::memcmp(space.data(), four, 3) == 0;
}

// The a*, b* offset of a table's Lab encoding: 128 for 8-bit tables, 127.5 for 16-bit ones.
inline double LabHalf(const CProfil& p, int slot) { return p.SixteenBit(slot) ? 127.5 : 128.0; }

// Brings the first `count` outputs of a 16-bit table onto 0..255.
inline void ScaleTableOutputs(CProfil& p, int slot, int count) {
    if (!p.SixteenBit(slot)) return;
    for (int j = 0; j < count; ++j) p.m_Eval[j] *= CProfil::kInv257;
}

// Table values to Lab (L* unscaled), absolute when the slot's direction uses the media white:
// XYZ with white Y = 1, or Lab in 0..255 table units with a*, b* offset by `half`.
Lab LabOfTableXyz(const CProfil& p, int slot, XYZ xyz);
Lab LabOfTableLab(const CProfil& p, int slot, const double* table, double half);
// Three PCS values of a slot's table (0..255) to Lab, by the slot's PCS.
Lab DecodePcs(const CProfil& p, int slot, const double* table);

// Writes scaled Lab (L* x 2.55, limited to 255 from above only; a*, b*) into lab[0..2].
inline void StoreScaledLab(const Lab& in, double* lab) {
    const double scaled = in.L * kLightnessScale;
    lab[0] = scaled > 255.0 ? 255.0 : scaled;
    lab[1] = in.a;
    lab[2] = in.b;
}

// The direction-0 table's three outputs in the evaluation vector (table units) to scaled Lab in
// lab[0..2].
void DecodeDirection0(CProfil& p, double* lab);

// Encodes a scaled Lab for the PCS side of slot s: clamped first (L* x 2.55 to 0..255, a*, b* to
// aLow..127), relative when the direction uses the media white, and for an "XYZ" table through its
// matrix unless `asLab`; 0..255 table units.
void EncodePcs(const CProfil& p, int slot, const double* lab, double aLow, double* table, bool asLab = false);

// Clamps the scaled Lab in lab[0..2] in place (a*, b* to -128..127) and puts its encoding for the
// direction-1 table into the evaluation vector. Without xyzPath every table gets Lab (the inverse
// matrix/TRC path decodes Lab itself).
void EncodeForDirection1(CProfil& p, double* lab, bool xyzPath);

}  // namespace vantrel
