#include <algorithm>
#include <cmath>
#include <new>

#include "icc/icc_bytes.h"
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

}  // namespace

int32_t CProfil::LoadLut(int direction, const std::string& tag, const std::string& path) {
    if (!ValidDirection(direction)) return -1;
    const int slot = direction;
    // A table that cannot be held leaves the slot empty, with the white of an empty slot.
    auto unusable = [&] {
        ResetSlot(slot);
        ComputeSlotWhite(direction, slot);
        return -1;
    };
    m_FileInputEntries[slot] = 0;
    m_LegacyStretch[slot] = LegacyStretch{};
    m_OutputIdentity[slot] = 0;
    std::fill(std::begin(m_Eval), std::end(m_Eval), 0.0);

    const std::vector<TagEntry>& tags = m_Tags[direction];
    auto find = [&tags](const std::string& signature) -> int {
        for (size_t i = 0; i < tags.size(); ++i)
            if (tags[i].signature == signature) return static_cast<int>(i);
        return -1;
    };
    int found = find(tag);
    if (found < 0 && tag == "A2B1") found = find("A2B0");

    LutSlot& lut = m_Lut[slot];
    if (found >= 0) {
        const TagEntry& entry = tags[static_cast<size_t>(found)];
        m_LoadedTag[direction] = found + 1;
        lut.tagIndex = found + 1;
        lut.type = entry.type;
        lut.inputChannels = entry.inputChannels;
        lut.outputChannels = entry.outputChannels;
        lut.inputEntries = entry.inputEntries;
        lut.outputEntries = entry.outputEntries;
        lut.gridPoints = entry.gridPoints;
        // The XYZ input matrix is the loaded table's own (a B2A0 may carry one where B2A1 has
        // none); v4 tables held here have no matrix.
        const bool v2Lut = entry.type == "mft1" || entry.type == "mft2";
        for (int k = 0; k < 9; ++k) lut.matrix[k / 3][k % 3] = v2Lut ? entry.matrix[k] : (k % 4 == 0 ? 1.0 : 0.0);
    } else if (lut.colorantCount == 3 && m_Trc[slot].curve[0].size() == 256 && m_Trc[slot].curve[1].size() == 256 &&
               m_Trc[slot].curve[2].size() == 256) {
        // A matrix/TRC transform needs its three tone curves as well as its three colorants.
        m_LoadedTag[direction] = 0;
        lut.tagIndex = 0;
        lut.type = "MATR";
        lut.inputChannels = lut.outputChannels = 3;
        lut.inputEntries = lut.outputEntries = kHeldEntries;
        lut.gridPoints = 9;
        if (direction == 1) {
            // PCS to device runs through the inverse of the colorant matrix.
            const double(&a)[3][3] = lut.matrix;
            double inverse[3][3];
            for (int r = 0; r < 3; ++r)
                for (int c = 0; c < 3; ++c) {
                    const int r1 = (c + 1) % 3, r2 = (c + 2) % 3, c1 = (r + 1) % 3, c2 = (r + 2) % 3;
                    inverse[r][c] = a[r1][c1] * a[r2][c2] - a[r1][c2] * a[r2][c1];
                }
            const double det = a[0][0] * inverse[0][0] + a[0][1] * inverse[1][0] + a[0][2] * inverse[2][0];
            if (!(std::fabs(det) > 0) || !std::isfinite(det)) {
                ResetSlot(slot);
                return -1;
            }
            for (int r = 0; r < 3; ++r)
                for (int c = 0; c < 3; ++c) lut.matrix[r][c] = inverse[r][c] / det;
        }
    } else {
        // Nothing of an earlier load may stay behind to be taken for this table.
        ResetSlot(slot);
        ComputeSlotWhite(direction, slot);
        m_Tags[0].clear();
        m_Tags[1].clear();
        return -1;
    }

    // Only tables whose counts the kernels can walk are held.
    const int n = lut.inputChannels;
    const int m = lut.outputChannels;
    const int grid = lut.gridPoints;
    const uint64_t nodes = ClutNodes(grid, n, m);
    if ((!IsLutType(lut.type) && lut.type != "MATR") || n < 1 || n > kMaxInputs || m < 1 || m > kMaxOutputs || grid < kMinGrid ||
        grid > kMaxGrid || lut.inputEntries < kMinEntries || lut.inputEntries > kMaxEntries ||
        lut.outputEntries < kMinEntries || lut.outputEntries > kMaxEntries || nodes == 0) {
        return unusable();
    }

    m_Corners[slot] = 1 << n;
    if (lut.inputEntries < kHeldEntries) {
        m_FileInputEntries[slot] = lut.inputEntries;
        lut.inputEntries = kHeldEntries;
    }
    const int entries = lut.inputEntries;
    for (int k = 0; k < kEvalSize; ++k) m_InputStride[slot][k] = k * entries;

    if (lut.type == "mft2" || lut.type == "mAB " || lut.type == "mBA ") {
        m_Precision[slot] = lut.type == "mft2" ? 1 : 3;
        m_GridScale[slot] = (grid - 1) / 65535.0;
        m_OutputScale[slot] = (lut.outputEntries - 1) / 65535.0;
    } else {
        m_Precision[slot] = 0;
        m_GridScale[slot] = (grid - 1) / 255.0;
        m_OutputScale[slot] = 1.0;
    }

    // CLUT addressing: the first input varies slowest, the outputs innermost.
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
    // Corners of a cell, by the number of raised channels and then by channel index.
    {
        int index = 0;
        std::vector<int> subset;
        auto emit = [&](auto&& self, int start, int left) -> void {
            if (left == 0) {
                int32_t offset = 0;
                for (int channel : subset) offset += m_ClutStride[slot][channel];
                m_CornerOffsets[slot][index++] = offset;
                return;
            }
            for (int channel = start; channel < n; ++channel) {
                subset.push_back(channel);
                self(self, channel + 1, left - 1);
                subset.pop_back();
            }
        };
        for (int raised = 0; raised <= n; ++raised) emit(emit, 0, raised);
        for (; index < kMaxCorners; ++index) m_CornerOffsets[slot][index] = 0;
    }

    IccBytes file;
    if (!file.Load(path) || !file.Has(0, kHeaderSize)) return unusable();
    lut.colourSpace = file.Signature(16);
    lut.pcs = CutSignature(file.Signature(20));

    const int32_t loaded = LoadTables(slot, file);
    if (loaded == -2) {
        ResetSlot(slot);
        return -2;
    }
    if (loaded != 1) return unusable();

    if (lut.pcs == "Lab" && lut.colourSpace == "RGB " && lut.type == "MATR") lut.pcs = "XYZ";
    ComputeSlotWhite(direction, slot);
    return 1;
}

