#include "icc/icc_bytes.h"

#include "icc/icc_layout.h"

#include "support/cfile.h"

namespace vantrel {

bool IccBytes::Load(const std::string& path) {
    bytes_.clear();
    std::string bytes;
    if (!ReadWholeFile(path, bytes, kMaxFileSize)) return false;
    bytes_.swap(bytes);
    return true;
}

bool V4ClutHeadMatches(const IccBytes& file, uint64_t head, int inputs, int grid) {
    constexpr uint8_t kSixteenBit = 2;
    if (!file.Has(head, icc::ClutHead::kValues) || file.U8(head + icc::ClutHead::kPrecision) != kSixteenBit) return false;
    for (int i = 0; i < inputs; ++i)
        if (file.U8(head + icc::ClutHead::kGridPoints + static_cast<uint64_t>(i)) != grid) return false;
    return true;
}

int64_t FindXyzData(const IccBytes& file, const char* signature) {
    if (!file.Has(0, icc::Header::kSize)) return -1;
    const uint64_t count = file.U32(icc::Header::kTagCount);
    for (uint64_t i = 0; i < count; ++i) {
        const uint64_t record = icc::TagRecord::At(i);
        if (!file.Has(record, icc::TagRecord::kSize)) return -1;
        if (file.Signature(record + icc::TagRecord::kSignature) != signature) continue;
        const uint64_t offset = file.U32(record + icc::TagRecord::kOffset);
        if (file.U32(record + icc::TagRecord::kDataSize) < icc::XyzNumber::kSize ||
            !file.Has(offset, icc::XyzNumber::kSize) || !icc::IsXyzType(file.Signature(offset)))
            return -1;
        return static_cast<int64_t>(offset + icc::XyzNumber::kValues);
    }
    return -1;
}

}  // namespace vantrel
