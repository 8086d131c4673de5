// The kernels' view of a loaded profile slot, and the profile-level kernel calls.
#include <cstring>

#include "eval/interpolation.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

KernelScratch ProfileScratch(CProfil& p) {
    return {p.m_Eval, p.m_WorkRecords, p.m_Complement, p.m_CornerWeights};
}

// Tables of five to seven colourants, by their input count or their data colour space.
bool UsesMultilinearKernel(const LutSlot& lut) {
    if (lut.inputChannels > 4) return true;
    static const char* const kMultiSpaces[] = {"5CLR", "MCH5", "6CLR", "MCH6", "7CLR", "MCH7"};
    if (lut.colourSpace.size() < 4) return false;
    for (const char* space : kMultiSpaces)
        if (std::memcmp(lut.colourSpace.data(), space, 4) == 0) return true;
    return false;
}

}  // namespace

LutView SlotView(const CProfil& p, int slot) {
    if (slot < 0 || slot > 1) return LutView{};
    const LutSlot& lut = p.m_Lut[slot];
    const int n = lut.inputChannels;
    const int m = lut.outputChannels;
    const int entries = lut.inputEntries;
    const int outEntries = lut.outputEntries;
    const int grid = lut.gridPoints;
    if (n < 1 || n > CProfil::kMaxInputs || m < 1 || m > KernelScratch::kVectorSize || grid < 1 || entries < 1 ||
        outEntries < 1)
        return LutView{};
    // The tables must be as large as the descriptor says, else nothing is read from them.
    const auto& in = p.m_InputCurves[slot];
    const auto& clut = p.m_Clut[slot];
    const auto& out = p.m_OutputCurves[slot];
    const uint64_t clutValues = static_cast<uint64_t>(p.m_ClutStride[slot][0]) * static_cast<uint64_t>(grid);
    if (in.size() < static_cast<uint64_t>(n) * entries || clut.empty() || clut.size() < clutValues ||
        out.size() < static_cast<uint64_t>(m) * outEntries)
        return LutView{};
    return LutView{n, m, entries, outEntries, grid, p.m_GridScale[slot], p.m_OutputScale[slot],
                   p.m_OutputIdentity[slot] != 0, in.data(), clut.data(), out.data(), p.m_ClutStride[slot],
                   p.m_CornerOffsets[slot]};
}

void InterpolateSimplex(CProfil& p, int slot) {
    KernelScratch scratch = ProfileScratch(p);
    InterpolateSimplex(SlotView(p, slot), scratch);
}

void InterpolateMultilinear(CProfil& p, int slot) {
    KernelScratch scratch = ProfileScratch(p);
    InterpolateMultilinear(SlotView(p, slot), scratch);
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
