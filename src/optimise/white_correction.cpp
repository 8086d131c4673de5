#include "optimise/white_correction.h"

#include <cmath>

#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {

Lab WhiteCorrection(const CProfil& profile, const Lab& p, const Lab& from, const Lab& to, int precision) {
    const bool absolute = profile.m_UseMediaWhite[1] != 0;
    auto toXyz = [&](const Lab& v) {
        const XYZ xyz = profile.LabToXYZ(v.L, v.a, v.b);
        return absolute ? profile.AdaptToAbsolute(xyz.X, xyz.Y, xyz.Z, 1) : xyz;
    };
    const XYZ xp = toXyz(p);
    const XYZ xf = toXyz(from);
    const XYZ xt = toXyz(to);
    auto carry = [](double value, double white, double target) {
        const double carried = value / white * target;
        return white > 0.0 && std::isfinite(carried) ? carried : value;
    };
    XYZ moved{carry(xp.X, xf.X, xt.X), carry(xp.Y, xf.Y, xt.Y), carry(xp.Z, xf.Z, xt.Z)};
    if (absolute) moved = profile.AdaptToRelative(moved.X, moved.Y, moved.Z, 1);
    const Lab lab = profile.XYZToLab(moved.X, moved.Y, moved.Z);
    const double low = precision == 1 ? -127.5 : -128.0;
    const double high = precision == 1 ? 127.5 : 127.0;
    return {Clamp(lab.L, 0.0, 100.0), Clamp(lab.a, low, high), Clamp(lab.b, low, high)};
}

}  // namespace vantrel
