#pragma once

#include "eval/lut_view.h"

namespace vantrel {

class CProfil;

// The interpolation kernels. Both take the inputs (0..255) from the evaluation vector and leave
// the slot's outputs in its first m entries, in table units (0..255 for 8-bit tables, 0..65535
// for 16-bit ones); later entries keep what they held. Neither allocates.

// Sorted-fraction (simplex) interpolation, one to four inputs; other tables leave the
// vector unchanged. Output curves act on each corner, without interpolation.
void InterpolateSimplex(const LutView& t, KernelScratch& s);
void InterpolateSimplex(CProfil& profile, int slot);

// Multilinear interpolation, one to seven inputs. Output curves act once, on the
// interpolated value, with interpolation between their entries.
void InterpolateMultilinear(const LutView& t, KernelScratch& s);
void InterpolateMultilinear(CProfil& profile, int slot);

// Runs the kernel a slot's table calls for: multilinear for tables of five to seven
// colourants (and any table of more than four inputs), simplex otherwise.
void InterpolateSlot(CProfil& profile, int slot);

// The view of slot 0 or 1 of a profile. A slot whose tables are missing or smaller than its
// descriptor says gives a view of no inputs, which every kernel leaves alone.
LutView SlotView(const CProfil& profile, int slot);

}  // namespace vantrel
