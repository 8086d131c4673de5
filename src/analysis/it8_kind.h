#pragma once

#include "it8/measured_it8.h"

namespace vantrel {

// What a measurement file carries, as the scans and analyses decide it from its second patch.
struct It8Kind {
    enum Device { kNoDevice, kMultiChannel, kCmyk, kRgb };
    Device device = kNoDevice;
    bool seventhChannel = false;  // multi-channel files: channel 7 present
    bool colourFromXyz = false;   // no Lab columns: colours come from XYZ
};

// The patch the measurement scans and the ISD analysis probe: the second one. The merged
// analysis and the measurement-driven optimisations probe the first (patch 0).
constexpr int kScanProbePatch = 1;

// Decides the kind from `patch`. A file too short for it is probed past its end, where the
// accessors answer -1 rather than the missing-column marker: it counts as seven-channel with
// Lab colours.
It8Kind ProbeIt8Kind(const Measured_IT8& it8, int patch);

// True when `patch` has no Lab: colours then come from the XYZ columns.
bool It8ColourFromXyz(const Measured_IT8& it8, int patch);

}  // namespace vantrel
