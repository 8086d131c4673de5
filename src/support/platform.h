#pragma once

#include <cstdint>
#include <cstdio>
#include <vector>

// What the library takes from the operating system: its fixed file paths, the user's
// number format and the identity profiles embedded in the library's own file.
namespace vantrel::platform {

// The parameter file read when a tool object is created.
const char* ParameterFilePath();
// The ISD profile that the reference analysis writes and reads.
const char* IsdProfilePath();

// The fixed files sit in a folder every local user can write (/tmp on POSIX). One of them is
// used only when nobody else could have put it there: a regular file, reached without a
// symbolic link, owned by the user the library runs as and not writable by group or others.
// Anything else is treated as absent. (On Windows the folder is the user's own c:/temp.)
// Opens a trusted fixed file for reading in text mode; null when it is absent or not trusted.
std::FILE* OpenFixedFile(const char* path);
// True when the fixed file is there and trusted; its size goes to `size`.
bool FixedFileTrusted(const char* path, uint64_t& size);

// The decimal separator of the user's default locale, as the system's settings give it;
// '.' when they cannot be read.
char UserDecimalPoint();

// True where the library's own file carries the identity profiles as resources (Windows); a
// shared object has no resource section, and the profiles are built by the code that makes those
// resources.
#if defined(_WIN32)
constexpr bool kProfilesInModule = true;
#else
constexpr bool kProfilesInModule = false;
#endif

// Resource ids of the embedded identity profiles.
constexpr int kNeutral3ccId = 102;
constexpr int kCmykLinkId = 103;
constexpr int kCmykogLinkId = 104;
constexpr int kCmykrgbLinkId = 105;

// The library's own module, held open while its resources are read.
class ModuleResources {
public:
    ModuleResources();
    ~ModuleResources();
    ModuleResources(const ModuleResources&) = delete;
    ModuleResources& operator=(const ModuleResources&) = delete;

    bool IsOpen() const { return module_ != nullptr; }
    // The bytes of one embedded profile; empty when the resource is missing (always, where
    // kProfilesInModule is false).
    std::vector<uint8_t> Profile(int id) const;

private:
    void* module_ = nullptr;
};

}  // namespace vantrel::platform
