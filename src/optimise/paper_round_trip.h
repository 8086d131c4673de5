#pragma once
// The paper profile's own evaluations as the output-profile optimisation chains them: device
// values to Lab through the direction-0 table, Lab back to device values through the
// direction-1 table. Device vectors hold CProfil::kEvalSize values on 0..255.

#include "colour/colour_values.h"
#include "eval/forward.h"
#include "eval/inverse.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {

// The device channel count that picks the evaluation (3 RGB, 5..7 multi-channel, else CMYK).
inline int DeviceChannels(const CProfil& p) {
    const int n = p.m_Lut[0].inputChannels;
    return n > 0 ? n : 4;
}

inline Lab ForwardLab(CProfil& p, const double* device, int channels) {
    double v[CProfil::kEvalSize];
    for (int c = 0; c < CProfil::kEvalSize; ++c) v[c] = device[c];
    DeviceToLab(p, v, channels);
    return {v[0] / kLightnessScale, v[1], v[2]};
}

inline void TableDevice(CProfil& p, const Lab& lab, int channels, double* device) {
    for (int c = 0; c < CProfil::kEvalSize; ++c) device[c] = 0.0;
    device[0] = lab.L * kLightnessScale;
    device[1] = lab.a;
    device[2] = lab.b;
    LabToDevice(p, device, channels);
}

inline Lab Midpoint(const Lab& p, const Lab& q) { return {(p.L + q.L) / 2, (p.a + q.a) / 2, (p.b + q.b) / 2}; }

}  // namespace vantrel
