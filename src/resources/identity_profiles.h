#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace vantrel {

struct IdentityProfileInfo {
    int id;                // resource id, 102..105
    const char* fileName;  // name written into the work directory
};

// The four identity profiles in resource-id order.
const std::vector<IdentityProfileInfo>& IdentityProfiles();

// The bytes of the identity profile with resource id `id` (102..105); empty for another id.
std::vector<uint8_t> BuildIdentityProfile(int id);

}  // namespace vantrel
