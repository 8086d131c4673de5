#pragma once

#include <array>
#include <cstdint>

#include "icc/profil.h"

namespace vantrel {

// The corner weights of a cell: 2^n for n inputs, up to 128 for seven.
using CornerWeights = std::array<double, CProfil::kMaxCorners>;

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
// order (channel 0 the most significant digit): for n inputs the first 2^n entries, each the
// multilinear corner product raised to 1/n and times 1.25; one-input cells pass their two
// weights through the weighting polynomial instead. Returns the distance from the cell's first
// corner in grid units.
double LocateCell(CProfil& profile, double* record, int slot, CornerWeights& weights);

// The nearest node of a slot whose inputs are device values (a device link), for any input
// count: three-input links too, which LocateNearestNode would take as a Lab. `device` holds the
// slot's n inputs on 0..255; the node's indices go to indices[0..n-1]. Returns the distance to
// it in grid units, or -1 for a slot without a grid.
double LocateNearestDeviceNode(CProfil& profile, int slot, const double* device, int32_t* indices);

// Which node accessors a located node is meant for: ReadNodeLab, WriteNodeLab and
// WriteNodeChannelLab read indices from field 4 on; ReadNodeDevice and WriteNodeDevice from
// field 4 for three inputs and from field n for n of four or more.
enum class NodeFields { kLab, kDevice };

// Moves the node indices that LocateNearestNode or LocateCell left in fields 0..n-1 to the
// fields the chosen accessors read, so that a node is never addressed by its fractions (for
// four or more inputs those sit exactly where the device accessors look). The record holds
// at least CProfil::kEvalSize doubles.
void PlaceLocatedNode(const CProfil& profile, double* record, int slot, NodeFields fields);

// The weighting of one-input cells: the quartic through (0, 0), (0.25, 0.25), (0.5, 1),
// (0.75, 1.25), (1, 1), for w held to 0..1, and its result held to 0..1.25.
double WeightingPolynomial(double w);

}  // namespace vantrel
