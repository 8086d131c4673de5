#pragma once

namespace vantrel {

class CProfil;

// Adds a device correction to one entry of a profile's direction-1 CLUT. The record holds the
// node indices i, j, k in fields 0..2, corrections d0..d3 (device scale 0..255) in fields 3..6
// and the output channel c in field 7; d[c] is added to that output of node (i, j, k).
// A 16-bit table takes the correction times 257 and stays within 0..65535, an 8-bit table takes
// it as it is and stays within 0..255; either way it is rounded half away from zero first.
// A channel the table does not have, an index outside the grid or a slot without a table leave
// everything as it is. Returns 1.
int AddToNode(CProfil& profile, const double* record);

}  // namespace vantrel
