#pragma once

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "colour/colour_values.h"

namespace vantrel {

class IccBytes;

// One tag of a profile's tag directory. LUT tags also carry their channel and grid counts.
struct TagEntry {
    double matrix[9] = {1, 0, 0, 0, 1, 0, 0, 0, 1};  // row-major, the LUT's e00..e22
    std::string signature;                           // "A2B0", "wtpt", ...
    int32_t outputChannels = 0;
    int32_t inputChannels = 0;
    int32_t gridPoints = 0;
    int32_t inputEntries = 0;   // 256 once the tag is seen to be a LUT; mft2 and mAB/mBA: from the file
    int32_t outputEntries = 0;  // likewise
    std::string copyright;      // text of a "cprt" tag
    std::string type;           // type signature at the tag's offset: "mft2", "curv", ...
    uint32_t offset = 0;        // data offset in the file
    uint32_t size = 0;          // data size
};

// The transform held by one LUT slot (slot 0: device to PCS; slot 1: PCS to device).
struct LutSlot {
    int32_t tagIndex = 0;      // 1-based position of the loaded tag in the direction's directory
    std::string type;          // "mft1", "mft2", "mAB ", "mBA " or "MATR" (matrix/TRC); empty when none
    int32_t inputChannels = 0;
    int32_t inputEntries = 0;  // entries per input curve as held (256 or more)
    int32_t outputChannels = 0;
    int32_t outputEntries = 0;
    int32_t gridPoints = 0;    // 9 for "MATR"
    std::string pcs;           // "Lab" or "XYZ"
    std::string colourSpace;   // the header's data colour space, four characters ("CMYK", "RGB ")
    double matrix[3][3] = {{1, 0, 0}, {0, 1, 0}, {0, 0, 1}};  // matrix/TRC: rows X, Y, Z; columns R, G, B
    int32_t colorantCount = 0; // 3 when rXYZ, gXYZ and bXYZ were all read
};

// The tone curves of a matrix/TRC transform: 256 doubles per channel on 0..255.
struct MatrixTrc {
    int32_t flag = 0;
    std::vector<double> curve[3];  // R, G, B; empty until the TRC tag is read
    double gamma[3] = {0, 0, 0};   // from one-entry curves
};

// What the loader stretched of a legacy v2 Lab table (L* = 100 at 0xFF00), so that the writer
// can put the file's own encoding back and an unchanged table rewrites identical bytes.
struct LegacyStretch {
    bool clut = false;  // the first output of every CLUT node was stretched by 257/256
    // File values above 0xFF00 that the stretch clipped to 0xFFFF: CLUT position, file value.
    std::vector<std::pair<uint32_t, uint16_t>> clipped;
};

// Per-input-channel scratch of the interpolation kernels.
struct WorkRecord {
    int32_t index = 0;     // grid index
    double fraction = 0;   // position inside the cell
    int32_t extra = 0;
};

// One ICC profile in memory, with a device-to-PCS (0) and a PCS-to-device (1) direction, each with
// its own tag directory and its own LUT slot. The tables are unpacked into 16-bit arrays with the
// counts, strides and scales the interpolation needs already computed.
//
// The fields are public: the evaluation code (free functions over a CProfil) reads the tables and
// keeps its working values in the scratch fields below. A slot whose tables were not loaded has an
// empty type and empty arrays; check SlotHolds() before evaluating it.
class CProfil {
public:
    // The precision code of slot 0 that marks a profile holding no tables.
    static constexpr int kReleasedMarker = -55;
    static constexpr int kSlots = 3;        // the third slot exists in every per-slot array, never filled
    static constexpr int kMaxInputs = 7;    // the corner table holds 2^7 corners
    static constexpr int kMaxOutputs = 15;
    static constexpr int kEvalSize = 20;
    static constexpr int kMaxCorners = 128;
    static constexpr int kHeaderSize = 132;  // 128-byte header plus the 4-byte tag count

