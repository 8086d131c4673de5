#pragma once

#include <cstdint>

#include "eval/lut_view.h"

namespace vantrel {

// A node index carried in a colour record as a double: rounded (+0.5, truncated) or truncated,
// and held to the grid so that a stray index cannot address memory outside the table.
inline int32_t RecordIndex(double value, int grid, bool rounded) {
    if (!(value > 0.0)) return 0;
    const double v = rounded ? value + 0.5 : value;
    if (v >= grid - 1) return grid - 1;
    return static_cast<int32_t>(v);
}

// CLUT offset of the node whose n indices start at `indices`.
inline int32_t NodeOffset(const LutView& t, const double* indices, bool rounded) {
    int32_t offset = 0;
    for (int i = 0; i < t.inputs; ++i) offset += RecordIndex(indices[i], t.grid, rounded) * t.clutStrides[i];
    return offset;
}

}  // namespace vantrel
