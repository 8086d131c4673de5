#pragma once

#include "eval/lut_view.h"

namespace vantrel {

// The interpolation kernels. Both take the inputs (0..255) from scratch.vector and leave the
// slot's outputs in its first m entries, in table units (0..255 for 8-bit tables, 0..65535
// for 16-bit ones); later entries keep what they held. Neither allocates.

// Sorted-fraction (simplex) interpolation, one to four inputs; other tables leave the
// vector unchanged. Output curves act on each corner, without interpolation.
void InterpolateSimplex(const LutView& t, KernelScratch& s);

// Multilinear interpolation, one to seven inputs. Output curves act once, on the
// interpolated value, with interpolation between their entries.
void InterpolateMultilinear(const LutView& t, KernelScratch& s);

}  // namespace vantrel
