#if !defined(_WIN32)

#include "support/platform.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <locale>
#include <stdexcept>

namespace vantrel::platform {

const char* ParameterFilePath() { return "/tmp/vantrelparams.txt"; }
const char* IsdProfilePath() { return "/tmp/vantrel.isd"; }

namespace {

// Opens `path` without following a symbolic link and keeps it open only when it is a regular
// file of this user that no one else may write. -1 otherwise.
int OpenTrusted(const char* path, struct stat& status) {
    if (!path) return -1;
    // O_NONBLOCK: a planted FIFO must not block the open; it is refused below as not regular.
    const int fd = ::open(path, O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC);
    if (fd < 0) return -1;
    const bool trusted = ::fstat(fd, &status) == 0 && S_ISREG(status.st_mode) && status.st_uid == ::geteuid() &&
                         (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
    if (!trusted) {
        ::close(fd);
        return -1;
    }
    // Reads from here on block as usual.
    ::fcntl(fd, F_SETFL, ::fcntl(fd, F_GETFL) & ~O_NONBLOCK);
    return fd;
}

}  // namespace

std::FILE* OpenFixedFile(const char* path) {
    struct stat status{};
    const int fd = OpenTrusted(path, status);
    if (fd < 0) return nullptr;
    std::FILE* file = ::fdopen(fd, "r");
    if (!file) ::close(fd);
    return file;
}

bool FixedFileTrusted(const char* path, uint64_t& size) {
    struct stat status{};
    const int fd = OpenTrusted(path, status);
    if (fd < 0) return false;
    size = static_cast<uint64_t>(status.st_size);
    ::close(fd);
    return true;
}

char UserDecimalPoint() {
    try {
        return std::use_facet<std::numpunct<char>>(std::locale("")).decimal_point();
    } catch (const std::runtime_error&) {
        // LANG or LC_ALL names a locale that is not installed.
        return '.';
    }
}

// A shared object carries no resource section: there is nothing to open or read.
ModuleResources::ModuleResources() : module_(this) {}
ModuleResources::~ModuleResources() = default;

std::vector<uint8_t> ModuleResources::Profile(int) const { return {}; }

}  // namespace vantrel::platform

#endif
