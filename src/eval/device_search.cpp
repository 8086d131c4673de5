#include "eval/device_search.h"

#include "colour/colour_math.h"
#include "eval/forward.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr int kChannels = 7;
constexpr int kBlack = 3;
constexpr double kDarkLightness = 35.0;

// Chromatic colourant pairs that must not print together without black, as bit sums (channel
// 0 = 1, 1 = 2, 2 = 4, 4 = 16, 5 = 32, 6 = 64), and the only chromatic triples allowed.
constexpr int kRefusedPairs[] = {17, 34, 48, 68, 80, 96};
constexpr int kAllowedTriples[] = {22, 52, 67, 82, 97};

bool Contains(const int* list, int count, int value) {
    for (int k = 0; k < count; ++k)
        if (list[k] == value) return true;
    return false;
}

// The forward evaluation of the searches: the direction-0 table, by its input count.
class Forward {
public:
    Forward(CProfil& p, int channels) : p_(p), channels_(channels) {}

    Lab operator()(const double* device, int count) {
        double v[CProfil::kEvalSize] = {};
        for (int k = 0; k < count; ++k) v[k] = device[k];
        DeviceToLab(p_, v, channels_);
        return Lab{v[0] / kLightnessScale, v[1], v[2]};
    }

private:
    CProfil& p_;
    int channels_;
};

double Distance(const Lab& x, const double* t) { return DeltaE(x.L, x.a, x.b, t[0], t[1], t[2]); }
double Distance(const Lab& x, const Lab& y) { return DeltaE(x.L, x.a, x.b, y.L, y.a, y.b); }

// The acceptance rule shared by the grid search and the descent.
struct Acceptance {
    const double* target;
    Lab start;           // colour of the start vector
    double startRadius;  // the answer stays closer than this to the start colour
    Lab reference;       // colour of the last accepted candidate
    bool dark;
    bool lightnessRule;
    double best;

    bool Accept(const Lab& v, double delta, bool darkExempt = true) {
        if (!(delta < best)) return false;
        if (lightnessRule && !(dark && darkExempt)) {
            const bool lighterThanTarget = v.L >= target[0];
            const bool followsReference = v.L >= reference.L && target[0] >= reference.L;
            if (!lighterThanTarget && !followsReference) return false;
        }
        if (!(Distance(v, start) < startRadius)) return false;
        best = delta;
        reference = v;
        return true;
    }
};

int InputChannels(const CProfil& p) { return p.m_Lut[0].inputChannels; }

// The nested lattice of the grid search, one level per channel.
class GridWalk {
public:
    GridWalk(Forward& forward, Acceptance& rule, const double* flagsHigh, const double* lows, int levels, int limit,
             bool pairRules, double step, double* best)
        : forward_(forward), rule_(rule), highs_(flagsHigh), lows_(lows), levels_(levels), limit_(limit),
          pairRules_(pairRules), step_(step), best_(best) {}

    void Walk(int level, int inUse) {
        if (level == levels_) {
            Visit();
            return;
        }
        const int c = level;
        for (double x = lows_[c]; x <= highs_[c]; x += step_) {
            v_[c] = x;
            const int used = inUse + (x > 0.0 ? 1 : 0);
            if (used > limit_) break;  // every later value of this channel is in use too
            Walk(level + 1, used);
        }
        v_[c] = 0.0;
    }

private:
    static constexpr int kBit[kChannels] = {1, 2, 4, 0, 16, 32, 64};

    bool SeparationAllowed() const {
        int count = 0, bits = 0;
        for (int c = 0; c < kChannels; ++c) {
            if (v_[c] > 0.0) {
                ++count;
                bits += kBit[c];
            }
        }
        const bool black = v_[kBlack] > 0.0;
        if (count == 2 && !black) return !Contains(kRefusedPairs, 6, bits);
        if (count == 3) return black ? !Contains(kRefusedPairs, 6, bits) : Contains(kAllowedTriples, 5, bits);
        return true;
    }

