#pragma once

namespace vantrel {

class CProfil;

// Device to colour through a loaded profile. Each works in place on the caller's array and
// returns 1. Device values are on 0..255; results are scaled Lab (L* x 2.55, a*, b*) in
// entries 0..2, absolute when direction 0 uses the media white. Entries from 3 on keep their
// values. None allocates.

// Four device values through the direction-0 table (simplex kernel).
int CmykToLab(CProfil& profile, double* values);
// Twenty device values (channels the profile lacks set to 0) through the direction-0 table
// (multilinear kernel), for profiles of five to seven colourants.
int MultiToLab(CProfil& profile, double* values);
// Three device values through the direction-0 table, or the matrix/TRC set of the profile.
int RgbToLab(CProfil& profile, double* values);
// The profile's own forward evaluation by its device channel count: 3 -> RgbToLab, 5 or
// more -> MultiToLab, otherwise CmykToLab. `values` holds 20 doubles.
int DeviceToLab(CProfil& profile, double* values, int deviceChannels);

// The n direction-1 inputs (table values on 0..255) through the direction-1 table, giving its
// m outputs on 0..255 in values[0..m-1]: device links and other tables fed with table values.
// Tables of five to seven colourants get the multilinear kernel, others the simplex kernel.
int EvaluateDirection1(CProfil& profile, double* values);

// A scaled Lab through a Lab-to-Lab table (such as an abstract correction profile) in slot 0
// or 1; the result, scaled Lab, replaces values[0..2].
int LabThroughTable(CProfil& profile, double* values, int slot);

}  // namespace vantrel
