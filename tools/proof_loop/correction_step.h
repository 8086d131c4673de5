#pragma once
// The correction step of a proof loop pass: from the reference and proof measurements to a new
// RIP set-up. Argyll's refine is the peer; optimize2 and optimize3 are the library's exports.

#include <functional>
#include <string>

#include "argyll_tools.h"

namespace vantrel::proofloop {

enum class Corrector { None, Refine, Optimize2, Optimize3 };

const char* CorrectorName(Corrector corrector);
// "none", "refine", "optimize2", "optimize3"; false for anything else.
bool ParseCorrector(const std::string& name, Corrector* corrector);

// What the RIP applies: reference Lab, then an optional Lab correction, then the proofer
// profile's B2A1 (absolute colorimetric).
struct RipSetup {
    std::string prooferProfile;
    std::string labCorrection;        // empty: none
    bool labCorrectionIs3cc = false;  // a 3CC goes through its B2A table, an abstract profile forward
};

struct PassFiles {
    int pass = 0;                  // 1-based
    std::string workDir;           // this loop's scratch directory
    std::string referenceProfile;  // R
    std::string referenceIt8;      // R's Lab at the chart's device values
    std::string proofIt8;          // what this pass measured
};

// Updates the RIP from a pass's measurement; answers an empty text or what went wrong.
using CorrectionStep = std::function<std::string(const PassFiles&, RipSetup&)>;

// The step for a corrector. optimizeOption is the option argument of optimize2 and optimize3.
CorrectionStep MakeCorrectionStep(Corrector corrector, const ArgyllTools& tools, int optimizeOption);

// The RIP before the first correction: the proofer profile alone, and for optimize3 the
// library's neutral 3CC (written by dllInit into workDir). Answers an error text or empty.
std::string InitialRip(Corrector corrector, const std::string& prooferProfile, const std::string& workDir,
                       RipSetup* rip);

}  // namespace vantrel::proofloop
