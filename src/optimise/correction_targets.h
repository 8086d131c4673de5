#pragma once

#include "colour/colour_values.h"

namespace vantrel {

class CProfil;

// Turning a measured error into a correction target. Lab results are held to L* 0..100 and
// a*, b* -128..127; device results are on the device scale (0..255).

// The reflection of p in q: 2q - p.
Lab ReflectLab(const Lab& p, const Lab& q);
// s moved by the error p - q: s - (q - p).
Lab ShiftLab(const Lab& p, const Lab& q, const Lab& s);
// The target t reflected in device space about the measured m: 2 x table(t) - table(m), per
// channel for four channels, not held to 0..255. table() is the direction-1 (B2A) evaluation.
void ReflectInDevice(CProfil& profile, const Lab& t, const Lab& m, double device[4]);
// The table's device values for the reflection of m in t (2t - m, held as ReflectLab holds it).
void ReflectInLab(CProfil& profile, const Lab& t, const Lab& m, double device[4]);

}  // namespace vantrel