    void Visit() {
        if (pairRules_ && !SeparationAllowed()) return;
        const Lab lab = forward_(v_, kChannels);
        if (rule_.Accept(lab, Distance(lab, rule_.target))) {
            for (int c = 0; c < kChannels; ++c) best_[c] = v_[c];
        }
    }

    Forward& forward_;
    Acceptance& rule_;
    const double* highs_;
    const double* lows_;
    int levels_;
    int limit_;
    bool pairRules_;
    double step_;
    double* best_;
    double v_[kChannels] = {};
};

}  // namespace

void ConstrainedGridSearch(CProfil& p, const GridSearchRequest& r, double& bestDelta, double* best) {
    const double* target = r.target;
    const double* start = r.start;
    const int* flags = r.flags;
    const int inputs = InputChannels(p);
    Forward forward(p, inputs);
    const Lab s = forward(start, kChannels);
    Acceptance rule{target, s, bestDelta, s, s.L < kDarkLightness, r.lightnessRule, bestDelta};
    for (int c = 0; c < kChannels; ++c) best[c] = start[c];

    if (r.step > 0.0) {
        const bool multi = inputs >= 5;
        double lows[kChannels] = {0, 0, 0, r.blackLow, 0, 0, 0};
        double highs[kChannels];
        for (int c = 0; c < kChannels; ++c) highs[c] = flags[c] ? 255.0 : 0.0;
        highs[kBlack] = (flags[kBlack] ? 1.0 : 0.0) * r.blackHigh;
        GridWalk walk(forward, rule, highs, lows, multi ? kChannels : 4, r.limit, multi, r.step, best);
        walk.Walk(0, 0);
    }
    bestDelta = Distance(rule.reference, target);
}

namespace {

// One block of the descent: channel c walks in one direction while the bound allows, each step
// kept when accepted; the first failure is undone and ends the block.
struct Descent {
    Forward& forward;
    Acceptance& rule;
    double* v;
    const int* flags;
    int limit;

    int InUse() const {
        int count = 0;
        for (int c = 0; c < kChannels; ++c) count += v[c] > 0.0;
        return count;
    }

    // Channel c walks by `step` while it lies below `bound` (upwards) or above it (downwards); an
    // upward step that brings one channel too many into use fails like a refused one.
    void Walk(int c, double step, double bound, bool darkExempt = true) {
        while (flags[c] && (step > 0.0 ? v[c] < bound : v[c] > bound)) {
            const double keep = v[c];
            v[c] = keep + step;
            if ((step > 0.0 && InUse() > limit) || !Try(darkExempt)) {
                v[c] = keep;
                return;
            }
        }
    }

    bool Try(bool darkExempt = true) {
        const Lab lab = forward(v, kChannels);
        return rule.Accept(lab, Distance(lab, rule.target), darkExempt);
    }
};

}  // namespace

void ConstrainedDescent(CProfil& p, const double* target, const double* start, double& deltaE, int limit,
                        const int* flags, bool lightnessRule, double* best) {
    const int inputs = InputChannels(p);
    const bool multi = inputs > 4;
    Forward forward(p, inputs);
    const Lab s = forward(start, kChannels);
    const double startDelta = Distance(s, target);
    Acceptance rule{target, s, startDelta, s, s.L < kDarkLightness, lightnessRule, startDelta};
    for (int c = 0; c < kChannels; ++c) best[c] = start[c];
    Descent d{forward, rule, best, flags, limit};

    // Channels 0..2, then 4..6 where the profile has them, in the order the blocks take them.
    const int chromatic[6] = {0, 1, 2, 4, 5, 6};
    const int count = multi ? 6 : 3;
    for (const DescentPhase& ph : kDescentPhases) {
        // In the first phase the lightness rule holds for dark starts too while black comes down.
        const bool darkExempt = &ph != &kDescentPhases[0];
        RepeatRounds(ph, rule.best, [&] {
            d.Walk(kBlack, -ph.step, ph.low, darkExempt);
            for (int k = 0; k < count; ++k) d.Walk(chromatic[k], ph.step, ph.high);
            d.Walk(kBlack, ph.step, ph.high);
            for (int k = 0; k < count; ++k) d.Walk(chromatic[k], -ph.step, ph.low);
        });
    }
    deltaE = Distance(rule.reference, target);
}

