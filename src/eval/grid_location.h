#pragma once

namespace vantrel {

class CProfil;

// Where a colour falls in the grid of slot 0 or 1. The colour comes in a colour record: for
// slots of four or more inputs the device values in fields 0..3 (and 4..6 for more inputs);
// otherwise scaled Lab in fields 0..2, encoded for the slot's PCS side. Per input channel the
// record then gets a first result (fields 0..n-1) and a second one (fields 3..5 for slots of up
// to three inputs, fields n..2n-1 for four or more). Matrix/TRC slots have no grid: both
// operations return 0 and put 0, 1, 2 into fields 3..5.

// Nearest node: first result its index, second the signed distance g - index. Returns the
// distance to the node in grid units.
double LocateNearestNode(CProfil& profile, double* record, int slot);

// The cell: both results its lower index. The corner weights go to `weights` in counting
// order (channel 0 the most significant digit): for n inputs 2^n weights (up to 128), each the
// multilinear corner product raised to 1/n and times 1.25; one-input cells pass their two
// weights through the weighting polynomial instead. Returns the distance from the cell's first
// corner in grid units.
double LocateCell(CProfil& profile, double* record, int slot, double* weights);

// The weighting of one-input cells: the quartic through (0, 0), (0.25, 0.25), (0.5, 1),
// (0.75, 1.25), (1, 1), for w held to 0..1, and its result held to 0..1.25.
double WeightingPolynomial(double w);

}  // namespace vantrel