    // Constants of the arithmetic.
    static constexpr double kFixed16 = 1.0 / 65536.0;   // s15Fixed16Number fraction
    static constexpr double kInv255 = 1.0 / 255.0;
    static constexpr double kInv257 = 1.0 / 257.0;
    static constexpr double kOneThird = 1.0 / 3.0;
    static constexpr double kEpsilon = static_cast<double>(0.0005f);
    static constexpr double kInvSqrt3 = 0.57735026918962576;

    CProfil();
    ~CProfil() { Release(); }
    CProfil(const CProfil&) = delete;
    CProfil& operator=(const CProfil&) = delete;

    // ---- lifecycle -----------------------------------------------------------------------------
    void MarkReleased() { m_Precision[0] = kReleasedMarker; }
    // False from the release until the next LoadLut of direction 0.
    bool HoldsTables() const { return m_Precision[0] != kReleasedMarker; }
    // True when the slot holds a 16-bit table ("mft2", "mAB ", "mBA "); 8-bit tables ("mft1"),
    // matrix/TRC transforms and a released profile are not. The one answer to that question: the
    // precision field also carries the release marker.
    bool SixteenBit(int slot) const {
        return (slot == 0 || slot == 1) && (m_Precision[slot] == 1 || m_Precision[slot] == 3);
    }
    // Frees all tables and both directories and stores the release marker; harmless when released.
    void Release();
    // True when the slot holds a complete transform (tables of the sizes its descriptor gives, or "MATR").
    bool SlotHolds(int slot) const;

    // ---- reading (profile_reader.cpp, lut_loader.cpp) -------------------------------------------
    // Reads the header and the tag directory of `path` into direction 0 or 1. A file that cannot be
    // opened leaves the profile unchanged; a bad tag ends the directory there (later entries empty).
    void ReadTagTable(int direction, const std::string& path);
    // Loads the transform under `tag` ("A2B1", "B2A0", "gamt", ...) into the direction's slot.
    // 1: held; -1: no such tag (both directories emptied) or its table is unusable; -2: out of memory.
    int32_t LoadLut(int direction, const std::string& tag, const std::string& path);

    // ---- header and white points (header_access.cpp) --------------------------------------------
    void SetCmmType(const char* fourChars);
    void SetDeviceClass(int kind);  // 0 "mntr", 1 "prtr", 2 "scnr"
    uint32_t IlluminantX() const;   // raw big-endian s15Fixed16Number from the header
    uint32_t IlluminantY() const;
    uint32_t IlluminantZ() const;
    void SetIlluminant(uint32_t x, uint32_t y, uint32_t z);  // raw values; X's integer part written as 0
    void SetMediaWhite(int direction, char axis, double value);  // axis X/x, Y/y, Z/z
    // Lab of the direction's media white relative to the header illuminant (0.138 constant).
    double WhiteL(int direction) const;
    double WhiteA(int direction) const;
    double WhiteB(int direction) const;
    Lab WhiteLab(int direction) const;
    // Store the white of the direction's slot (L* given as L*/100) and recompute its media white.
    void SetWhiteL(int direction, double lOver100);
    void SetWhiteA(int direction, double a);
    void SetWhiteB(int direction, double b);
    // File position of the XYZ data of `path`'s "wtpt" tag, or -1 (no such XYZ tag inside the file).
    // Leaves the profile as it is.
    int64_t FindWhitePointOffset(int direction, const std::string& path);

    // ---- colour math against this profile's whites (colour/profile_colour.cpp) ------------------
    Lab XYZToLab(double X, double Y, double Z) const;
    XYZ LabToXYZ(double L, double a, double b) const;
    XYZ AdaptToAbsolute(double X, double Y, double Z, int direction) const;
    XYZ AdaptToRelative(double X, double Y, double Z, int direction) const;
    Lab LabToAbsolute(double L, double a, double b, int direction) const;
    Lab LabToRelative(double L, double a, double b, int direction) const;

