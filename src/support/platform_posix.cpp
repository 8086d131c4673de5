#if !defined(_WIN32)

#include "support/platform.h"

#include <locale>
#include <stdexcept>

namespace vantrel::platform {

const char* ParameterFilePath() { return "/tmp/vantrelparams.txt"; }
const char* IsdProfilePath() { return "/tmp/vantrel.isd"; }

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