void RangedDescent(CProfil& p, const double* target, const double* start, double low, double high, double& deltaE,
                   const int* flags, double* best) {
    const int inputs = InputChannels(p);
    Forward forward(p, inputs);
    for (int c = 0; c < 4; ++c) best[c] = start[c];
    double bestDelta = Distance(forward(best, 4), target);

    auto tryStep = [&](int c, double step) {
        const double keep = best[c];
        best[c] = keep + step;
        const double e = Distance(forward(best, 4), target);
        if (e < bestDelta) {
            bestDelta = e;
        } else {
            best[c] = keep;
        }
    };
    auto movable = [&](int c) { return flags[c] && best[c] > low && best[c] < high; };

    for (const DescentPhase& ph : kDescentPhases) {
        RepeatRounds(ph, bestDelta, [&] {
            for (int c = 0; c < 4; ++c)
                if (movable(c) && best[c] < ph.high) tryStep(c, ph.step);
            for (int c = 0; c < 4; ++c)
                if (movable(c) && best[c] > ph.low) tryStep(c, -ph.step);
        });
    }
    deltaE = bestDelta;
}

double ScanChannel(CProfil& p, const double* target, const double* values, int c, double low, double high) {
    // Black is scanned through the four-channel evaluation, the others through the profile's own.
    const int channels = c == kBlack ? 4 : p.m_Lut[1].outputChannels;
    Forward forward(p, channels);
    double v[4] = {values[0], values[1], values[2], values[3]};
    double best = Distance(forward(v, 4), target);
    double bestValue = values[c];
    const double first = c == kBlack ? low : 0.0;
    const double last = c == kBlack ? high : 255.0;
    for (int k = 0;; ++k) {
        const double x = first + 3.0 * k;
        if (x > last) break;
        v[c] = x;
        const double e = Distance(forward(v, 4), target);
        if (e <= best) {
            best = e;
            bestValue = x;
        }
    }
    return bestValue;
}

void RangedSearch(CProfil& p, const double* target, const double* start, double low, double high, double& deltaE,
                  double* best) {
    static const int kAllFlags[4] = {1, 1, 1, 1};
    double probe[CProfil::kEvalSize] = {start[0], start[1], start[2], start[3]};
    CmykToLab(p, probe);
    double bestDelta = DeltaE(probe[0] / kLightnessScale, probe[1], probe[2], target[0], target[1], target[2]);
    // `from` is where the next descent starts (after the scans); `best` is the descent answer
    // that goes with bestDelta, so that the error handed back is the error of the answer.
    double from[4] = {start[0], start[1], start[2], start[3]};
    for (int c = 0; c < 4; ++c) best[c] = start[c];
    while (bestDelta > 0.2) {
        double w[4];
        double found = 0.0;
        RangedDescent(p, target, from, low, high, found, kAllFlags, w);
        double next[4] = {w[0], w[1], w[2], w[3]};
        if (found > 1.5) {
            for (int c = 0; c < 3; ++c) next[c] = ScanChannel(p, target, next, c, low, high);
            if (high > low) next[kBlack] = ScanChannel(p, target, next, kBlack, low, high);
        }
        if (!(found < bestDelta)) break;
        bestDelta = found;
        for (int c = 0; c < 4; ++c) {
            best[c] = w[c];
            from[c] = next[c];
        }
    }
    deltaE = bestDelta;
}

}  // namespace vantrel
