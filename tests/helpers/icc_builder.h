#pragma once
// Small ICC profiles for tests, built as byte vectors.
//
//   using namespace vantrel::test;
//   LutSpec lut = MakeLut(4, 3, 5, [](const std::vector<int>& node, int out) { ... });  // CMYK -> Lab
//   IccBuilder profile("CMYK", "Lab ");
//   profile.AddTag("A2B1", Mft2Tag(lut)).AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249));
//   std::string path = WriteFile(dir.File("p.icc"), profile.Build());
//
// Tags are laid out in the order added, each 4-byte aligned, after the header and tag table.
// For malformed variants edit the built bytes: PutU32/PutU16 at TagOffset(bytes, i) and friends,
// or truncate the vector.

#include <cmath>
#include <cstdint>
#include <fstream>
#include <functional>
#include <string>
#include <utility>
#include <vector>

namespace vantrel::test {

using Bytes = std::vector<uint8_t>;

// ---- big-endian helpers ------------------------------------------------------------------------
inline void AppendU8(Bytes& b, unsigned v) { b.push_back(static_cast<uint8_t>(v)); }
inline void AppendU16(Bytes& b, unsigned v) {
    b.push_back(static_cast<uint8_t>(v >> 8));
    b.push_back(static_cast<uint8_t>(v));
}
inline void AppendU32(Bytes& b, uint32_t v) {
    AppendU16(b, v >> 16);
    AppendU16(b, v & 0xFFFF);
}
inline void AppendSig(Bytes& b, const char* sig) {
    for (int k = 0; k < 4; ++k) b.push_back(static_cast<uint8_t>(sig[k]));
}
// s15Fixed16Number, rounded to the nearest.
inline uint32_t Fixed16(double v) { return static_cast<uint32_t>(static_cast<int32_t>(std::lround(v * 65536.0))); }
inline void AppendFixed(Bytes& b, double v) { AppendU32(b, Fixed16(v)); }
inline void PutU16(Bytes& b, size_t at, unsigned v) {
    b[at] = static_cast<uint8_t>(v >> 8);
    b[at + 1] = static_cast<uint8_t>(v);
}
inline void PutU32(Bytes& b, size_t at, uint32_t v) {
    PutU16(b, at, v >> 16);
    PutU16(b, at + 2, v & 0xFFFF);
}
inline uint32_t GetU32(const Bytes& b, size_t at) {
    return uint32_t{b[at]} << 24 | uint32_t{b[at + 1]} << 16 | uint32_t{b[at + 2]} << 8 | b[at + 3];
}
inline unsigned GetU16(const Bytes& b, size_t at) { return unsigned{b[at]} << 8 | b[at + 1]; }
// Position of the i-th (0-based) tag-table record, and that tag's data offset and size.
inline size_t TagRecord(size_t i) { return 132 + 12 * i; }
inline uint32_t TagOffset(const Bytes& b, size_t i) { return GetU32(b, TagRecord(i) + 4); }
inline uint32_t TagSize(const Bytes& b, size_t i) { return GetU32(b, TagRecord(i) + 8); }

// ---- LUT contents ------------------------------------------------------------------------------
// A LUT's tables as 16-bit values (an mft1 keeps only the low byte; give it 0..255 values).
struct LutSpec {
    int inputs = 0;
    int outputs = 0;
    int grid = 0;
    std::vector<std::vector<uint16_t>> inputCurves;   // one per input channel
    std::vector<uint16_t> clut;                       // grid^inputs x outputs, first input slowest
    std::vector<std::vector<uint16_t>> outputCurves;  // one per output channel
    double matrix[9] = {1, 0, 0, 0, 1, 0, 0, 0, 1};
};

// A straight curve of `entries` values from 0 to `top`.
inline std::vector<uint16_t> LinearCurve(int entries, unsigned top = 65535) {
    std::vector<uint16_t> curve(static_cast<size_t>(entries));
    for (int k = 0; k < entries; ++k)
        curve[static_cast<size_t>(k)] =
            static_cast<uint16_t>(std::lround(static_cast<double>(k) * top / (entries - 1)));
    return curve;
}

// A LUT with straight input and output curves and the CLUT from `value(node indices, output)`.
inline LutSpec MakeLut(int inputs, int outputs, int grid,
                       const std::function<uint16_t(const std::vector<int>&, int)>& value, int inEntries = 2,
                       int outEntries = 2, unsigned curveTop = 65535) {
    LutSpec lut;
    lut.inputs = inputs;
    lut.outputs = outputs;
    lut.grid = grid;
    lut.inputCurves.assign(static_cast<size_t>(inputs), LinearCurve(inEntries, curveTop));
    lut.outputCurves.assign(static_cast<size_t>(outputs), LinearCurve(outEntries, curveTop));
    size_t nodes = 1;
    for (int i = 0; i < inputs; ++i) nodes *= static_cast<size_t>(grid);
    std::vector<int> index(static_cast<size_t>(inputs), 0);
    for (size_t node = 0; node < nodes; ++node) {
        size_t rest = node;
        for (int i = inputs - 1; i >= 0; --i) {
            index[static_cast<size_t>(i)] = static_cast<int>(rest % static_cast<size_t>(grid));
            rest /= static_cast<size_t>(grid);
        }
        for (int out = 0; out < outputs; ++out) lut.clut.push_back(value(index, out));
    }
    return lut;
}

// ---- tag data ----------------------------------------------------------------------------------
inline void Pad4(Bytes& b) {
    while (b.size() % 4) b.push_back(0);
}

// "mft2": 16-bit tables; the curves' lengths give the entry counts.
inline Bytes Mft2Tag(const LutSpec& lut) {
    Bytes b;
    AppendSig(b, "mft2");
    AppendU32(b, 0);
    AppendU8(b, static_cast<unsigned>(lut.inputs));
    AppendU8(b, static_cast<unsigned>(lut.outputs));
    AppendU8(b, static_cast<unsigned>(lut.grid));
    AppendU8(b, 0);
    for (double v : lut.matrix) AppendFixed(b, v);
    AppendU16(b, static_cast<unsigned>(lut.inputCurves.at(0).size()));
    AppendU16(b, static_cast<unsigned>(lut.outputCurves.at(0).size()));
    for (const auto& curve : lut.inputCurves)
        for (uint16_t v : curve) AppendU16(b, v);
    for (uint16_t v : lut.clut) AppendU16(b, v);
    for (const auto& curve : lut.outputCurves)
        for (uint16_t v : curve) AppendU16(b, v);
    return b;
}

// "mft1": one byte per value; curves must have 256 entries.
inline Bytes Mft1Tag(const LutSpec& lut) {
    Bytes b;
    AppendSig(b, "mft1");
    AppendU32(b, 0);
    AppendU8(b, static_cast<unsigned>(lut.inputs));
    AppendU8(b, static_cast<unsigned>(lut.outputs));
    AppendU8(b, static_cast<unsigned>(lut.grid));
    AppendU8(b, 0);
    for (double v : lut.matrix) AppendFixed(b, v);
    for (const auto& curve : lut.inputCurves)
        for (uint16_t v : curve) AppendU8(b, v & 0xFF);
    for (uint16_t v : lut.clut) AppendU8(b, v & 0xFF);
    for (const auto& curve : lut.outputCurves)
        for (uint16_t v : curve) AppendU8(b, v & 0xFF);
    return b;
}

// A "curv" element/tag: no entries = identity, one entry = gamma as u8Fixed8 (raw value).
inline Bytes CurvTag(const std::vector<uint16_t>& entries) {
    Bytes b;
    AppendSig(b, "curv");
    AppendU32(b, 0);
    AppendU32(b, static_cast<uint32_t>(entries.size()));
    for (uint16_t v : entries) AppendU16(b, v);
    return b;
}
inline Bytes GammaCurvTag(double gamma) { return CurvTag({static_cast<uint16_t>(std::lround(gamma * 256.0))}); }

// A "para" function type 0 (plain gamma), the v4 form this library does not read.
inline Bytes ParaTag(double gamma) {
    Bytes b;
    AppendSig(b, "para");
    AppendU32(b, 0);
    AppendU16(b, 0);
    AppendU16(b, 0);
    AppendFixed(b, gamma);
    return b;
}

// "mAB " (or "mBA " when `mba`): A curves, CLUT (16-bit), B curves; no matrix and no M curves.
// The input side takes lut.inputCurves, the output side lut.outputCurves.
inline Bytes MabTag(const LutSpec& lut, bool mba = false) {
    Bytes b;
    AppendSig(b, mba ? "mBA " : "mAB ");
    AppendU32(b, 0);
    AppendU8(b, static_cast<unsigned>(lut.inputs));
    AppendU8(b, static_cast<unsigned>(lut.outputs));
    AppendU16(b, 0);
    const size_t offsets = b.size();
    for (int k = 0; k < 5; ++k) AppendU32(b, 0);  // B, matrix, M, CLUT, A
    auto curves = [&b](const std::vector<std::vector<uint16_t>>& set) {
        const size_t at = b.size();
        for (const auto& curve : set) {
            Bytes element = CurvTag(curve);
            b.insert(b.end(), element.begin(), element.end());
            Pad4(b);
        }
        return static_cast<uint32_t>(at);
    };
    const auto& inputSide = lut.inputCurves;
    const auto& outputSide = lut.outputCurves;
    const uint32_t first = curves(mba ? outputSide : inputSide);  // the A curves come first
    const uint32_t clutAt = static_cast<uint32_t>(b.size());
    for (int k = 0; k < 16; ++k) AppendU8(b, k < lut.inputs ? static_cast<unsigned>(lut.grid) : 0);
    AppendU8(b, 2);
    AppendU8(b, 0);
    AppendU16(b, 0);
    for (uint16_t v : lut.clut) AppendU16(b, v);
    Pad4(b);
    const uint32_t second = curves(mba ? inputSide : outputSide);  // then the B curves
    PutU32(b, offsets + 0, second);                                // B curves
    PutU32(b, offsets + 12, clutAt);
    PutU32(b, offsets + 16, first);  // A curves
    return b;
}

inline Bytes XyzTag(double x, double y, double z) {
    Bytes b;
    AppendSig(b, "XYZ ");
    AppendU32(b, 0);
    AppendFixed(b, x);
    AppendFixed(b, y);
    AppendFixed(b, z);
    return b;
}

inline Bytes TextTag(const std::string& text) {
    Bytes b;
    AppendSig(b, "text");
    AppendU32(b, 0);
    b.insert(b.end(), text.begin(), text.end());
    b.push_back(0);
    return b;
}

// ---- the profile -------------------------------------------------------------------------------
class IccBuilder {
public:
    // Data colour space and PCS as four characters ("CMYK", "RGB ", "Lab ", "XYZ ").
    explicit IccBuilder(const char* colourSpace = "CMYK", const char* pcs = "Lab ", const char* deviceClass = "prtr",
                        uint32_t version = 0x02100000)
        : colourSpace_(colourSpace), pcs_(pcs), deviceClass_(deviceClass), version_(version) {}

