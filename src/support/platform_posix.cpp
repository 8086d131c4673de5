#if !defined(_WIN32)

#include "support/platform.h"

#include "resources/identity_profiles.h"

namespace vantrel::platform {

const char* ParameterFilePath() { return "/tmp/vantrelparams.txt"; }
const char* IsdProfilePath() { return "/tmp/vantrel.isd"; }

// A shared object carries no resource section: the profiles are generated from
// the same code that produces the Windows resources at build time.
ModuleResources::ModuleResources() : module_(this) {}
ModuleResources::~ModuleResources() = default;

std::vector<uint8_t> ModuleResources::Profile(int id) const {
    if (!module_) return {};
    return BuildIdentityProfile(id);
}

}  // namespace vantrel::platform

#endif
