#include "icc/icc_bytes.h"

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
    if (!file.Has(head, 20) || file.U8(head + 16) != 2) return false;
    for (int i = 0; i < inputs; ++i)
        if (file.U8(head + static_cast<uint64_t>(i)) != grid) return false;
    return true;
}

int64_t FindXyzData(const IccBytes& file, const char* signature) {
    if (!file.Has(0, 132)) return -1;
    const uint64_t count = file.U32(128);
    for (uint64_t i = 0; i < count; ++i) {
        const uint64_t record = 132 + 12 * i;
        if (!file.Has(record, 12)) return -1;
        if (file.Signature(record) != signature) continue;
        const uint64_t offset = file.U32(record + 4);
        const std::string type = file.Signature(offset);
        if (file.U32(record + 8) < 20 || !file.Has(offset, 20) || (type != "XYZ " && type != " ZYX")) return -1;
        return static_cast<int64_t>(offset + 8);
    }
    return -1;
}

}  // namespace vantrel
