#pragma once

namespace vantrel {

class CProfil;

// Reading and writing the nodes of a loaded profile's tables. A colour record is an array of
// 17 doubles: fields 0..2 scaled Lab (L* x 2.55, a*, b*) or device values, field 3 the fourth
// device value or an output channel, node indices (as doubles) from field 4 on as stated per
// operation, fields 14..16 device values 4..6. Node indices are held to the grid.

// The PCS value the slot-1 node with indices in fields 0..2 stands for, as scaled Lab in
// fields 0..2 (absolute when direction 1 uses the media white); for tables of four or more
// inputs the four input values (0..255) in fields 0..3.
void NodePcsValue(CProfil& profile, double* record);

// The scaled Lab stored at the node of slot `slot` whose indices are in fields 4..; through
// the output curves when `throughCurves`. Returns 1.
int ReadNodeLab(CProfil& profile, double* record, int slot, bool throughCurves);

// Stores the scaled Lab of fields 0..2 at the node of slot `slot` (indices in fields 4..).
// Returns 1.
int WriteNodeLab(CProfil& profile, double* record, int slot);

// Stores one output of a node: the channel in field 3 (Lab tables) or all three (XYZ tables)
// of the scaled Lab in fields 0..2, at the node whose indices are in fields 4.. (truncated).
// The record comes back unchanged. Returns 1.
int WriteNodeChannelLab(CProfil& profile, double* record, int slot);

// The outputs (0..255) of a slot-1 node into fields 0..m-1. The indices follow the input count:
// fields 4..6 for three inputs, fields n..2n-1 for n of four or more. Returns 1.
int ReadNodeDevice(CProfil& profile, double* record, bool throughCurves);

// Stores device values at a slot-1 node: outputs 0..3 from fields 0..3, outputs 4..6 from
// fields 14..16; indices as ReadNodeDevice. With `throughCurves` each stored value is the one
// that the output curve maps onto the wanted value. Returns 1.
int WriteNodeDevice(CProfil& profile, double* record, bool throughCurves);

}  // namespace vantrel
