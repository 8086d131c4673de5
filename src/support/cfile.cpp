#include "support/cfile.h"

#include <climits>
#include <cstdint>

#include <sys/stat.h>

namespace vantrel {

const char* CFile::ModeFor(unsigned flags) {
    const bool binary = flags & kBinary;
    const bool text = !binary && (flags & kText);
    if (flags & kReadWrite) return binary ? "rb+" : text ? "rt+" : "r+";
    if (flags & kWrite) return binary ? "wb" : text ? "wt" : "w";
    return binary ? "rb" : text ? "rt" : "r";
}

bool CFile::Open(const std::string& path, unsigned flags) {
    Close();
    const char* mode = ModeFor(flags);
    // The C runtime on Linux knows no "t"; text and binary are the same there.
    std::string posixMode;
    for (const char* c = mode; *c; ++c)
        if (*c != 't') posixMode += *c;
    stream_ = std::fopen(path.c_str(), posixMode.c_str());
    return stream_ != nullptr;
}

void CFile::Close() {
    if (stream_) std::fclose(stream_);
    stream_ = nullptr;
}

size_t CFile::Read(void* buffer, size_t n) {
    if (!stream_ || n == 0) return 0;
    return std::fread(buffer, 1, n, stream_);
}

size_t CFile::Write(const void* buffer, size_t n) {
    if (!stream_ || n == 0) return 0;
    return std::fwrite(buffer, 1, n, stream_);
}

int CFile::Seek(int64_t offset, int origin) {
    if (!stream_) return -1;
    const int whence = origin == 1 ? SEEK_CUR : origin == 2 ? SEEK_END : SEEK_SET;
    if (origin < 0 || origin > 2) return -1;
    if (offset < LONG_MIN || offset > LONG_MAX) return -1;
    return std::fseek(stream_, static_cast<long>(offset), whence) == 0 ? 0 : -1;
}

int64_t CFile::Tell() const {
    if (!stream_) return -1;
    return std::ftell(stream_);
}

int64_t CFile::Size() const {
    if (!stream_) return -1;
    struct stat st {};
    if (fstat(fileno(stream_), &st) != 0 || !S_ISREG(st.st_mode)) return -1;
    return static_cast<int64_t>(st.st_size);
}

bool ReadWholeFile(const std::string& path, std::string& bytes, uint64_t maxSize) {
    CFile file(path, CFile::kBinary);
    const int64_t size = file.Size();
    // A 32-bit host cannot hold more than SIZE_MAX bytes in one string.
    if (size < 0 || static_cast<uint64_t>(size) > maxSize || static_cast<uint64_t>(size) > SIZE_MAX) return false;
    bytes.assign(static_cast<size_t>(size), '\0');
    return file.Read(bytes.data(), bytes.size()) == bytes.size();
}

bool CopyWholeFile(const std::string& from, const std::string& to) {
    std::string bytes;
    if (!ReadWholeFile(from, bytes)) return false;
    CFile out(to, CFile::kBinary | CFile::kWrite);
    if (!out.IsOpen()) return false;
    return out.Write(bytes.data(), bytes.size()) == bytes.size();
}

}  // namespace vantrel