    // ---- writer (profile_writer.cpp) ------------------------------------------------------------
    // File position of the first CLUT byte of the direction's loaded tag, 0 when the file cannot be
    // read or does not hold the loaded table there.
    int64_t FindClutOffset(int direction, const std::string& path);
    // Writes the slot's CLUT over the same table of `path`; nothing is written unless the file holds,
    // at that tag, a table of the same type and size. True when written.
    bool WriteClut(int direction, const std::string& path);
    // Recomputes the media white from the slot's white and writes it into `path`'s "wtpt" tag
    // (when the file has one of type "XYZ "). True when written.
    bool WriteWhitePoint(int direction, const std::string& path);
    // The slot's CLUT in the file's own encoding: legacy Lab tables with their stretch undone.
    std::vector<uint16_t> ClutAsInFile(int slot) const;
    std::vector<uint16_t> SnapshotClut(int slot) const;
    // Copies a snapshot of the same size back into the slot's CLUT; false (nothing copied) otherwise.
    bool RestoreClut(int slot, const std::vector<uint16_t>& snapshot);
    // Writes the slot-1 CLUT to `path` (any table with a CLUT; a matrix/TRC slot is refused), then,
    // for a table of three inputs and at least three outputs, fills `buffer` (`words` 16-bit words)
    // with the host's layout: grid, strides, corner offsets, values, byte size. A buffer too small
    // for it, or a table of another shape, is left untouched. True when the table was written.
    bool ExportClut3(const std::string& path, uint16_t* buffer, size_t words);
    int32_t GridPoints(int kind) const;  // 1 -> slot 1, 2 -> slot 2, otherwise slot 0

    // ---- tone curves (tone_curve.cpp) -----------------------------------------------------------
    void BuildGammaCurve(int slot, int channel);

    // ======== data ==============================================================================

    // Working values of the evaluation and optimisation code; cleared at construction.
    double m_Work[3] = {0, 0, 0};
    WorkRecord m_WorkRecords[kEvalSize] = {};  // per input channel: grid index, fraction
    double m_Complement[kEvalSize] = {};       // per input channel: 1 - fraction
    double m_CornerWeights[kMaxCorners] = {};  // multilinear corner weights
    double m_WorkBlocks[2][4] = {};
    // The evaluation vector: inputs on 0..255 in, outputs in table units out.
    double m_Eval[kEvalSize] = {};

    // Paper white, byte-sized values: slot 0 the media white as round(L* x 2.55), round(a*), round(b*)
    // (a*, b* may be negative); slot 1 the device values 0..255 of the paper white, one per channel.
    int16_t m_PaperWhite[2][20] = {};
    int32_t m_UseMediaWhite[2] = {0, 0};   // per direction, set by the slot loaders
    int32_t m_OutputIdentity[2] = {0, 0};  // per slot: the output curves are the identity

    // The 132 bytes that begin the file read last (header and big-endian tag count).
    uint8_t m_Header[kHeaderSize] = {};

    // Tag directories, one per direction.
    std::vector<TagEntry> m_Tags[2];

    // Unpacked tables per slot. Input curves channel-major (n x inputEntries); CLUT with the first
    // input slowest and the outputs innermost (grid^n x m); output curves channel-major (m x outputEntries).
    // 8-bit tables hold 0..255.
    std::vector<uint16_t> m_InputCurves[kSlots];
    std::vector<uint16_t> m_Clut[kSlots];
    std::vector<uint16_t> m_OutputCurves[kSlots];

    // Counts and strides per slot.
    int32_t m_OutputStride[2][kEvalSize] = {};  // k x outputEntries, k = 0..9
    int32_t m_GamutTagIndex[2] = {0, 0};        // 1-based index of "gamt" per direction, 0 if none
    int32_t m_InputLast[2] = {0, 0};            // inputEntries - 1
    int32_t m_GridLast[2] = {0, 0};             // gridPoints - 1
    int32_t m_InputStride[2][kEvalSize] = {};   // k x inputEntries, k = 0..19
    int32_t m_LoadedTag[2] = {0, 0};            // per direction: 1-based index of the loaded tag
    int32_t m_Corners[kSlots] = {0, 0, 0};      // 2^inputChannels

