#include "optimise/correction_targets.h"

#include "eval/inverse.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

Lab Held(double L, double a, double b) {
    return {Clamp(L, 0.0, 100.0), Clamp(a, -128.0, 127.0), Clamp(b, -128.0, 127.0)};
}

// The direction-1 table's four device values for a Lab.
void TableDevice(CProfil& profile, const Lab& lab, double device[4]) {
    double v[CProfil::kEvalSize] = {lab.L * kLightnessScale, lab.a, lab.b};
    LabToCmyk(profile, v);
    for (int c = 0; c < 4; ++c) device[c] = v[c];
}

}  // namespace

Lab ReflectLab(const Lab& p, const Lab& q) { return Held(2 * q.L - p.L, 2 * q.a - p.a, 2 * q.b - p.b); }

Lab ShiftLab(const Lab& p, const Lab& q, const Lab& s) {
    return Held(s.L - (q.L - p.L), s.a - (q.a - p.a), s.b - (q.b - p.b));
}

void ReflectInDevice(CProfil& profile, const Lab& t, const Lab& m, double device[4]) {
    double dt[4], dm[4];
    TableDevice(profile, t, dt);
    TableDevice(profile, m, dm);
    for (int c = 0; c < 4; ++c) device[c] = 2 * dt[c] - dm[c];
}

void ReflectInLab(CProfil& profile, const Lab& t, const Lab& m, double device[4]) {
    TableDevice(profile, ReflectLab(m, t), device);
}

}  // namespace vantrel
