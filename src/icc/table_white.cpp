#include "icc/table_white.h"

#include "eval/interpolation.h"
#include "icc/profil.h"

namespace vantrel {

// The PCS white through the slot-1 table with the kernel that table calls for.
bool EvaluateTableWhite(CProfil& profile) {
    if (SlotView(profile, 1).inputs < 1) return false;
    InterpolateSlot(profile, 1);
    return true;
}

}  // namespace vantrel
