#pragma once
// The simulated proofer: how it differs from the press (P) and how it drifted since it was
// profiled (T). Both are the press characterisation data with device and colour transforms on
// top, profiled with colprof and cached under names that carry the settings.

#include <string>

#include "argyll_tools.h"
#include "chart.h"

namespace vantrel::proofloop {

// Every figure of the model in one place. Gammas act on device values 0..1: the proofer prints
// at d^gamma what the press prints at d, so a gamma below one moves the mid-tones by
// 0.5 - 0.5^gamma (0.94: two percent, 0.90: three and a half).
struct ProoferModel {
    // Proofer against press.
    double midtoneGamma[4] = {0.94, 0.90, 0.96, 0.92};  // C, M, Y, K
    double blackDepth = 3.5;                            // L* lower at the darkest patch, fading with (1 - L/Lw)^2
    double chromaGain = 1.06;                           // a*, b* scale: a larger gamut
    double paperShift[3] = {0.8, 0.6, -2.0};            // Lab added at paper white, fading with (L/Lw)^3

    // Today's drift of the proofer.
    int gainChannel = 1;                        // magenta
    double gainGamma = 0.93;                    // the channel prints at d^gamma what it printed at d
    double midtoneCast[3] = {0.0, 1.2, 1.0};    // Lab, weighted 4u(1-u), u = L/100
    double paperDrift[3] = {0.3, -0.4, 0.5};    // Lab at paper white (0.71 dE), fading as paperShift

    // A text holding every figure, for cache names.
    std::string Key() const;
};

// The press data turned into the proofer's (P) and today's proofer's (T) characterisation data.
Chart ProoferData(const Chart& press, const ProoferModel& model);
Chart DriftedData(const Chart& proofer, const ProoferModel& model);

struct ModelProfiles {
    std::string proofer;  // P: what the loop believes the proofer prints
    std::string today;    // T: what it prints
    std::string error;    // empty on success
};

// Builds (or finds in cacheDir) colprof profiles of P and T from the press characterisation file,
// with colprof's quality letter ('l', 'm', 'h').
ModelProfiles BuildModelProfiles(const ArgyllTools& tools, const std::string& pressTi3, const ProoferModel& model,
                                 char quality, const std::string& cacheDir);

}  // namespace vantrel::proofloop
