#include "analysis/analyse1_search.h"

#include <algorithm>

#include "colour/colour_math.h"
#include "eval/device_search.h"
#include "eval/forward.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr int kChannels = 7;

double ErrorOf(CProfil& profile, const double* target, const double* device) {
    double values[CProfil::kEvalSize] = {};
    std::copy(device, device + kChannels, values);
    if (profile.m_Lut[0].inputChannels < 5)
        CmykToLab(profile, values);
    else
        MultiToLab(profile, values);
    return DeltaE(values[0] / kLightnessScale, values[1], values[2], target[0], target[1], target[2]);
}

void ZeroBelowOne(double* device) {
    for (int c = 0; c < kChannels; ++c)
        if (device[c] < 1) device[c] = 0;
}

int InksInUse(const double* device) {
    return static_cast<int>(std::count_if(device, device + kChannels, [](double v) { return v > 0; }));
}

// The grid step of each pass: fine while few inks may print, coarse when all four may.
double StepOfPass(int pass) {
    switch (pass) {
        case 1: return 1;
        case 2: return 2;
        case 3: return 5;
        default: return (pass - 3) * 10;
    }
}

void Copy(const double* from, double* to) { std::copy(from, from + kChannels, to); }

// After a search from `cur` that reached `best` with `found`: the better of the two becomes both
// the candidate and the current values, its error both `err` and `best`.
void KeepBetter(const double* found, double* cand, double* cur, double& err, double& best) {
    if (err <= best) {
        best = err;
        Copy(cur, cand);
    } else {
        err = best;
        Copy(found, cand);
        Copy(found, cur);
    }
}

}  // namespace

void Analyse1Search(CProfil& profile, const double* target, const double* start, double& deltaE,
                    bool lightnessRule, double* result) {
    double cur[kChannels];
    Copy(start, cur);
    ZeroBelowOne(cur);
    double err = ErrorOf(profile, target, cur);

    for (int pass = 1; pass <= 4; ++pass) {
        int free[kChannels];
        std::fill(free, free + kChannels, 1);
        double best = err;
        double cand[kChannels];
        double found[kChannels];
        Copy(cur, cand);
        int n = InksInUse(cand);
        if (n == 0) break;
        if (pass * 0.15 < best || pass < n) {
            GridSearchRequest request;
            request.target = target;
            request.start = cand;
            request.step = StepOfPass(pass);
            request.limit = pass;  // pass p lets p inks print together
            request.flags = free;
            request.lightnessRule = lightnessRule;
            ConstrainedGridSearch(profile, request, best, found);
            KeepBetter(found, cand, cur, err, best);
            if (pass * 0.2 < best) {
                n = 0;
                for (int c = 0; c < kChannels; ++c) {
                    free[c] = cand[c] > 0 ? 1 : 0;
                    n += free[c];
                }
                if (n <= pass) {
                    ConstrainedDescent(profile, target, cand, best, pass, free, lightnessRule, found);
                    KeepBetter(found, cand, cur, err, best);
                }
            }
        }
        ZeroBelowOne(cur);
    }
    deltaE = err;
    Copy(cur, result);
}

}  // namespace vantrel
