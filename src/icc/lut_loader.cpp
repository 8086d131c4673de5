#include <algorithm>
#include <cmath>
#include <new>

#include "colour/matrix3.h"
#include "icc/corner_order.h"
#include "icc/icc_bytes.h"
#include "icc/icc_layout.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

// Limits of the tables this library holds. Inputs end at 7 where the corner table (2^7 corners)
// ends; 15 outputs is the most an ICC LUT can carry; grid and curve sizes are the format's own.
constexpr int kMinGrid = 2;
constexpr int kMaxGrid = 255;
constexpr int kMinEntries = 2;
constexpr int kMaxEntries = 65535;
// A CLUT larger than this cannot come from a real profile and would not fit a 32-bit host.
constexpr uint64_t kMaxClutValues = uint64_t{1} << 25;
// Curves shorter than this are held resampled to it.
constexpr int kHeldEntries = 256;
constexpr uint16_t kLegacyWhite = 0xFF00;

// Adds 0.5 and truncates, kept inside 16 bits.
uint16_t Round16(double value) {
    const double rounded = std::floor(value + 0.5);
    if (!(rounded > 0)) return 0;
    if (rounded >= 65535) return 65535;
    return static_cast<uint16_t>(rounded);
}

// Spreads a curve of `count` (2..255) samples over 256 entries; the last entry is the last sample.
void ResampleCurve(const uint16_t* samples, int count, uint16_t* out) {
    const double step = (count - 1) / 256.0;
    double f = 0;
    int j = 0;
    for (int k = 0; k + 1 < count && j < kHeldEntries; ++k) {
        const double from = samples[k];
        const double rise = static_cast<double>(samples[k + 1]) - from;
        while (f < 1 && j < kHeldEntries) {
            out[j] = Round16(from + rise * f + j);
            ++j;
            f += step;
        }
        f -= 1;
    }
    for (; j < kHeldEntries; ++j) out[j] = samples[count - 1];
    out[kHeldEntries - 1] = samples[count - 1];
}

// Tables written with L* = 100 at 0xFF00 are stretched to the full 16-bit range.
void StretchLegacy(uint16_t* values, size_t count, size_t step) {
    for (size_t k = 0; k < count; k += step) values[k] = Round16(values[k] * 257.0 / 256.0);
}

// An input curve of `fileEntries` samples as held: resampled to 256 entries when shorter, else as read.
void HoldInputCurve(const std::vector<uint16_t>& samples, uint64_t fileEntries, uint64_t held, uint16_t* curve) {
    if (fileEntries < held)
        ResampleCurve(samples.data(), static_cast<int>(fileEntries), curve);
    else
        std::copy(samples.begin(), samples.begin() + static_cast<std::ptrdiff_t>(held), curve);
}

// grid^inputs, or 0 when the CLUT would exceed kMaxClutValues with `outputs` values per node.
uint64_t ClutNodes(int grid, int inputs, int outputs) {
    uint64_t nodes = 1;
    for (int i = 0; i < inputs; ++i) {
        nodes *= static_cast<uint64_t>(grid);
        if (nodes * static_cast<uint64_t>(outputs) > kMaxClutValues) return 0;
    }
    return nodes;
}

// The position of the "curv" element at `at`, allowing for the up to three bytes of padding that
// align elements; 0 when there is none.
uint64_t FindCurve(const IccBytes& file, uint64_t at) {
    for (uint64_t p = at; p < at + 4; ++p)
        if (file.Signature(p) == "curv") return p;
    return 0;
}

std::string CutSignature(std::string value) {
    if (value.size() == 4 && value[3] != 'K') value.resize(3);
    return value;
}

// The counts a table reader works with, in 64 bits.
struct TableCounts {
    uint64_t inputs, outputs;
    uint64_t heldEntries;  // per input curve as held (256 or more)
    uint64_t fileEntries;  // per input curve in the file
    uint64_t outputEntries;
    uint64_t clutValues;   // grid^inputs x outputs
};

