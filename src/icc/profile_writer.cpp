#include <cmath>
#include <cstring>

#include "icc/icc_bytes.h"
#include "icc/icc_layout.h"
#include "icc/profil.h"
#include "support/cfile.h"

namespace vantrel {
namespace {

// round(value x 65536) as an s15Fixed16Number, kept inside its range.
uint32_t ToFixed16(double value) {
    double scaled = std::floor(value * 65536.0 + 0.5);
    if (!(scaled > -2147483648.0)) scaled = -2147483648.0;
    if (scaled > 2147483647.0) scaled = 2147483647.0;
    return static_cast<uint32_t>(static_cast<int32_t>(scaled));
}

// Patches `bytes` into `path` at `position`; the file must already exist and be long enough.
bool Patch(const std::string& path, int64_t position, const std::vector<uint8_t>& bytes) {
    CFile file(path, CFile::kBinary | CFile::kReadWrite);
    if (!file.IsOpen() || file.Seek(position, 0) != 0) return false;
    return file.Write(bytes.data(), bytes.size()) == bytes.size();
}

// Where the CLUT of the slot's tag starts in `file`, after checking that the file holds at that
// tag the very table that was loaded (type, channels, grid, curve lengths, CLUT inside the file).
// 0 when it does not.
uint64_t LoadedClutPosition(const CProfil& p, int direction, const IccBytes& file) {
    const int slot = direction;
    const LutSlot& lut = p.m_Lut[slot];
    const std::vector<TagEntry>& tags = p.m_Tags[direction];
    if (!p.SlotHolds(slot) || lut.type == "MATR" || lut.tagIndex < 1 ||
        static_cast<size_t>(lut.tagIndex) > tags.size())
        return 0;
    const TagEntry& entry = tags[static_cast<size_t>(lut.tagIndex - 1)];
    const uint64_t record = icc::TagRecord::At(static_cast<uint64_t>(lut.tagIndex - 1));
    if (!file.Has(0, icc::Header::kSize) || file.U32(icc::Header::kTagCount) < static_cast<uint32_t>(lut.tagIndex) ||
        !file.Has(record, icc::TagRecord::kSize) || file.Signature(record + icc::TagRecord::kSignature) != entry.signature ||
        file.U32(record + icc::TagRecord::kOffset) != entry.offset ||
        file.U32(record + icc::TagRecord::kDataSize) != entry.size)
        return 0;
    const uint64_t tag = entry.offset;
    if (!file.Has(tag, entry.size) || !file.Has(tag, icc::LutAB::kHeadSize) ||
        file.Signature(tag + icc::TagData::kType) != lut.type || file.U8(tag + icc::LutHead::kInputs) != lut.inputChannels ||
        file.U8(tag + icc::LutHead::kOutputs) != lut.outputChannels)
        return 0;

    const uint64_t n = static_cast<uint64_t>(lut.inputChannels);
    const uint64_t values = p.m_Clut[slot].size();
    uint64_t clut = 0;
    uint64_t width = 2;
    if (lut.type == "mft1") {
        if (file.U8(tag + icc::LutHead::kGrid) != lut.gridPoints) return 0;
        clut = tag + icc::Mft1::kTables + n * icc::Mft1::kCurveEntries;
        width = 1;
    } else if (lut.type == "mft2") {
        // The CLUT follows the input curves as the file holds them, not as they are held here.
        const uint64_t entries = static_cast<uint64_t>(p.InputEntriesInFile(slot));
        if (file.U8(tag + icc::LutHead::kGrid) != lut.gridPoints || file.U16(tag + icc::Mft2::kInputEntries) != entries ||
            file.U16(tag + icc::Mft2::kOutputEntries) != static_cast<uint64_t>(lut.outputEntries))
            return 0;
        clut = tag + icc::Mft2::kTables + n * entries * 2;
    } else {
        const uint64_t head = tag + file.U32(tag + icc::LutAB::kClut);
        if (!V4ClutHeadMatches(file, head, lut.inputChannels, lut.gridPoints)) return 0;
        clut = head + icc::ClutHead::kValues;
    }
    return file.Has(clut, values * width) ? clut : 0;
}

}  // namespace

int64_t CProfil::FindClutOffset(int direction, const std::string& path) {
    if (!ValidDirection(direction)) return 0;
    IccBytes file;
    if (!file.Load(path)) return 0;
    return static_cast<int64_t>(LoadedClutPosition(*this, direction, file));
}

bool CProfil::WriteClut(int direction, const std::string& path) {
    if (!ValidDirection(direction)) return false;
    IccBytes file;
    if (!file.Load(path)) return false;
    const uint64_t position = LoadedClutPosition(*this, direction, file);
    if (position == 0) return false;
    const std::vector<uint16_t> clut = ClutAsInFile(direction);
    std::vector<uint8_t> bytes;
    if (m_Lut[direction].type == "mft1") {
        bytes.reserve(clut.size());
        for (uint16_t value : clut) bytes.push_back(static_cast<uint8_t>(value & 0xFF));
    } else {
        bytes.reserve(2 * clut.size());
        for (uint16_t value : clut) {
            bytes.push_back(static_cast<uint8_t>(value >> 8));
            bytes.push_back(static_cast<uint8_t>(value));
        }
    }
    return Patch(path, static_cast<int64_t>(position), bytes);
}

bool CProfil::WriteWhitePoint(int direction, const std::string& path) {
    if (!ValidDirection(direction)) return false;
    // The media white follows the slot's white whether or not the file can take it.
    MediaWhiteFromSlotWhite(direction);
    IccBytes file;
    if (!file.Load(path)) return false;
    const int64_t position = FindXyzData(file, "wtpt");
    if (position < 0) return false;
    std::vector<uint8_t> bytes(12);
    for (int axis = 0; axis < 3; ++axis) StoreU32(bytes.data() + 4 * axis, ToFixed16(m_MediaWhite[direction][axis]));
    return Patch(path, position, bytes);
}

std::vector<uint16_t> CProfil::ClutAsInFile(int slot) const {
    slot = slot == 0 ? 0 : 1;
    std::vector<uint16_t> clut = m_Clut[slot];
    const LegacyStretch& stretch = m_LegacyStretch[slot];
    if (!stretch.clut) return clut;
    const size_t m = static_cast<size_t>(m_Lut[slot].outputChannels);
    for (size_t k = 0; k < clut.size(); k += m) clut[k] = static_cast<uint16_t>(std::floor(clut[k] * 256.0 / 257.0 + 0.5));
    // Values the stretch clipped come back as the file had them while the table still holds the clip.
    for (const auto& [position, value] : stretch.clipped)
        if (position < clut.size() && m_Clut[slot][position] == 0xFFFF) clut[position] = value;
    return clut;
}

std::vector<uint16_t> CProfil::SnapshotClut(int slot) const { return m_Clut[slot == 0 ? 0 : 1]; }

bool CProfil::RestoreClut(int slot, const std::vector<uint16_t>& snapshot) {
    std::vector<uint16_t>& clut = m_Clut[slot == 0 ? 0 : 1];
    if (snapshot.size() != clut.size()) return false;
    std::copy(snapshot.begin(), snapshot.end(), clut.begin());
    return true;
}

bool CProfil::ExportClut3(const std::string& path, uint16_t* buffer, size_t words) {
    const LutSlot& lut = m_Lut[1];
    // A matrix/TRC slot has no CLUT to write or hand over.
    if (!SlotHolds(1) || lut.type == "MATR") return false;
    // The table goes to the file whatever its shape: a link of four to seven channels is
    // corrected as well as a three-channel one.
    const bool written = WriteClut(1, path);
    // The host's layout describes three-input tables; any other leaves the buffer as it was.
    const size_t g = static_cast<size_t>(lut.gridPoints);
    const size_t nodes = g * g * g;
    if (lut.inputChannels != 3 || lut.outputChannels < 3 || !buffer || words < 13 + 3 * nodes) return written;
    auto word = [](size_t value) { return static_cast<uint16_t>(value); };
    buffer[0] = word(g);
    buffer[1] = word(g * g);
    buffer[2] = word(g);
    buffer[3] = 1;
    const size_t corners[8] = {0, 3 * g * g, 3 * g, 3, 3 * (g * g + g), 3 * g * g + 3, 3 * g + 3, 3 * (g * g + g) + 3};
    for (int k = 0; k < 8; ++k) buffer[4 + k] = word(corners[k]);
    const size_t m = static_cast<size_t>(lut.outputChannels);
    for (size_t node = 0; node < nodes; ++node)
        for (size_t out = 0; out < 3; ++out) buffer[12 + 3 * node + out] = m_Clut[1][node * m + out];
    buffer[12 + 3 * nodes] = word(6 * nodes + 26);
    return written;
}

int32_t CProfil::GridPoints(int kind) const { return m_Lut[kind == 1 ? 1 : kind == 2 ? 2 : 0].gridPoints; }

}  // namespace vantrel
