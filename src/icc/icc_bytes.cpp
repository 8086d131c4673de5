#include "icc/icc_bytes.h"

#include "support/cfile.h"

namespace vantrel {

bool IccBytes::Load(const std::string& path) {
    bytes_.clear();
    CFile file(path, CFile::kBinary);
    const int64_t size = file.Size();
    if (size < 0 || static_cast<uint64_t>(size) > kMaxFileSize) return false;
    std::string bytes(static_cast<size_t>(size), '\0');
    if (file.Read(bytes.data(), bytes.size()) != bytes.size()) return false;
    bytes_.swap(bytes);
    return true;
}

}  // namespace vantrel
