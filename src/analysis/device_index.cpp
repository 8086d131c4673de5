#include "analysis/device_index.h"

#include <algorithm>
#include <cmath>

namespace vantrel {
namespace {

// -0 and 0 compare equal, as they do in an exact comparison; adding 0 makes them one key.
double KeyValue(double v) { return v + 0.0; }

bool HasNan(const DeviceKey& key) {
    return std::any_of(key.begin(), key.end(), [](double v) { return std::isnan(v); });
}

}  // namespace

int ComparedChannels(const It8Kind& kind) {
    switch (kind.device) {
        case It8Kind::kMultiChannel: return kind.seventhChannel ? 7 : 6;
        case It8Kind::kCmyk: return 4;
        case It8Kind::kRgb: return 3;
        case It8Kind::kNoDevice: break;
    }
    return 0;
}

DeviceKey PatchDevice(const Measured_IT8& it8, const It8Kind& kind, int patch) {
    DeviceKey key{};
    const int n = ComparedChannels(kind);
    for (int c = 0; c < n; ++c) {
        const double v = kind.device == It8Kind::kCmyk  ? it8.GetCmyk(patch, c)
                         : kind.device == It8Kind::kRgb ? it8.GetRgb(patch, c)
                                                        : it8.GetChannel(patch, c);
        key[static_cast<std::size_t>(c)] = KeyValue(v);
    }
    return key;
}

bool SameDevice(const DeviceKey& p, const DeviceKey& q, int channels) {
    for (int c = 0; c < channels; ++c)
        if (p[static_cast<std::size_t>(c)] != q[static_cast<std::size_t>(c)]) return false;
    return true;
}

DevicePatchIndex::DevicePatchIndex(const Measured_IT8& it8, const It8Kind& kind) : channels_(ComparedChannels(kind)) {
    if (channels_ == 0) return;
    const int n = it8.PatchCount();
    entries_.reserve(static_cast<std::size_t>(n));
    for (int i = 0; i < n; ++i) {
        DeviceKey key = PatchDevice(it8, kind, i);
        // A value that is not a number equals nothing, so its patch can never be found.
        if (!HasNan(key)) entries_.emplace_back(key, i);
    }
    std::sort(entries_.begin(), entries_.end());
}

int DevicePatchIndex::Find(const DeviceKey& target) const {
    if (channels_ == 0 || HasNan(target)) return -1;
    DeviceKey key{};
    for (std::size_t c = 0; c < static_cast<std::size_t>(channels_); ++c) key[c] = KeyValue(target[c]);
    const auto first = std::lower_bound(entries_.begin(), entries_.end(), std::make_pair(key, -1));
    if (first == entries_.end() || first->first != key) return -1;
    return first->second;
}

}  // namespace vantrel
