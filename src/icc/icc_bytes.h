#pragma once

#include <cstdint>
#include <string>

namespace vantrel {

// A whole ICC file in memory with big-endian reads. Every read is bounds-checked by the caller
// through Has(); the accessors themselves answer 0 outside the file so that a missed check can
// never read past the end.
class IccBytes {
public:
    // Larger files cannot be profiles this library handles.
    static constexpr uint64_t kMaxFileSize = uint64_t{256} << 20;

    // False when the file cannot be opened or read, or is larger than kMaxFileSize.
    bool Load(const std::string& path);

    uint64_t Size() const { return bytes_.size(); }
    // True when n bytes from offset lie inside the file (64-bit, no wrap).
    bool Has(uint64_t offset, uint64_t n) const { return offset <= Size() && n <= Size() - offset; }

    uint8_t U8(uint64_t offset) const { return Has(offset, 1) ? Byte(offset) : 0; }
    uint16_t U16(uint64_t offset) const {
        return Has(offset, 2) ? static_cast<uint16_t>(Byte(offset) << 8 | Byte(offset + 1)) : 0;
    }
    uint32_t U32(uint64_t offset) const {
        if (!Has(offset, 4)) return 0;
        return uint32_t{Byte(offset)} << 24 | uint32_t{Byte(offset + 1)} << 16 | uint32_t{Byte(offset + 2)} << 8 |
               uint32_t{Byte(offset + 3)};
    }
    // A signed 16-bit integer part plus an unsigned 16-bit fraction.
    double S15Fixed16(uint64_t offset) const {
        const uint32_t raw = U32(offset);
        return static_cast<int16_t>(raw >> 16) + (raw & 0xFFFF) / 65536.0;
    }
    // An unsigned 16-bit integer part plus the fraction (white points and illuminants).
    double U16Fixed16(uint64_t offset) const { return U32(offset) / 65536.0; }
    // Four characters (a signature); empty outside the file.
    std::string Signature(uint64_t offset) const {
        return Has(offset, 4) ? bytes_.substr(static_cast<size_t>(offset), 4) : std::string();
    }
    const std::string& Bytes() const { return bytes_; }

private:
    uint8_t Byte(uint64_t offset) const { return static_cast<uint8_t>(bytes_[static_cast<size_t>(offset)]); }

    std::string bytes_;
};

// Big-endian 32-bit words in memory (the header and the bytes a patch writes).
inline uint32_t LoadU32(const uint8_t* at) {
    return uint32_t{at[0]} << 24 | uint32_t{at[1]} << 16 | uint32_t{at[2]} << 8 | uint32_t{at[3]};
}
inline void StoreU32(uint8_t* at, uint32_t value) {
    at[0] = static_cast<uint8_t>(value >> 24);
    at[1] = static_cast<uint8_t>(value >> 16);
    at[2] = static_cast<uint8_t>(value >> 8);
    at[3] = static_cast<uint8_t>(value);
}

// The tag types whose tables LoadLut unpacks.
inline bool IsLutType(const std::string& type) {
    return type == "mft1" || type == "mft2" || type == "mAB " || type == "mBA ";
}

// True when a v4 CLUT head at `head` (a grid byte per input, the precision byte at 16, 20 bytes
// in all) lies inside the file and describes a 16-bit CLUT of `grid` points on each of `inputs`.
bool V4ClutHeadMatches(const IccBytes& file, uint64_t head, int inputs, int grid);

// File position of the three numbers of the first `signature` tag ("wtpt") when it is an XYZ
// number lying inside the file; -1 otherwise.
int64_t FindXyzData(const IccBytes& file, const char* signature);

}  // namespace vantrel
