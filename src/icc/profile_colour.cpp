// The colour conversions that depend on a profile's white points.
#include <algorithm>

#include "colour/colour_math.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

Lab ClampLab(const Lab& lab) {
    return {std::clamp(lab.L, 0.0, 100.0), std::clamp(lab.a, -128.0, 127.0), std::clamp(lab.b, -128.0, 127.0)};
}

}  // namespace

Lab CProfil::XYZToLab(double X, double Y, double Z) const { return XYZToLabAgainst({X, Y, Z}, m_Illuminant[0]); }

XYZ CProfil::LabToXYZ(double L, double a, double b) const { return LabToXYZAgainst({L, a, b}, m_Illuminant[0]); }

// Table values are relative to the media white; absolute values carry it.
XYZ CProfil::AdaptToAbsolute(double X, double Y, double Z, int direction) const {
    if (!ValidDirection(direction)) return {X, Y, Z};
    return Bradford({X, Y, Z}, m_Illuminant[direction], m_MediaWhite[direction]);
}

XYZ CProfil::AdaptToRelative(double X, double Y, double Z, int direction) const {
    if (!ValidDirection(direction)) return {X, Y, Z};
    return Bradford({X, Y, Z}, m_MediaWhite[direction], m_Illuminant[direction]);
}

Lab CProfil::LabToAbsolute(double L, double a, double b, int direction) const {
    const XYZ xyz = LabToXYZ(L, a, b);
    const XYZ adapted = AdaptToAbsolute(xyz.X, xyz.Y, xyz.Z, direction);
    return ClampLab(XYZToLab(adapted.X, adapted.Y, adapted.Z));
}

Lab CProfil::LabToRelative(double L, double a, double b, int direction) const {
    const XYZ xyz = LabToXYZ(L, a, b);
    const XYZ adapted = AdaptToRelative(xyz.X, xyz.Y, xyz.Z, direction);
    return ClampLab(XYZToLab(adapted.X, adapted.Y, adapted.Z));
}

}  // namespace vantrel
