#include <algorithm>
#include <cstring>
#include <new>

#include "icc/icc_bytes.h"
#include "icc/icc_layout.h"
#include "icc/profil.h"
#include "icc/tone_curve.h"

namespace vantrel {
namespace {

// No real profile has this many tags; a larger count only reserves memory.
constexpr uint32_t kMaxTags = 4096;
// Curves are at most this long by the format's use; a larger count is a broken tag.
constexpr uint32_t kMaxCurveEntries = 65535;

// The channel of a colorant or TRC tag, -1 for other signatures.
int RgbChannel(const std::string& signature, const char* suffix) {
    static const char kChannels[] = "rgb";
    for (int c = 0; c < 3; ++c)
        if (signature[0] == kChannels[c] && signature.compare(1, 3, suffix) == 0) return c;
    return -1;
}

// The bytes of a LUT head up to its tables: mft1 and mft2 carry the matrix (and mft2 the curve
// lengths) up to the tables; mAB/mBA carry the five element offsets.
uint64_t LutHeadSize(const std::string& type) {
    return type == "mft1" ? icc::Mft1::kTables : type == "mft2" ? icc::Mft2::kTables : icc::LutAB::kHeadSize;
}

}  // namespace

bool CProfil::ReadLutHead(const IccBytes& file, int direction, TagEntry& entry) {
    const uint64_t at = entry.offset;
    const std::string& type = entry.type;
    if (!file.Has(at, LutHeadSize(type))) return false;
    entry.inputChannels = file.U8(at + icc::LutHead::kInputs);
    entry.outputChannels = file.U8(at + icc::LutHead::kOutputs);
    entry.gridPoints = file.U8(at + icc::LutHead::kGrid);
    entry.inputEntries = entry.outputEntries = 256;

    if (type == "mft1" || type == "mft2") {
        for (int k = 0; k < 9; ++k) entry.matrix[k] = file.S15Fixed16(at + icc::Mft2::kMatrix + 4 * k);
        // The colorimetric table's matrix describes the slot.
        if ((entry.signature == "A2B1" && direction == 0) || (entry.signature == "B2A1" && direction == 1))
            std::memcpy(m_Lut[direction].matrix, entry.matrix, sizeof m_Lut[direction].matrix);
        if (type == "mft2") {
            entry.inputEntries = file.U16(at + icc::Mft2::kInputEntries);
            entry.outputEntries = file.U16(at + icc::Mft2::kOutputEntries);
        }
        return true;
    }

    const bool aToB = type == "mAB ";
    const uint64_t matrix = file.U32(at + icc::LutAB::kMatrix);
    const uint64_t mCurves = file.U32(at + icc::LutAB::kMCurves);
    const uint64_t clut = file.U32(at + icc::LutAB::kClut);
    const uint64_t inputSide = file.U32(at + icc::LutAB::InputCurves(aToB));
    const uint64_t outputSide = file.U32(at + icc::LutAB::OutputCurves(aToB));
    // Only tables of curves, CLUT and curves are held; matrix-based ones end the directory
    // ("Wrong Type of ICC4 Profile (Matrix based) !").
    if (matrix != 0 || mCurves != 0 || inputSide == 0 || outputSide == 0 || clut == 0) {
        m_LoadFailure = "Wrong Type of ICC4 Profile (Matrix based) !";
        return false;
    }
    // The first curve of each side gives the entry count; the CLUT head gives the grid.
    if (!file.Has(at + inputSide, icc::Curve::kEntries) || !file.Has(at + outputSide, icc::Curve::kEntries) ||
        !file.Has(at + clut, icc::ClutHead::kValues))
        return false;
    entry.inputEntries = file.U16(at + inputSide + icc::Curve::kEntryCount);
    entry.outputEntries = file.U16(at + outputSide + icc::Curve::kEntryCount);
    entry.gridPoints = file.U8(at + clut + icc::ClutHead::kGridPoints + (direction == 0 ? 0 : 1));
    return true;
}

bool CProfil::ReadColorant(const IccBytes& file, int direction, TagEntry& entry, int channel) {
    const uint64_t at = entry.offset;
    if (entry.size != icc::XyzNumber::kSize || !icc::IsXyzType(entry.type) || !file.Has(at, icc::XyzNumber::kSize))
        return false;
    entry.inputChannels = entry.outputChannels = 3;
    // Each colorant is a column of the matrix (rows X, Y, Z).
    for (int row = 0; row < 3; ++row)
        m_Lut[direction].matrix[row][channel] = file.S15Fixed16(at + icc::XyzNumber::kValues + 4 * row);
    return true;
}

bool CProfil::ReadToneCurve(const IccBytes& file, int direction, const TagEntry& entry, int channel) {
    const uint64_t at = entry.offset;
    if (entry.type != "curv" || !file.Has(at, icc::Curve::kEntries)) return false;
    const uint32_t entries = file.U32(at + icc::Curve::kCount);
    std::vector<double>& curve = m_Trc[direction].curve[channel];
    if (entries == 0) {
        curve.resize(256);
        for (int k = 0; k < 256; ++k) curve[k] = k;
        return true;
    }
    if (entries == 1) {
        if (!file.Has(at + icc::Curve::kEntries, 2)) return false;
        m_Trc[direction].gamma[channel] = file.U16(at + icc::Curve::kEntries) / 256.0;  // u8Fixed8
        BuildGammaCurve(direction, channel);
        return true;
    }
    if (entries > kMaxCurveEntries || !file.Has(at + icc::Curve::kEntries, 2 * uint64_t{entries})) return false;
    std::vector<uint16_t> samples(entries);
    for (uint32_t k = 0; k < entries; ++k) samples[k] = file.U16(at + icc::Curve::kEntries + 2 * k);
    // Device to PCS samples the curve; PCS to device inverts it.
    if (direction == 0)
        BuildSampledCurve(samples.data(), static_cast<int>(entries), curve);
    else
        BuildInverseCurve(samples.data(), static_cast<int>(entries), curve);
    return true;
}

bool CProfil::ReadTag(const IccBytes& file, int direction, uint32_t i, int& colorants) {
    const uint64_t record = icc::TagRecord::At(i);
    if (!file.Has(record, icc::TagRecord::kSize)) return false;
    TagEntry& entry = m_Tags[direction][i];
    const uint64_t offset = file.U32(record + icc::TagRecord::kOffset);
    if (!file.Has(offset, 4)) return false;
    entry.signature = file.Signature(record + icc::TagRecord::kSignature);
    entry.offset = static_cast<uint32_t>(offset);
    entry.size = file.U32(record + icc::TagRecord::kDataSize);
    entry.type = file.Signature(offset + icc::TagData::kType);
    const std::string& signature = entry.signature;

    if (IsLutType(entry.type) && !ReadLutHead(file, direction, entry)) return false;

    if (icc::IsTextType(entry.type) && signature == "cprt" && entry.size > icc::TagData::kBody &&
        file.Has(offset + icc::TagData::kBody, 0)) {
        const uint64_t text = offset + icc::TagData::kBody;
        const uint64_t length = std::min<uint64_t>(entry.size - icc::TagData::kBody, file.Size() - text);
        entry.copyright = file.Bytes().substr(static_cast<size_t>(text), static_cast<size_t>(length));
    }

    if (signature == "wtpt") {
        if (!file.Has(offset + icc::XyzNumber::kValues, 12)) return false;
        for (int axis = 0; axis < 3; ++axis)
            m_MediaWhite[direction][axis] = file.U16Fixed16(offset + icc::XyzNumber::kValues + 4 * axis);
    }

    if (const int c = RgbChannel(signature, "XYZ"); c >= 0) {
        if (!ReadColorant(file, direction, entry, c)) return false;
        ++colorants;
    }
    if (const int c = RgbChannel(signature, "TRC"); c >= 0 && !ReadToneCurve(file, direction, entry, c)) return false;
    if (signature == "gamt") m_GamutTagIndex[direction] = static_cast<int32_t>(i + 1);
    return true;
}

void CProfil::ReadTagTable(int direction, const std::string& path) {
    if (!ValidDirection(direction)) return;
    m_LoadFailure.clear();
    IccBytes file;
    if (!file.Load(path) || !file.Has(0, icc::Header::kSize)) {
        m_LoadFailure = "cannot be read as an ICC profile";
        return;
    }

    std::memcpy(m_Header, file.Bytes().data(), kHeaderSize);
    const uint32_t count = file.U32(icc::Header::kTagCount);

    std::vector<TagEntry>& tags = m_Tags[direction];
    tags.clear();
    try {
        tags.resize(count < kMaxTags ? count : kMaxTags);
    } catch (const std::bad_alloc&) {
        return;
    }

    // The illuminant is also the media white until a "wtpt" tag says otherwise.
    for (int axis = 0; axis < 3; ++axis) {
        m_Illuminant[direction][axis] = file.U16Fixed16(icc::Header::kIlluminant + 4 * axis);
        m_MediaWhite[direction][axis] = m_Illuminant[direction][axis];
    }

    // What this directory says about the matrix/TRC transform is read afresh.
    LutSlot& lut = m_Lut[direction];
    lut.colorantCount = 0;
    for (auto& curve : m_Trc[direction].curve) curve.clear();
    m_GamutTagIndex[direction] = 0;
    int colorants = 0;

    for (uint32_t i = 0; i < tags.size(); ++i) {
        // A tag that cannot be read whole ends the directory: it and the entries after it stay empty.
        bool read = false;
        try {
            read = ReadTag(file, direction, i, colorants);
        } catch (const std::bad_alloc&) {
        }
        if (!read) {
            if (m_LoadFailure.empty()) m_LoadFailure = "tag " + std::to_string(i + 1) + " is broken";
            tags[i] = TagEntry{};
            return;
        }
    }
    if (colorants == 3) lut.colorantCount = 3;
}

}  // namespace vantrel
