// How well one measurement agrees with itself: the colour differences between patches printed
// with the same device values.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <unordered_map>
#include <vector>

#include "analysis/device_index.h"
#include "analysis/it8_kind.h"
#include "colour/colour_math.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {

// A group compares each new member with at most this many earlier ones.
constexpr int kGroupMembers = 31;
constexpr double kNoDifference = 0.02;

// Seven whole-number device values, one byte each, then a zero byte. Two patches repeat each
// other when their signatures agree. Values far outside a byte's range are held first, so that
// the conversion to an integer stays defined.
uint64_t Signature(const double* rounded) {
    uint8_t bytes[8] = {};
    for (int c = 0; c < 7; ++c) {
        const double v = std::clamp(rounded[c], -1.0e6, 1.0e6);
        bytes[c] = static_cast<uint8_t>(static_cast<int32_t>(v));
    }
    uint64_t signature = 0;
    std::memcpy(&signature, bytes, sizeof signature);
    return signature;
}

}  // namespace

AnalysisFigures CIterativtoolDlg::RepeatabilityAnalysis(const Measured_IT8& it8) const {
    AnalysisFigures figures;
    const int n = it8.PatchCount();
    if (n < 1) return figures;
    const It8Kind kind = ProbeIt8Kind(it8, kScanProbePatch);
    const int channels = ComparedChannels(kind);
    if (channels == 0) return figures;

    // The patches of one signature in file order: the first of them opens the group, the others
    // join it one after the other.
    std::vector<Lab> labs(static_cast<std::size_t>(n));
    std::unordered_map<uint64_t, std::vector<int>> groups;
    for (int i = 0; i < n; ++i) {
        const DeviceKey device = PatchDevice(it8, kind, i);
        double rounded[7] = {0, 0, 0, 0, 0, 0, 0};
        for (int c = 0; c < channels; ++c) rounded[c] = std::trunc(device[static_cast<std::size_t>(c)] + 0.5);
        labs[static_cast<std::size_t>(i)] = PatchLab(it8, i, kind.colourFromXyz);
        groups[Signature(rounded)].push_back(i);
    }

    // Each new member of a group is compared with every earlier member (up to 31 of them); the
    // 32nd and later members take the last place in turn. Groups are taken in the order of
    // their first patch, so that the sum adds up as a walk over the file would.
    std::vector<const std::vector<int>*> ordered(static_cast<std::size_t>(n), nullptr);
    for (const auto& group : groups) ordered[static_cast<std::size_t>(group.second.front())] = &group.second;
    double sum = 0;
    double maximum = 0;
    long pairs = 0;
    Lab members[kGroupMembers + 1];
    for (const std::vector<int>* group : ordered) {
        if (!group || group->size() < 2) continue;
        members[0] = labs[static_cast<std::size_t>(group->front())];
        int k = 0;
        for (std::size_t g = 1; g < group->size(); ++g) {
            const Lab& lab = labs[static_cast<std::size_t>((*group)[g])];
            k = std::min(k + 1, kGroupMembers);
            for (int m = 1; m <= k; ++m) {
                const double d = DeltaE(members[m - 1], lab);
                sum += d;
                maximum = std::max(maximum, d);
                ++pairs;
            }
            members[k] = lab;
        }
    }
    if (sum >= kNoDifference && pairs > 0) {
        figures.mean = sum / static_cast<double>(pairs);
        figures.maximum = maximum;
    }
    figures.differences = true;
    return figures;
}

}  // namespace vantrel
