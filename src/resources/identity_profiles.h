#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "support/platform.h"

namespace vantrel {

struct IdentityProfileInfo {
    int id;                // resource id, 102..105
    const char* fileName;  // name written into the work directory
};

// The four identity profiles in resource-id order.
const std::vector<IdentityProfileInfo>& IdentityProfiles();

// The bytes of the identity profile with resource id `id` (102..105); empty for another id.
std::vector<uint8_t> BuildIdentityProfile(int id);

// The bytes of an embedded identity profile: the module's resource where the library's file
// carries them, else built here. Empty when the module is not open or the resource is missing.
std::vector<uint8_t> EmbeddedIdentityProfile(const platform::ModuleResources& module, int id);

}  // namespace vantrel