    // Scales per slot: device value to grid coordinate; CLUT value to output-curve position.
    double m_GridScale[kSlots] = {0, 0, 0};     // (grid-1)/65535 for 16-bit tables, (grid-1)/255 for 8-bit
    double m_OutputScale[kSlots] = {0, 0, 0};   // (outputEntries-1)/65535 for 16-bit tables, 1.0 for 8-bit

    // White points per direction, XYZ with Y = 1: media white ("wtpt", else the illuminant) and the
    // header illuminant.
    double m_MediaWhite[2][3] = {};
    double m_Illuminant[2][3] = {};
    // White of each slot's transform: L*/100, a*, b*.
    double m_SlotWhite[kSlots][3] = {};

    // Offset of each corner of a CLUT cell from its first corner (in values), ordered by the number
    // of raised channels, then by channel index.
    int32_t m_CornerOffsets[2][kMaxCorners] = {};

    // Matrix/TRC curves per slot.
    MatrixTrc m_Trc[kSlots];

    // CLUT addressing per slot: multiplier grid^(n-1-i) per input channel, the stride
    // multiplier x outputChannels, and grid^2, grid, 1.
    int32_t m_ClutMultiplier[kSlots][kMaxInputs] = {};
    int32_t m_ClutStride[kSlots][kMaxInputs] = {};
    int32_t m_GridPowers[kSlots][3] = {};

    // The input-entries count of the file when it was below 256 (the curves are held resampled).
    int32_t m_FileInputEntries[2] = {0, 0};

    // Per slot: what the loader stretched of a legacy Lab CLUT.
    LegacyStretch m_LegacyStretch[2];

    LutSlot m_Lut[kSlots];

    // Why the last ReadTagTable or LoadLut refused the file, in words for the user ("has no
    // \"B2A1\" table"); empty after a successful load. Composed here, shown by whoever asks.
    std::string m_LoadFailure;

    // Table precision per slot: 0 8-bit ("mft1", "MATR"), 1 "mft2", 3 "mAB "/"mBA ".
    // Slot 0 doubles as the release marker (kReleasedMarker).
    int32_t m_Precision[2] = {0, 0};

    // Entries per input curve as the file holds them (the held curves of shorter ones have 256).
    int32_t InputEntriesInFile(int slot) const {
        return m_FileInputEntries[slot] ? m_FileInputEntries[slot] : m_Lut[slot].inputEntries;
    }

private:
    static bool ValidDirection(int direction) { return direction == 0 || direction == 1; }
    void SetSlotWhite(int direction, int index, double value);
    // Reading the directory (profile_reader.cpp): one tag, and the parts of it that describe a table.
    bool ReadTag(const IccBytes& file, int direction, uint32_t index, int& colorants);
    bool ReadLutHead(const IccBytes& file, int direction, TagEntry& entry);
    bool ReadColorant(const IccBytes& file, int direction, TagEntry& entry, int channel);
    bool ReadToneCurve(const IccBytes& file, int direction, const TagEntry& entry, int channel);
    // Loading a table (lut_loader.cpp), step by step.
    int FindTableTag(int direction, const std::string& tag) const;
    void DescribeFromTag(int direction, int index);
    bool HasMatrixTrc(int direction) const;
    bool DescribeMatrixTrc(int direction);
    void ComputeAddressing(int slot);
    void ResetSlot(int slot);
    int32_t LoadTables(int slot, const IccBytes& file);
    int32_t ReadMft1(int slot, const IccBytes& file, uint64_t tag);
    int32_t ReadMft2(int slot, const IccBytes& file, uint64_t tag);
    int32_t ReadLutAB(int slot, const IccBytes& file, uint64_t tag);
    void MarkIdentityOutput(int slot);
    void MediaWhiteFromSlotWhite(int direction);
    void ComputeSlotWhite(int direction, int slot);
};

}  // namespace vantrel
