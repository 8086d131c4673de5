#pragma once
// Small v2 ICC profiles for tests, built as byte vectors.
//
//   using namespace vantrel::test;
//   LutSpec lut = MakeLut(4, 3, 5, [](const std::vector<int>& node, int out) { ... });  // CMYK -> Lab
//   IccBuilder profile("CMYK", "Lab ");
//   profile.AddTag("A2B1", Mft2Tag(lut)).AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249));
//   std::string path = WriteFile(dir.File("p.icc"), profile.Build());
//
// Tags are laid out in the order added, each 4-byte aligned, after the header and tag table.
// For malformed variants edit the built bytes (Put at TagOffset(bytes, i)) or truncate them.

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <fstream>
#include <functional>
#include <string>
#include <utility>
#include <vector>

namespace vantrel::test {

using Bytes = std::vector<uint8_t>;

// ---- big-endian numbers --------------------------------------------------------------------------
// `width` bytes of `v`, appended or put at `at`.
inline void Append(Bytes& b, uint32_t v, int width) {
    for (int k = width - 1; k >= 0; --k) b.push_back(static_cast<uint8_t>(v >> 8 * k));
}
inline void Put(Bytes& b, size_t at, uint32_t v, int width) {
    for (int k = 0; k < width; ++k) b[at + static_cast<size_t>(k)] = static_cast<uint8_t>(v >> 8 * (width - 1 - k));
}
inline void AppendSig(Bytes& b, const char* sig) { b.insert(b.end(), sig, sig + 4); }
// s15Fixed16Number, rounded to the nearest.
inline uint32_t Fixed16(double v) { return static_cast<uint32_t>(static_cast<int32_t>(std::lround(v * 65536.0))); }
inline uint32_t GetU32(const Bytes& b, size_t at) {
    return uint32_t{b[at]} << 24 | uint32_t{b[at + 1]} << 16 | uint32_t{b[at + 2]} << 8 | b[at + 3];
}
// Position of the i-th (0-based) tag-table record, and that tag's data offset.
inline size_t TagRecord(size_t i) { return 132 + 12 * i; }
inline uint32_t TagOffset(const Bytes& b, size_t i) { return GetU32(b, TagRecord(i) + 4); }

// ---- LUT contents ------------------------------------------------------------------------------
// A LUT's tables as 16-bit values (an mft1 keeps only the low byte; give it 0..255 values).
struct LutSpec {
    int inputs = 0;
    int outputs = 0;
    int grid = 0;
    std::vector<std::vector<uint16_t>> inputCurves;   // one per input channel
    std::vector<uint16_t> clut;                       // grid^inputs x outputs, first input slowest
    std::vector<std::vector<uint16_t>> outputCurves;  // one per output channel
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
    LutSpec lut{inputs, outputs, grid, {}, {}, {}};
    lut.inputCurves.assign(static_cast<size_t>(inputs), LinearCurve(inEntries, curveTop));
    lut.outputCurves.assign(static_cast<size_t>(outputs), LinearCurve(outEntries, curveTop));
    std::vector<int> index(static_cast<size_t>(inputs), 0);
    for (bool more = true; more;) {
        for (int out = 0; out < outputs; ++out) lut.clut.push_back(value(index, out));
        more = false;  // the last input counts fastest
        for (int i = inputs - 1; i >= 0 && !more; --i) {
            more = ++index[static_cast<size_t>(i)] < grid;
            if (!more) index[static_cast<size_t>(i)] = 0;
        }
    }
    return lut;
}

// ---- tag data ----------------------------------------------------------------------------------
// "mft2" (16-bit values; the curves' lengths give the entry counts) or "mft1" (one byte per value,
// 256-entry curves); identity matrix.
inline Bytes LutTag(const LutSpec& lut, bool sixteenBit) {
    Bytes b;
    AppendSig(b, sixteenBit ? "mft2" : "mft1");
    Append(b, 0, 4);
    for (int count : {lut.inputs, lut.outputs, lut.grid, 0}) Append(b, static_cast<uint32_t>(count), 1);
    for (int k = 0; k < 9; ++k) Append(b, k % 4 == 0 ? 0x10000 : 0, 4);
    if (sixteenBit) {
        Append(b, static_cast<uint32_t>(lut.inputCurves.at(0).size()), 2);
        Append(b, static_cast<uint32_t>(lut.outputCurves.at(0).size()), 2);
    }
    auto values = [&b, sixteenBit](const std::vector<uint16_t>& table) {
        for (uint16_t v : table) Append(b, sixteenBit ? v : v & 0xFF, sixteenBit ? 2 : 1);
    };
    for (const auto& curve : lut.inputCurves) values(curve);
    values(lut.clut);
    for (const auto& curve : lut.outputCurves) values(curve);
    return b;
}
inline Bytes Mft2Tag(const LutSpec& lut) { return LutTag(lut, true); }
inline Bytes Mft1Tag(const LutSpec& lut) { return LutTag(lut, false); }

inline Bytes XyzTag(double x, double y, double z) {
    Bytes b;
    AppendSig(b, "XYZ ");
    for (uint32_t v : {0u, Fixed16(x), Fixed16(y), Fixed16(z)}) Append(b, v, 4);
    return b;
}

// ---- the profile -------------------------------------------------------------------------------
class IccBuilder {
public:
    // Data colour space and PCS as four characters ("CMYK", "RGB ", "Lab ", "XYZ ").
    explicit IccBuilder(const char* colourSpace = "CMYK", const char* pcs = "Lab ", const char* deviceClass = "prtr")
        : colourSpace_(colourSpace), pcs_(pcs), deviceClass_(deviceClass) {}

    // The header illuminant (default D50 as 0.9642, 1.0, 0.8249).
    IccBuilder& Illuminant(double x, double y, double z) {
        illuminant_ = {x, y, z};
        return *this;
    }
    IccBuilder& AddTag(const std::string& signature, Bytes data) {
        tags_.emplace_back(signature, std::move(data));
        return *this;
    }

    Bytes Build() const {
        Bytes b(128, 0);
        Append(b, static_cast<uint32_t>(tags_.size()), 4);
        size_t at = 132 + 12 * tags_.size();
        for (const auto& tag : tags_) {
            AppendSig(b, tag.first.c_str());
            Append(b, static_cast<uint32_t>(at), 4);
            Append(b, static_cast<uint32_t>(tag.second.size()), 4);
            at += (tag.second.size() + 3) / 4 * 4;
        }
        for (const auto& tag : tags_) {
            b.insert(b.end(), tag.second.begin(), tag.second.end());
            b.resize((b.size() + 3) / 4 * 4, 0);
        }
        Put(b, 0, static_cast<uint32_t>(b.size()), 4);
        Put(b, 8, 0x02100000, 4);
        std::copy_n("test", 4, b.begin() + 4);
        std::copy_n(deviceClass_, 4, b.begin() + 12);
        std::copy_n(colourSpace_, 4, b.begin() + 16);
        std::copy_n(pcs_, 4, b.begin() + 20);
        std::copy_n("acsp", 4, b.begin() + 36);
        for (size_t k = 0; k < 3; ++k) Put(b, 68 + 4 * k, Fixed16(illuminant_[k]), 4);
        return b;
    }

private:
    const char* colourSpace_;
    const char* pcs_;
    const char* deviceClass_;
    std::array<double, 3> illuminant_ = {0.9642, 1.0, 0.8249};
    std::vector<std::pair<std::string, Bytes>> tags_;
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
