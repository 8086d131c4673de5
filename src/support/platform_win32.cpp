#if defined(_WIN32)

#include "support/platform.h"

#ifndef WIN32_LEAN_AND_MEAN
#define WIN32_LEAN_AND_MEAN
#endif
#include <windows.h>

namespace vantrel::platform {

const char* ParameterFilePath() { return "c:/temp/vantrelparams.txt"; }
const char* IsdProfilePath() { return "c:/temp/vantrel.isd"; }

std::FILE* OpenFixedFile(const char* path) { return path ? std::fopen(path, "rt") : nullptr; }

bool FixedFileTrusted(const char* path, uint64_t& size) {
    std::FILE* file = path ? std::fopen(path, "rb") : nullptr;
    if (!file) return false;
    const bool known = std::fseek(file, 0, SEEK_END) == 0;
    const long end = known ? std::ftell(file) : -1;
    std::fclose(file);
    if (end < 0) return false;
    size = static_cast<uint64_t>(end);
    return true;
}

// The C++ runtime's std::locale("") knows only "C" here; the user's number format is in the
// regional settings.
char UserDecimalPoint() {
    wchar_t separator[8] = {};
    if (GetLocaleInfoW(LOCALE_USER_DEFAULT, LOCALE_SDECIMAL, separator, 8) < 2) return '.';
    // Separators longer than one character or outside ASCII have no place in a CGATS file.
    if (separator[1] != L'\0' || separator[0] > 0x7F) return '.';
    return static_cast<char>(separator[0]);
}

namespace {

// The identity profiles live in the library's own file as resources of this type.
constexpr wchar_t kProfileResourceType[] = L"ICCPROFILE";

HMODULE Handle(void* module) { return static_cast<HMODULE>(module); }

}  // namespace

// Loading the library by its own name finds the copy the host already loaded and
// only raises its reference count; the destructor gives that reference back.
ModuleResources::ModuleResources() : module_(LoadLibraryW(L"vantrel.dll")) {}

ModuleResources::~ModuleResources() {
    if (module_) FreeLibrary(Handle(module_));
}

std::vector<uint8_t> ModuleResources::Profile(int id) const {
    if (!module_) return {};
    HRSRC resource = FindResourceW(Handle(module_), MAKEINTRESOURCEW(id), kProfileResourceType);
    if (!resource) return {};
    HGLOBAL loaded = LoadResource(Handle(module_), resource);
    if (!loaded) return {};
    const void* data = LockResource(loaded);
    if (!data) return {};
    const DWORD size = SizeofResource(Handle(module_), resource);
    if (size < 1) return {};
    const auto* bytes = static_cast<const uint8_t*>(data);
    return std::vector<uint8_t>(bytes, bytes + size);
}

}  // namespace vantrel::platform

#endif