TableCounts Counts(const LutSlot& lut, int fileInputEntries) {
    const uint64_t m = static_cast<uint64_t>(lut.outputChannels);
    return {static_cast<uint64_t>(lut.inputChannels), m, static_cast<uint64_t>(lut.inputEntries),
            static_cast<uint64_t>(fileInputEntries), static_cast<uint64_t>(lut.outputEntries),
            ClutNodes(lut.gridPoints, lut.inputChannels, lut.outputChannels) * m};
}

// True when the kernels can walk a table of these counts.
bool CountsUsable(const LutSlot& lut) {
    return (IsLutType(lut.type) || lut.type == "MATR") && lut.inputChannels >= 1 &&
           lut.inputChannels <= CProfil::kMaxInputs && lut.outputChannels >= 1 &&
           lut.outputChannels <= CProfil::kMaxOutputs && lut.gridPoints >= kMinGrid && lut.gridPoints <= kMaxGrid &&
           lut.inputEntries >= kMinEntries && lut.inputEntries <= kMaxEntries && lut.outputEntries >= kMinEntries &&
           lut.outputEntries <= kMaxEntries && ClutNodes(lut.gridPoints, lut.inputChannels, lut.outputChannels) != 0;
}

// Reads `channels` "curv" elements of `count` entries each, one after the other from `at`,
// handing each channel's samples to `store`. False when one is missing or cut short.
template <typename Store>
bool ReadCurveElements(const IccBytes& file, uint64_t at, uint64_t channels, uint64_t count,
                       std::vector<uint16_t>& samples, Store&& store) {
    for (uint64_t channel = 0; channel < channels; ++channel) {
        const uint64_t curve = FindCurve(file, at);
        if (curve == 0 || file.U32(curve + icc::Curve::kCount) != count ||
            !file.Has(curve + icc::Curve::kEntries, 2 * count))
            return false;
        for (uint64_t k = 0; k < count; ++k) samples[k] = file.U16(curve + icc::Curve::kEntries + 2 * k);
        store(channel);
        at = curve + icc::Curve::kEntries + 2 * count;
    }
    return true;
}

}  // namespace

int CProfil::FindTableTag(int direction, const std::string& tag) const {
    const std::vector<TagEntry>& tags = m_Tags[direction];
    auto find = [&tags](const std::string& signature) -> int {
        for (size_t i = 0; i < tags.size(); ++i)
            if (tags[i].signature == signature) return static_cast<int>(i);
        return -1;
    };
    const int found = find(tag);
    // A profile without a colorimetric table serves it from its perceptual one.
    return found < 0 && tag == "A2B1" ? find("A2B0") : found;
}

void CProfil::DescribeFromTag(int direction, int index) {
    const TagEntry& entry = m_Tags[direction][static_cast<size_t>(index)];
    LutSlot& lut = m_Lut[direction];
    m_LoadedTag[direction] = index + 1;
    lut.tagIndex = index + 1;
    lut.type = entry.type;
    lut.inputChannels = entry.inputChannels;
    lut.outputChannels = entry.outputChannels;
    lut.inputEntries = entry.inputEntries;
    lut.outputEntries = entry.outputEntries;
    lut.gridPoints = entry.gridPoints;
    // The XYZ input matrix is the loaded table's own (a B2A0 may carry one where B2A1 has none);
    // v4 tables held here have no matrix.
    const bool v2Lut = entry.type == "mft1" || entry.type == "mft2";
    for (int k = 0; k < 9; ++k) lut.matrix[k / 3][k % 3] = v2Lut ? entry.matrix[k] : (k % 4 == 0 ? 1.0 : 0.0);
}

bool CProfil::HasMatrixTrc(int direction) const {
    const MatrixTrc& trc = m_Trc[direction];
    return m_Lut[direction].colorantCount == 3 && trc.curve[0].size() == 256 && trc.curve[1].size() == 256 &&
           trc.curve[2].size() == 256;
}

