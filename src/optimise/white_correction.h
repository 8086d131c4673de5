#pragma once

#include "colour/colour_values.h"

namespace vantrel {

class CProfil;

// Carries colour p by the ratio between two paper whites: XYZ(p) / XYZ(from) x XYZ(to), against
// the profile's white (absolute when its direction 1 uses the media white). WhiteCorrection(V,
// measured white, wanted white) moves a colour printed on the measured paper to the wanted paper.
// L* is held to 0..100, a* and b* to -128..127, or -127.5..127.5 for precision code 1.
// A component of `from` that is not positive gives no ratio: p keeps that component.
Lab WhiteCorrection(const CProfil& profile, const Lab& p, const Lab& from, const Lab& to, int precision);

}  // namespace vantrel
