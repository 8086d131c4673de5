// The kernels' view of a loaded profile slot, and the profile-level kernel calls.
#include <cstring>

#include "eval/interpolation.h"
#include "icc/profil.h"

namespace vantrel {

namespace {

// Built field by field: an evaluation makes one per call, and zeroing it first costs more than
// filling it.
LutView NoTable() { return LutView{}; }

}  // namespace

LutView SlotView(const CProfil& p, int slot) {
    if (slot < 0 || slot > 1) return NoTable();
    const LutSlot& lut = p.m_Lut[slot];
    const int n = lut.inputChannels;
    const int m = lut.outputChannels;
    const int entries = lut.inputEntries;
    const int outEntries = lut.outputEntries;
    const int grid = lut.gridPoints;
    if (n < 1 || n > CProfil::kMaxInputs || m < 1 || m > KernelScratch::kVectorSize || grid < 1 || entries < 1 ||
        outEntries < 1)
        return NoTable();
    // The tables must be as large as the descriptor says, else nothing is read from them.
    const auto& in = p.m_InputCurves[slot];
    const auto& clut = p.m_Clut[slot];
    const auto& out = p.m_OutputCurves[slot];
    const uint64_t clutValues = static_cast<uint64_t>(p.m_ClutStride[slot][0]) * static_cast<uint64_t>(grid);
    if (in.size() < static_cast<uint64_t>(n) * entries || clut.empty() || clut.size() < clutValues ||
        out.size() < static_cast<uint64_t>(m) * outEntries)
        return NoTable();
    LutView v;
    v.inputs = n;
    v.outputs = m;
    v.inputEntries = entries;
    v.outputEntries = outEntries;
    v.grid = grid;
    v.gridScale = p.m_GridScale[slot];
    v.outputScale = p.m_OutputScale[slot];
    v.outputIdentity = p.m_OutputIdentity[slot] != 0;
    v.inputCurves = in.data();
    v.clut = clut.data();
    v.outputCurves = out.data();
    v.clutStrides = p.m_ClutStride[slot];
    v.cornerOffsets = p.m_CornerOffsets[slot];
    return v;
}

KernelScratch ProfileScratch(CProfil& p) {
    return {p.m_Eval, p.m_WorkRecords, p.m_Complement, p.m_CornerWeights};
}

void InterpolateSimplex(CProfil& p, int slot) {
    const LutView view = SlotView(p, slot);
    KernelScratch scratch = ProfileScratch(p);
    InterpolateSimplex(view, scratch);
}

void InterpolateMultilinear(CProfil& p, int slot) {
    const LutView view = SlotView(p, slot);
    KernelScratch scratch = ProfileScratch(p);
    InterpolateMultilinear(view, scratch);
}

bool UsesMultilinearKernel(const LutSlot& lut) {
    if (lut.inputChannels > 4) return true;
    static const char* const kMultiSpaces[] = {"5CLR", "MCH5", "6CLR", "MCH6", "7CLR", "MCH7"};
    if (lut.colourSpace.size() < 4) return false;
    for (const char* space : kMultiSpaces)
        if (std::memcmp(lut.colourSpace.data(), space, 4) == 0) return true;
    return false;
}

void InterpolateSlot(CProfil& p, int slot) {
    if (slot < 0 || slot > 1) return;
    if (UsesMultilinearKernel(p.m_Lut[slot])) {
        InterpolateMultilinear(p, slot);
    } else {
        InterpolateSimplex(p, slot);
    }
}

}  // namespace vantrel