bool CProfil::DescribeMatrixTrc(int direction) {
    LutSlot& lut = m_Lut[direction];
    m_LoadedTag[direction] = 0;
    lut.tagIndex = 0;
    lut.type = "MATR";
    lut.inputChannels = lut.outputChannels = 3;
    lut.inputEntries = lut.outputEntries = kHeldEntries;
    lut.gridPoints = 9;
    if (direction == 0) return true;
    // PCS to device runs through the inverse of the colorant matrix.
    double inverse[3][3];
    if (!InvertMatrix3(lut.matrix, inverse)) return false;
    std::copy(&inverse[0][0], &inverse[0][0] + 9, &lut.matrix[0][0]);
    return true;
}

void CProfil::ComputeAddressing(int slot) {
    LutSlot& lut = m_Lut[slot];
    const int n = lut.inputChannels;
    const int m = lut.outputChannels;
    const int grid = lut.gridPoints;
    m_Corners[slot] = 1 << n;
    if (lut.inputEntries < kHeldEntries) {
        m_FileInputEntries[slot] = lut.inputEntries;
        lut.inputEntries = kHeldEntries;
    }
    const int entries = lut.inputEntries;
    for (int k = 0; k < kEvalSize; ++k) m_InputStride[slot][k] = k * entries;

    m_Precision[slot] = lut.type == "mft2" ? 1 : (lut.type == "mAB " || lut.type == "mBA ") ? 3 : 0;
    if (SixteenBit(slot)) {
        m_GridScale[slot] = (grid - 1) / 65535.0;
        m_OutputScale[slot] = (lut.outputEntries - 1) / 65535.0;
    } else {
        m_GridScale[slot] = (grid - 1) / 255.0;
        m_OutputScale[slot] = 1.0;
    }

    // The first input varies slowest, the outputs innermost.
    for (int i = 0; i < kMaxInputs; ++i) {
        int32_t multiplier = 0;
        if (i < n) {
            multiplier = 1;
            for (int k = i + 1; k < n; ++k) multiplier *= grid;
        }
        m_ClutMultiplier[slot][i] = multiplier;
        m_ClutStride[slot][i] = multiplier * m;
    }
    m_InputLast[slot] = entries - 1;
    m_GridLast[slot] = grid - 1;
    for (int k = 0; k < kEvalSize; ++k) m_OutputStride[slot][k] = k < 10 ? k * lut.outputEntries : 0;
    m_GridPowers[slot][0] = grid * grid;
    m_GridPowers[slot][1] = grid;
    m_GridPowers[slot][2] = 1;
    // The corners of a cell in the kernels' walking order: by the number of raised channels, then
    // by channel index.
    for (int k = 0; k < kMaxCorners; ++k) {
        int32_t offset = 0;
        if (k < m_Corners[slot]) {
            const uint8_t raised = CornerOrder::Mask(n, k);
            for (int channel = 0; channel < n; ++channel)
                if (raised & (1u << channel)) offset += m_ClutStride[slot][channel];
        }
        m_CornerOffsets[slot][k] = offset;
    }
}

