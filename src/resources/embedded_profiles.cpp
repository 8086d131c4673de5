// Where the identity profiles come from when a tool object writes them into its directory.
#include "resources/identity_profiles.h"

namespace vantrel {

std::vector<uint8_t> EmbeddedIdentityProfile(const platform::ModuleResources& module, int id) {
    if (!module.IsOpen()) return {};
    if (platform::kProfilesInModule) return module.Profile(id);
    // The same bytes the Windows resources are made of.
    return BuildIdentityProfile(id);
}

}  // namespace vantrel