int32_t CProfil::LoadTables(int slot, const IccBytes& file) {
    LutSlot& lut = m_Lut[slot];
    if (lut.type == "MATR") return 1;
    const TagEntry& entry = m_Tags[slot][static_cast<size_t>(lut.tagIndex - 1)];
    const uint64_t tag = entry.offset;
    const uint64_t n = static_cast<uint64_t>(lut.inputChannels);
    const uint64_t m = static_cast<uint64_t>(lut.outputChannels);
    const uint64_t held = static_cast<uint64_t>(lut.inputEntries);
    const uint64_t fileEntries = static_cast<uint64_t>(InputEntriesInFile(slot));
    const uint64_t outEntries = static_cast<uint64_t>(lut.outputEntries);
    const uint64_t clutValues = ClutNodes(lut.gridPoints, lut.inputChannels, lut.outputChannels) * m;

    std::vector<uint16_t>& input = m_InputCurves[slot];
    std::vector<uint16_t>& clut = m_Clut[slot];
    std::vector<uint16_t>& output = m_OutputCurves[slot];
    input.clear();
    clut.clear();
    output.clear();
    try {
        if (lut.type == "mft1") {
            // Input curves, CLUT and output curves, one byte per value, from byte 48.
            const uint64_t start = tag + 48;
            if (!file.Has(start, n * 256 + clutValues + m * 256)) return -1;
            input.resize(n * 256);
            clut.resize(clutValues);
            output.resize(m * 256);
            uint64_t at = start;
            for (auto* table : {&input, &clut, &output})
                for (uint16_t& value : *table) value = file.U8(at++);
            return 1;
        }

        if (lut.type == "mft2") {
            // The same three tables as 16-bit values from byte 52.
            const uint64_t start = tag + 52;
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

        // "mAB " / "mBA ": curve elements on both sides of a 16-bit CLUT.
        const bool ab = lut.type == "mAB ";
        const uint64_t inputSide = tag + file.U32(tag + (ab ? 28 : 12));
        const uint64_t outputSide = tag + file.U32(tag + (ab ? 12 : 28));
        const uint64_t clutAt = tag + file.U32(tag + 24);
        if (!V4ClutHeadMatches(file, clutAt, lut.inputChannels, lut.gridPoints) ||
            !file.Has(clutAt + 20, 2 * clutValues))
            return -1;

        // Reads `channels` curves of `count` entries each from `at`, handing each to `store`.
        auto readCurves = [&file](uint64_t at, uint64_t channels, uint64_t count, std::vector<uint16_t>& samples,
                                  auto&& store) -> bool {
            for (uint64_t channel = 0; channel < channels; ++channel) {
                const uint64_t curve = FindCurve(file, at);
                if (curve == 0 || file.U32(curve + 8) != count || !file.Has(curve + 12, 2 * count)) return false;
                for (uint64_t k = 0; k < count; ++k) samples[k] = file.U16(curve + 12 + 2 * k);
                store(channel);
                at = curve + 12 + 2 * count;
            }
            return true;
        };
        input.resize(n * held);
        clut.resize(clutValues);
        output.resize(m * outEntries);
        std::vector<uint16_t> samples(std::max(fileEntries, outEntries));
        const bool inputsRead = readCurves(inputSide, n, fileEntries, samples, [&](uint64_t channel) {
            HoldInputCurve(samples, fileEntries, held, input.data() + channel * held);
        });
        if (!inputsRead) return -1;
        for (uint64_t k = 0; k < clutValues; ++k) clut[k] = file.U16(clutAt + 20 + 2 * k);
        const bool outputsRead = readCurves(outputSide, m, outEntries, samples, [&](uint64_t channel) {
            std::copy(samples.begin(), samples.begin() + static_cast<std::ptrdiff_t>(outEntries),
                      output.data() + channel * outEntries);
        });
        if (!outputsRead) return -1;
        MarkIdentityOutput(slot);
        return 1;
    } catch (const std::bad_alloc&) {
        return -2;
    }
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
