#include "optimise/sample_weight.h"

namespace vantrel {
namespace {

constexpr int kPaperWeight = 100;
constexpr int kSolidWeight = 75;
constexpr int kTintWeight = 25;
constexpr int kMixtureWeight = 1;

}  // namespace

int SampleWeight(const double percent[7], const int minimumTone[7]) {
    double total = 0.0;
    for (int c = 0; c < 7; ++c) total += percent[c];
    if (total == 0.0) return kPaperWeight;

    int anyMinimum = 0;
    for (int c = 0; c < 7; ++c) anyMinimum |= minimumTone[c];
    if (anyMinimum > 0) {
        // Tints lighter than the press can hold carry no information.
        for (int c = 0; c < 7; ++c)
            if (minimumTone[c] > percent[c] && percent[c] > 0.0) return 0;
    }

    int inked = 0;
    int only = 0;
    for (int c = 0; c < 7; ++c) {
        if (percent[c] != 0.0) {
            ++inked;
            only = c;
        }
    }
    if (inked == 1) return percent[only] == 100.0 ? kSolidWeight : kTintWeight;
    return kMixtureWeight;
}

}  // namespace vantrel