int32_t CProfil::LoadLut(int direction, const std::string& tag, const std::string& path) {
    if (!ValidDirection(direction)) return -1;
    const int slot = direction;
    // A failed load leaves the slot empty, with the white of an empty slot, and says why.
    auto refuse = [&](int32_t result, std::string why) {
        ResetSlot(slot);
        ComputeSlotWhite(direction, slot);
        m_LoadFailure = std::move(why);
        return result;
    };
    m_FileInputEntries[slot] = 0;
    m_LegacyStretch[slot] = LegacyStretch{};
    m_OutputIdentity[slot] = 0;
    std::fill(std::begin(m_Eval), std::end(m_Eval), 0.0);

    const int found = FindTableTag(direction, tag);
    if (found >= 0) {
        DescribeFromTag(direction, found);
    } else if (HasMatrixTrc(direction)) {
        if (!DescribeMatrixTrc(direction)) return refuse(-1, "its colorant matrix cannot be inverted");
    } else {
        const std::string directory = m_LoadFailure.empty() ? std::string() : " (" + m_LoadFailure + ")";
        const int32_t result = refuse(-1, "has no \"" + tag + "\" table" + directory);
        m_Tags[0].clear();
        m_Tags[1].clear();
        return result;
    }

    if (!CountsUsable(m_Lut[slot]))
        return refuse(-1, "its \"" + tag + "\" table has channel, grid or curve counts this library cannot hold");
    ComputeAddressing(slot);

    IccBytes file;
    if (!file.Load(path) || !file.Has(0, kHeaderSize)) return refuse(-1, "cannot be read");
    LutSlot& lut = m_Lut[slot];
    lut.colourSpace = file.Signature(icc::Header::kColourSpace);
    lut.pcs = CutSignature(file.Signature(icc::Header::kPcs));

    const int32_t loaded = LoadTables(slot, file);
    if (loaded == -2) return refuse(-2, "is too large for the memory left");
    if (loaded != 1) return refuse(-1, "its \"" + tag + "\" table is cut short or malformed");

    if (lut.pcs == "Lab" && lut.colourSpace == "RGB " && lut.type == "MATR") lut.pcs = "XYZ";
    ComputeSlotWhite(direction, slot);
    m_LoadFailure.clear();
    return 1;
}

int32_t CProfil::LoadTables(int slot, const IccBytes& file) {
    const LutSlot& lut = m_Lut[slot];
    if (lut.type == "MATR") return 1;  // evaluated through the matrix and the tone curves
    m_InputCurves[slot].clear();
    m_Clut[slot].clear();
    m_OutputCurves[slot].clear();
    try {
        const TagEntry& entry = m_Tags[slot][static_cast<size_t>(lut.tagIndex - 1)];
        if (lut.type == "mft1") return ReadMft1(slot, file, entry.offset);
        if (lut.type == "mft2") return ReadMft2(slot, file, entry.offset);
        return ReadLutAB(slot, file, entry.offset);
    } catch (const std::bad_alloc&) {
        return -2;
    }
}

int32_t CProfil::ReadMft1(int slot, const IccBytes& file, uint64_t tag) {
    const LutSlot& lut = m_Lut[slot];
    const TableCounts k = Counts(lut, InputEntriesInFile(slot));
    const uint64_t n = k.inputs, m = k.outputs, clutValues = k.clutValues;
    const uint64_t curve = icc::Mft1::kCurveEntries;
    // Input curves, CLUT and output curves, one byte per value.
    const uint64_t start = tag + icc::Mft1::kTables;
    if (!file.Has(start, n * curve + clutValues + m * curve)) return -1;
    m_InputCurves[slot].resize(n * curve);
    m_Clut[slot].resize(clutValues);
    m_OutputCurves[slot].resize(m * curve);
    uint64_t at = start;
    for (auto* table : {&m_InputCurves[slot], &m_Clut[slot], &m_OutputCurves[slot]})
        for (uint16_t& value : *table) value = file.U8(at++);
    return 1;
}

