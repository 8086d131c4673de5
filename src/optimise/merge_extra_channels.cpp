#include "optimise/merge_extra_channels.h"

#include <algorithm>

namespace vantrel {

void MergeExtraChannels(double* x) {
    // Equal parts of all three extras print as a neutral: black takes them while it can.
    double common = std::min({x[4], x[5], x[6]});
    if (common > 0.0) {
        if (x[3] + common > 255.0) common = 255.0 - x[3];
        x[3] += common;
        x[4] -= common;
        x[5] -= common;
        x[6] -= common;
    }
    auto held = [](double v) { return std::clamp(v, 0.0, 255.0); };
    x[0] = held(x[0] + x[5] + x[6]);
    x[1] = held(x[1] + x[4] + x[6]);
    x[2] = held(x[2] + x[4] + x[5]);
    x[3] = held(x[3]);
}

}  // namespace vantrel
