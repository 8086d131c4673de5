#pragma once

#include <array>
#include <utility>
#include <vector>

#include "analysis/it8_kind.h"
#include "it8/measured_it8.h"

namespace vantrel {

// The device values of one patch in the channels its file's kind is compared on: CMYK 0..3,
// RGB 0..2, multi-channel 0..5 and 6 when the seventh is present; the rest 0.
using DeviceKey = std::array<double, 7>;

// Channels compared for a kind: 4, 3, 6 or 7; 0 without device columns.
int ComparedChannels(const It8Kind& kind);
// The compared device values of a patch, as they stand in the file.
DeviceKey PatchDevice(const Measured_IT8& it8, const It8Kind& kind, int patch);
// True when every compared channel of the two keys is equal (exact comparison of doubles).
bool SameDevice(const DeviceKey& p, const DeviceKey& q, int channels);

// The patches of a measurement file sorted by their device values. Find gives the same patch
// as a walk over the file that stops at the first exact match, without walking: aligning two
// charts then costs n log n instead of n^2 value reads.
class DevicePatchIndex {
public:
    DevicePatchIndex(const Measured_IT8& it8, const It8Kind& kind);
    // The first patch whose compared values equal target's, or -1.
    int Find(const DeviceKey& target) const;

private:
    int channels_ = 0;
    std::vector<std::pair<DeviceKey, int>> entries_;  // by key, then by patch
};

}  // namespace vantrel