int32_t CProfil::ReadMft2(int slot, const IccBytes& file, uint64_t tag) {
    const LutSlot& lut = m_Lut[slot];
    const TableCounts k = Counts(lut, InputEntriesInFile(slot));
    const uint64_t n = k.inputs, m = k.outputs, held = k.heldEntries, fileEntries = k.fileEntries;
    const uint64_t outEntries = k.outputEntries, clutValues = k.clutValues;
    std::vector<uint16_t>& input = m_InputCurves[slot];
    std::vector<uint16_t>& clut = m_Clut[slot];
    std::vector<uint16_t>& output = m_OutputCurves[slot];

    // The three tables as 16-bit values.
    const uint64_t start = tag + icc::Mft2::kTables;
    if (!file.Has(start, 2 * (n * fileEntries + clutValues + m * outEntries))) return -1;
    input.resize(n * held);
    clut.resize(clutValues);
    output.resize(m * outEntries);
    uint64_t at = start;
    auto next = [&file, &at] {
        const uint16_t value = file.U16(at);
        at += 2;
        return value;
    };
    std::vector<uint16_t> samples(fileEntries);
    for (uint64_t channel = 0; channel < n; ++channel) {
        for (uint16_t& value : samples) value = next();
        uint16_t* curve = input.data() + channel * held;
        HoldInputCurve(samples, fileEntries, held, curve);
        if (fileEntries >= held && curve[held - 1] == kLegacyWhite) StretchLegacy(curve, held, 1);
    }
    for (uint16_t& value : clut) value = next();
    for (uint16_t& value : output) value = next();
    for (uint64_t channel = 0; channel < m; ++channel) {
        uint16_t* curve = output.data() + channel * outEntries;
        if (curve[outEntries - 1] == kLegacyWhite) StretchLegacy(curve, outEntries, 1);
    }
    if (m >= 3 && clut[0] == kLegacyWhite && clut[1] == 0x8000 && clut[2] == 0x8000) {
        LegacyStretch& stretch = m_LegacyStretch[slot];
        stretch.clut = true;
        for (uint64_t k = 0; k < clut.size(); k += m)
            if (clut[k] > kLegacyWhite) stretch.clipped.emplace_back(static_cast<uint32_t>(k), clut[k]);
        StretchLegacy(clut.data(), clut.size(), m);
    }
    MarkIdentityOutput(slot);
    return 1;
}

int32_t CProfil::ReadLutAB(int slot, const IccBytes& file, uint64_t tag) {
    const LutSlot& lut = m_Lut[slot];
    const TableCounts k = Counts(lut, InputEntriesInFile(slot));
    const uint64_t n = k.inputs, m = k.outputs, held = k.heldEntries, fileEntries = k.fileEntries;
    const uint64_t outEntries = k.outputEntries, clutValues = k.clutValues;

    // Curve elements on both sides of a 16-bit CLUT.
    const bool aToB = lut.type == "mAB ";
    const uint64_t inputSide = tag + file.U32(tag + icc::LutAB::InputCurves(aToB));
    const uint64_t outputSide = tag + file.U32(tag + icc::LutAB::OutputCurves(aToB));
    const uint64_t clutHead = tag + file.U32(tag + icc::LutAB::kClut);
    const uint64_t clutAt = clutHead + icc::ClutHead::kValues;
    if (!V4ClutHeadMatches(file, clutHead, lut.inputChannels, lut.gridPoints) || !file.Has(clutAt, 2 * clutValues))
        return -1;

    std::vector<uint16_t>& input = m_InputCurves[slot];
    std::vector<uint16_t>& output = m_OutputCurves[slot];
    input.resize(n * held);
    m_Clut[slot].resize(clutValues);
    output.resize(m * outEntries);
    std::vector<uint16_t> samples(std::max(fileEntries, outEntries));
    const bool inputsRead = ReadCurveElements(file, inputSide, n, fileEntries, samples, [&](uint64_t channel) {
        HoldInputCurve(samples, fileEntries, held, input.data() + channel * held);
    });
    if (!inputsRead) return -1;
    for (uint64_t k = 0; k < clutValues; ++k) m_Clut[slot][k] = file.U16(clutAt + 2 * k);
    const bool outputsRead = ReadCurveElements(file, outputSide, m, outEntries, samples, [&](uint64_t channel) {
        std::copy(samples.begin(), samples.begin() + static_cast<std::ptrdiff_t>(outEntries),
                  output.data() + channel * outEntries);
    });
    if (!outputsRead) return -1;
    MarkIdentityOutput(slot);
    return 1;
}

void CProfil::MarkIdentityOutput(int slot) {
    const LutSlot& lut = m_Lut[slot];
    const int entries = lut.outputEntries;
    const std::vector<uint16_t>& output = m_OutputCurves[slot];
    for (int channel = 0; channel < lut.outputChannels; ++channel)
        for (int j = 0; j < entries; ++j)
            if (output[static_cast<size_t>(channel * entries + j)] != Round16(j * 65535.0 / (entries - 1))) {
                m_OutputIdentity[slot] = 0;
                return;
            }
    m_OutputIdentity[slot] = 1;
}

}  // namespace vantrel
