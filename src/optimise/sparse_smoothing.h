#pragma once

#include "vantrel.h"

namespace vantrel {

class CProfil;
class NodeAccumulators;

// Smooths the interior nodes of a three-input direction-1 Lab table that the samples of a run
// did not reach (accumulated weight below 1): eight sweeps, each direction combination of the
// three axes once, replace such a node by (25 V + the sum of its 3 x 3 x 3 neighbourhood) / 52,
// reading the neighbours as they stand (nodes replaced earlier in the sweep count with their new
// values). The outer layer and every weighted node stay as they are. Reports "Smoothing ..." to
// `progress` (may be null); a non-zero answer stops at once with result 0, else 1. A table that
// is not a three-input Lab table, or accumulators of another grid, are left alone (result 1).
int SmoothSparseNodes(CProfil& profile, const NodeAccumulators& accumulators, ProgressCallback progress);

}  // namespace vantrel