    // The header illuminant (default D50 as 0.9642, 1.0, 0.8249).
    IccBuilder& Illuminant(double x, double y, double z) {
        illuminant_[0] = x;
        illuminant_[1] = y;
        illuminant_[2] = z;
        return *this;
    }
    IccBuilder& AddTag(const std::string& signature, Bytes data) {
        tags_.emplace_back(signature, std::move(data));
        return *this;
    }
    // A tag that shares the data of an earlier one (as real profiles share TRCs).
    IccBuilder& ShareTag(const std::string& signature, const std::string& sameAs) {
        shared_.emplace_back(signature, sameAs);
        return *this;
    }

    Bytes Build() const {
        const size_t count = tags_.size() + shared_.size();
        Bytes b(128, 0);
        AppendU32(b, static_cast<uint32_t>(count));
        std::vector<std::pair<uint32_t, uint32_t>> placed;  // offset, size
        size_t at = 132 + 12 * count;
        for (const auto& tag : tags_) {
            placed.emplace_back(static_cast<uint32_t>(at), static_cast<uint32_t>(tag.second.size()));
            at += (tag.second.size() + 3) / 4 * 4;
        }
        auto record = [&b](const std::string& sig, uint32_t offset, uint32_t size) {
            AppendSig(b, sig.c_str());
            AppendU32(b, offset);
            AppendU32(b, size);
        };
        for (size_t i = 0; i < tags_.size(); ++i) record(tags_[i].first, placed[i].first, placed[i].second);
        for (const auto& share : shared_)
            for (size_t i = 0; i < tags_.size(); ++i)
                if (tags_[i].first == share.second) {
                    record(share.first, placed[i].first, placed[i].second);
                    break;
                }
        for (const auto& tag : tags_) {
            b.insert(b.end(), tag.second.begin(), tag.second.end());
            Pad4(b);
        }
        PutU32(b, 0, static_cast<uint32_t>(b.size()));
        for (int k = 0; k < 4; ++k) {
            b[4 + k] = "test"[k];
            b[12 + k] = static_cast<uint8_t>(deviceClass_[k]);
            b[16 + k] = static_cast<uint8_t>(colourSpace_[k]);
            b[20 + k] = static_cast<uint8_t>(pcs_[k]);
            b[36 + k] = "acsp"[k];
        }
        PutU32(b, 8, version_);
        for (int k = 0; k < 3; ++k) PutU32(b, 68 + 4 * static_cast<size_t>(k), Fixed16(illuminant_[k]));
        return b;
    }

private:
    const char* colourSpace_;
    const char* pcs_;
    const char* deviceClass_;
    uint32_t version_;
    double illuminant_[3] = {0.9642, 1.0, 0.8249};
    std::vector<std::pair<std::string, Bytes>> tags_;
    std::vector<std::pair<std::string, std::string>> shared_;
};

// Writes the bytes to `path` and returns the path.
inline std::string WriteFile(const std::string& path, const Bytes& bytes) {
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    return path;
}

inline Bytes ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return Bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
}

}  // namespace vantrel::test
