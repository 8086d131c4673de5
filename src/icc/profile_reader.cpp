#include <algorithm>
#include <cstring>
#include <new>

#include "icc/icc_bytes.h"
#include "icc/profil.h"
#include "icc/tone_curve.h"

namespace vantrel {
namespace {

// No real profile has this many tags; a larger count only reserves memory.
constexpr uint32_t kMaxTags = 4096;
// A "curv" element: signature, reserved, 32-bit count, then the 16-bit entries.
constexpr uint64_t kCurveHead = 12;

// The channel of a colorant or TRC tag, -1 for other signatures.
int RgbChannel(const std::string& signature, const char* suffix) {
    static const char kChannels[] = "rgb";
    for (int c = 0; c < 3; ++c)
        if (signature[0] == kChannels[c] && signature.compare(1, 3, suffix) == 0) return c;
    return -1;
}

}  // namespace

bool CProfil::ReadTag(const IccBytes& file, int direction, uint32_t i, int& colorants) {
    LutSlot& lut = m_Lut[direction];
    MatrixTrc& trc = m_Trc[direction];
    const uint64_t record = kHeaderSize + 12 * uint64_t{i};
    if (!file.Has(record, 12)) return false;
    TagEntry& entry = m_Tags[direction][i];
    const std::string signature = file.Signature(record);
    const uint64_t offset = file.U32(record + 4);
    const uint64_t size = file.U32(record + 8);
    if (!file.Has(offset, 4)) return false;
    entry.signature = signature;
    entry.offset = static_cast<uint32_t>(offset);
    entry.size = static_cast<uint32_t>(size);
    entry.type = file.Signature(offset);
    const std::string& type = entry.type;

    if (IsLutType(type)) {
        // mft1 and mft2 heads run to byte 48 (52 with the mft2 entry counts); mAB/mBA to byte 32.
        const uint64_t head = type == "mft1" ? 48 : type == "mft2" ? 52 : 32;
        if (!file.Has(offset, head)) return false;
        entry.inputChannels = file.U8(offset + 8);
        entry.outputChannels = file.U8(offset + 9);
        entry.gridPoints = file.U8(offset + 10);
        entry.inputEntries = entry.outputEntries = 256;
        if (type == "mft1" || type == "mft2") {
            for (int k = 0; k < 9; ++k) entry.matrix[k] = file.S15Fixed16(offset + 12 + 4 * k);
            if ((signature == "A2B1" && direction == 0) || (signature == "B2A1" && direction == 1))
                std::memcpy(lut.matrix, entry.matrix, sizeof lut.matrix);
        }
        if (type == "mft2") {
            entry.inputEntries = file.U16(offset + 48);
            entry.outputEntries = file.U16(offset + 50);
        }
        if (type == "mAB " || type == "mBA ") {
            const uint64_t bCurves = file.U32(offset + 12);
            const uint64_t matrix = file.U32(offset + 16);
            const uint64_t mCurves = file.U32(offset + 20);
            const uint64_t clut = file.U32(offset + 24);
            const uint64_t aCurves = file.U32(offset + 28);
            const uint64_t inputSide = type == "mAB " ? aCurves : bCurves;
            const uint64_t outputSide = type == "mAB " ? bCurves : aCurves;
            // Only tables of curves, CLUT and curves are held; matrix-based ones end the directory
            // ("Wrong Type of ICC4 Profile (Matrix based) !").
            if (matrix != 0 || mCurves != 0 || inputSide == 0 || outputSide == 0 || clut == 0) {
                return false;
            }
            // The first curve of each side gives the entry count; the CLUT head gives the grid.
            if (!file.Has(offset + inputSide, kCurveHead) || !file.Has(offset + outputSide, kCurveHead) ||
                !file.Has(offset + clut, 20)) {
                return false;
            }
            entry.inputEntries = file.U16(offset + inputSide + 10);
            entry.outputEntries = file.U16(offset + outputSide + 10);
            entry.gridPoints = file.U8(offset + clut + (direction == 0 ? 0 : 1));
        }
    }

    if ((type == "text" || type == "txet") && signature == "cprt" && size > 8 && file.Has(offset + 8, 0)) {
        const uint64_t length = std::min(size - 8, file.Size() - (offset + 8));
        entry.copyright = file.Bytes().substr(static_cast<size_t>(offset + 8), static_cast<size_t>(length));
    }

    if (signature == "wtpt") {
        if (!file.Has(offset + 8, 12)) return false;
        for (int axis = 0; axis < 3; ++axis)
            m_MediaWhite[direction][axis] = file.U16Fixed16(offset + 8 + 4 * axis);
    }

    if (const int c = RgbChannel(signature, "XYZ"); c >= 0) {
        if (size != 20 || (type != "XYZ " && type != " ZYX") || !file.Has(offset, 20)) return false;
        entry.inputChannels = entry.outputChannels = 3;
        for (int row = 0; row < 3; ++row) lut.matrix[row][c] = file.S15Fixed16(offset + 8 + 4 * row);
        ++colorants;
    }

    if (const int c = RgbChannel(signature, "TRC"); c >= 0) {
        if (type != "curv" || !file.Has(offset, kCurveHead)) return false;
        const uint32_t entries = file.U32(offset + 8);
        std::vector<double>& curve = trc.curve[c];
        if (entries == 0) {
            curve.resize(256);
            for (int k = 0; k < 256; ++k) curve[k] = k;
        } else if (entries == 1) {
            if (!file.Has(offset + kCurveHead, 2)) return false;
            trc.gamma[c] = file.U16(offset + kCurveHead) / 256.0;
            BuildGammaCurve(direction, c);
        } else {
            // 16-bit samples; their count is bounded by the file, at most 65535 by the format's use.
            if (entries > 65535 || !file.Has(offset + kCurveHead, 2 * uint64_t{entries})) return false;
            std::vector<uint16_t> samples(entries);
            for (uint32_t k = 0; k < entries; ++k) samples[k] = file.U16(offset + kCurveHead + 2 * k);
            if (direction == 0)
                BuildSampledCurve(samples.data(), static_cast<int>(entries), curve);
            else
                BuildInverseCurve(samples.data(), static_cast<int>(entries), curve);
        }
    }

    if (signature == "gamt") m_GamutTagIndex[direction] = static_cast<int32_t>(i + 1);
    return true;
}

void CProfil::ReadTagTable(int direction, const std::string& path) {
    if (!ValidDirection(direction)) return;
    IccBytes file;
    if (!file.Load(path) || !file.Has(0, kHeaderSize)) return;

    std::memcpy(m_Header, file.Bytes().data(), kHeaderSize);
    const uint32_t count = file.U32(128);

    std::vector<TagEntry>& tags = m_Tags[direction];
    tags.clear();
    try {
        tags.resize(count < kMaxTags ? count : kMaxTags);
    } catch (const std::bad_alloc&) {
        return;
    }

    // The illuminant is also the media white until a "wtpt" tag says otherwise.
    for (int axis = 0; axis < 3; ++axis) {
        m_Illuminant[direction][axis] = file.U16Fixed16(68 + 4 * axis);
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
            tags[i] = TagEntry{};
            return;
        }
    }
    if (colorants == 3) lut.colorantCount = 3;
}

}  // namespace vantrel
