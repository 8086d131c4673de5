#pragma once
// The simulated proof loop: RIP the chart from the press reference R through the proofer profile
// P, print it on today's proofer T, measure, correct, and again.

#include <functional>
#include <string>
#include <vector>

#include "argyll_tools.h"
#include "correction_step.h"

namespace vantrel::proofloop {

struct LoopSettings {
    std::string pressTi3 = "/usr/share/color/icc/FOGRA39L.ti3";  // the chart's device values
    std::string referenceProfile;                                // R
    std::string prooferProfile;                                  // P
    std::string todayProfile;                                    // T
    std::string workDir;                                         // created if missing
    size_t chartStep = 8;       // every step-th patch of the press chart (and its paper patch); 1: all
    int passes = 2;
    double noise = 0.0;         // measurement noise, standard deviation per L*, a*, b*
    unsigned seed = 1;
    Corrector corrector = Corrector::Refine;
    int optimizeOption = 0;
};

struct PassFigures {
    int pass = 0;
    double mean = 0, p95 = 0, maximum = 0;  // dE76 of proof against reference
    double paper = 0;                       // dE76 of the paper patches
    double correctionSeconds = -1;          // -1: no correction after this pass
};

struct LoopResult {
    std::vector<PassFigures> passes;
    std::string error;  // empty when every pass ran
};

// Runs the loop; passes that ran before an error stay in the result. onPass, when given, sees
// each pass as it completes.
LoopResult RunProofLoop(const LoopSettings& settings, const ArgyllTools& tools,
                        const std::function<void(const PassFigures&)>& onPass = {});

// The per-pass table, one title line and one row per pass.
std::string FormatHeader(const std::string& title);
std::string FormatRow(const PassFigures& figures);

}  // namespace vantrel::proofloop
