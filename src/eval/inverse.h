#pragma once

namespace vantrel {

class CProfil;

// Colour to device values through a loaded profile's direction-1 table (its B2A or gamut
// table, or the inverse matrix/TRC set). The input is scaled Lab (L* x 2.55, a*, b*) in
// values[0..2], clamped in place first (L* x 2.55 to 0..255, a*, b* to -128..127) and taken as
// absolute when direction 1 uses the media white. Results above 255 are cut to 255.

// Four device values into values[0..3]; returns 1.
int LabToCmyk(CProfil& profile, double* values);
// Twenty values into values[0..19] (multilinear kernel): the table's outputs, 0 past them.
// Returns 1.
int LabToMulti(CProfil& profile, double* values);
// Three device values into values[0..2].
void LabToRgb(CProfil& profile, double* values);
// The profile's own table evaluation by its device channel count (3 -> LabToRgb, 5 or more
// -> LabToMulti, otherwise LabToCmyk). `values` holds 20 doubles.
void LabToDevice(CProfil& profile, double* values, int deviceChannels);

// Device values of the profile's first three channels whose forward evaluation comes closest
// to the target (L* unscaled), starting from `start` (4 values; the fourth, black for CMYK,
// never moves). Writes the result to `result` and its CIE 1976 difference to `deltaE`, and
// returns `result`. When nothing improves on the start, the start comes back with its own
// difference.
double* InverseSearch(CProfil& profile, double L, double a, double b, const double* start, double* result,
                      double& deltaE);

}  // namespace vantrel
