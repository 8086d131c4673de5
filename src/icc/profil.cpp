#include "icc/profil.h"

#include <cstring>

#include "icc/icc_bytes.h"
#include "icc/icc_layout.h"

namespace vantrel {

CProfil::CProfil() {
    // A profile that has read nothing describes a D50 printer profile.
    std::memcpy(m_Header + icc::Header::kCmmType, "appl", 4);
    std::memcpy(m_Header + icc::Header::kDeviceClass, "prtr", 4);
    std::memcpy(m_Header + icc::Header::kSignature, "acsp", 4);
    StoreU32(m_Header + icc::Header::kIlluminant, 63188);
    StoreU32(m_Header + icc::Header::kIlluminant + 4, 65535);
    StoreU32(m_Header + icc::Header::kIlluminant + 8, 54059);
}

void CProfil::Release() {
    for (auto& tags : m_Tags) tags.clear();
    for (int slot = 0; slot < kSlots; ++slot) {
        m_InputCurves[slot] = {};
        m_Clut[slot] = {};
        m_OutputCurves[slot] = {};
        for (auto& curve : m_Trc[slot].curve) curve = {};
        // The descriptors go too: a later load that fails must not find the old counts and spaces.
        m_Lut[slot] = LutSlot{};
        m_Corners[slot] = 0;
    }
    m_FileInputEntries[0] = m_FileInputEntries[1] = 0;
    m_LegacyStretch[0] = m_LegacyStretch[1] = LegacyStretch{};
    m_LoadedTag[0] = m_LoadedTag[1] = 0;
    m_Precision[1] = 0;
    m_Precision[0] = kReleasedMarker;
}

bool CProfil::SlotHolds(int slot) const {
    if (slot < 0 || slot >= 2) return false;
    const LutSlot& lut = m_Lut[slot];
    if (lut.type == "MATR") {
        for (const auto& curve : m_Trc[slot].curve)
            if (curve.size() != 256) return false;
        return true;
    }
    const int n = lut.inputChannels;
    const int m = lut.outputChannels;
    if (n < 1 || n > kMaxInputs || m < 1 || m > kMaxOutputs || lut.gridPoints < 2) return false;
    uint64_t nodes = 1;
    for (int i = 0; i < n; ++i) nodes *= static_cast<uint64_t>(lut.gridPoints);
    return m_InputCurves[slot].size() == static_cast<uint64_t>(n) * static_cast<uint64_t>(lut.inputEntries) &&
           m_Clut[slot].size() == nodes * static_cast<uint64_t>(m) &&
           m_OutputCurves[slot].size() == static_cast<uint64_t>(m) * static_cast<uint64_t>(lut.outputEntries);
}

void CProfil::ResetSlot(int slot) {
    m_InputCurves[slot] = {};
    m_Clut[slot] = {};
    m_OutputCurves[slot] = {};
    m_LegacyStretch[slot] = LegacyStretch{};
    // The matrix and colorant count come from the direction's directory and stay with it.
    LutSlot& lut = m_Lut[slot];
    lut.tagIndex = 0;
    lut.type.clear();
    lut.pcs.clear();
    lut.colourSpace.clear();
    lut.inputChannels = lut.inputEntries = lut.outputChannels = lut.outputEntries = lut.gridPoints = 0;
}

}  // namespace vantrel
