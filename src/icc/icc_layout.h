#pragma once

#include <cstdint>
#include <string>

// Where the fields of the ICC structures this library reads and patches lie, each layout
// described once. Offsets are from the start of the structure: the file for the header and tag
// table, the tag's data for tag types, the element for curve elements and the CLUT head.

namespace vantrel::icc {

// The 128-byte header and the tag count after it.
struct Header {
    static constexpr uint64_t kCmmType = 4;
    static constexpr uint64_t kDeviceClass = 12;
    static constexpr uint64_t kColourSpace = 16;
    static constexpr uint64_t kPcs = 20;
    static constexpr uint64_t kSignature = 36;  // "acsp"
    static constexpr uint64_t kIlluminant = 68;  // X, Y, Z as s15Fixed16Number
    static constexpr uint64_t kTagCount = 128;
    static constexpr uint64_t kSize = 132;       // header and tag count: where the tag table begins
};

// One 12-byte record of the tag table: signature, data offset, data size.
struct TagRecord {
    static constexpr uint64_t kSignature = 0;
    static constexpr uint64_t kOffset = 4;
    static constexpr uint64_t kDataSize = 8;
    static constexpr uint64_t kSize = 12;
    // File position of the record of tag `index` (0-based).
    static constexpr uint64_t At(uint64_t index) { return Header::kSize + kSize * index; }
};

// Every tag's data starts with its type signature and four reserved bytes.
struct TagData {
    static constexpr uint64_t kType = 0;
    static constexpr uint64_t kBody = 8;
};

// The heads shared by lut8Type ("mft1"), lut16Type ("mft2"), lutAtoBType ("mAB ") and
// lutBtoAType ("mBA "): channel counts and, for the v2 types, the grid.
struct LutHead {
    static constexpr uint64_t kInputs = 8;
    static constexpr uint64_t kOutputs = 9;
    static constexpr uint64_t kGrid = 10;
};

// "mft1": the input matrix, then 256-entry byte curves, the byte CLUT and the output curves.
struct Mft1 {
    static constexpr uint64_t kMatrix = 12;  // nine s15Fixed16Number values, row-major
    static constexpr uint64_t kTables = 48;
    static constexpr uint64_t kCurveEntries = 256;
};

// "mft2": as "mft1" with 16-bit values and curve lengths of the table's own.
struct Mft2 {
    static constexpr uint64_t kMatrix = 12;
    static constexpr uint64_t kInputEntries = 48;   // 16-bit
    static constexpr uint64_t kOutputEntries = 50;  // 16-bit
    static constexpr uint64_t kTables = 52;
};

// "mAB " / "mBA ": offsets of the elements from the tag's start. The A curves are on the device
// side, the B curves on the PCS side, so each type has its input side where the other has its output.
struct LutAB {
    static constexpr uint64_t kBCurves = 12;
    static constexpr uint64_t kMatrix = 16;
    static constexpr uint64_t kMCurves = 20;
    static constexpr uint64_t kClut = 24;
    static constexpr uint64_t kACurves = 28;
    static constexpr uint64_t kHeadSize = 32;
    static constexpr uint64_t InputCurves(bool aToB) { return aToB ? kACurves : kBCurves; }
    static constexpr uint64_t OutputCurves(bool aToB) { return aToB ? kBCurves : kACurves; }
};

// The CLUT element of "mAB "/"mBA ": 16 grid-point bytes (one per input), the precision byte,
// padding, then the values.
struct ClutHead {
    static constexpr uint64_t kGridPoints = 0;
    static constexpr uint64_t kPrecision = 16;  // 1: 8-bit, 2: 16-bit values
    static constexpr uint64_t kValues = 20;
};

// "curv": a 32-bit count, then 16-bit entries (none: identity; one: a u8Fixed8 gamma).
struct Curve {
    static constexpr uint64_t kCount = 8;
    static constexpr uint64_t kEntryCount = 10;  // the low 16 bits of the count
    static constexpr uint64_t kEntries = 12;
};

// "XYZ ": one XYZ number of three s15Fixed16Number values after the type.
struct XyzNumber {
    static constexpr uint64_t kValues = 8;
    static constexpr uint64_t kSize = 20;
};

// True for the type signature of an XYZ tag, also written byte-reversed by some tools.
inline bool IsXyzType(const std::string& type) { return type == "XYZ " || type == " ZYX"; }
// True for a text tag, also written byte-reversed by some tools.
inline bool IsTextType(const std::string& type) { return type == "text" || type == "txet"; }

}  // namespace vantrel::icc
