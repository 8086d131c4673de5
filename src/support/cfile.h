#pragma once

#include <cstdint>
#include <cstdio>
#include <string>

namespace vantrel {

// A binary or text file over a C stream; every operation is safe on a closed file.
// ICC profiles are read with kBinary and patched in place with kBinary | kReadWrite.
class CFile {
public:
    static constexpr unsigned kWrite = 0x0001;
    static constexpr unsigned kReadWrite = 0x0002;
    static constexpr unsigned kText = 0x4000;
    static constexpr unsigned kBinary = 0x8000;

    CFile() = default;
    CFile(const std::string& path, unsigned flags) { Open(path, flags); }
    ~CFile() { Close(); }
    CFile(const CFile&) = delete;
    CFile& operator=(const CFile&) = delete;

    // The fopen mode a flag combination selects; read/write wins over write, other bits are ignored.
    static const char* ModeFor(unsigned flags);

    bool Open(const std::string& path, unsigned flags);
    void Close();
    bool IsOpen() const { return stream_ != nullptr; }

    size_t Read(void* buffer, size_t n);
    size_t Write(const void* buffer, size_t n);
    // 0 on success, -1 on failure or when closed; origin 0 start, 1 current, 2 end.
    int Seek(int64_t offset, int origin);
    int64_t Tell() const;
    // Size from the file system; -1 when closed or unknown.
    int64_t Size() const;

private:
    std::FILE* stream_ = nullptr;
};

// Reads a whole file; false when it cannot be opened or read, or is larger than `maxSize` bytes.
bool ReadWholeFile(const std::string& path, std::string& bytes, uint64_t maxSize = UINT64_MAX);
// Copies a file byte for byte; the copy is skipped (false) when the source cannot be read.
bool CopyWholeFile(const std::string& from, const std::string& to);

}  // namespace vantrel
