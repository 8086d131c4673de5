// The simulated proof loop over eight passes on the full FOGRA39L chart, with the library's
// correctors beside Argyll's refine on the same model in the same run. Counters: mean dE76 after
// passes 1, 2 and 8, the largest rise of the mean from one pass to the next, and the mean time of
// a correction step; for optimize2/optimize3 also their ratios to refine's figures.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <string>

#include "bench_fixtures.h"
#include "proof_loop.h"
#include "proofer_model.h"

namespace {

using namespace vantrel::proofloop;

constexpr int kPasses = 8;

struct Summary {
    double mean1 = 0, mean2 = 0, meanLast = 0, worstRise = 0, seconds = 0;
};

Summary Summarise(const LoopResult& result) {
    Summary s;
    const auto& p = result.passes;
    s.mean1 = p.front().mean;
    s.mean2 = p.size() > 1 ? p[1].mean : p[0].mean;
    s.meanLast = p.back().mean;
    int corrections = 0;
    for (size_t i = 0; i < p.size(); ++i) {
        if (i > 0) s.worstRise = std::max(s.worstRise, p[i].mean - p[i - 1].mean);
        if (p[i].correctionSeconds >= 0) {
            s.seconds += p[i].correctionSeconds;
            ++corrections;
        }
    }
    if (corrections) s.seconds /= corrections;
    return s;
}

void ProofLoopAgainstRefine(benchmark::State& state, Corrector corrector) {
    ArgyllTools tools = FindArgyllTools();
    if (!tools.Complete()) return state.SkipWithError(("Argyll's " + tools.Missing() + " not on PATH").c_str());
    if (vantrel::bench::Fogra().empty()) return state.SkipWithError("no FOGRA39L.icc fixture");
    LoopSettings settings;
    settings.referenceProfile = vantrel::bench::Fogra();
    ModelProfiles model = BuildModelProfiles(tools, settings.pressTi3, ProoferModel{}, 'm',
                                             std::string(VANTREL_FIXTURE_DIR) + "/proof_loop");
    if (!model.error.empty()) return state.SkipWithError(model.error.c_str());
    settings.prooferProfile = model.proofer;
    settings.todayProfile = model.today;
    settings.chartStep = 1;
    settings.passes = kPasses;
    settings.noise = 0.2;
    settings.seed = 1;
    std::string work = "/tmp/vantrel-proof-loop-bench-" + std::string(CorrectorName(corrector));

    for (auto _ : state) {
        // The library's corrector first, so that a build without its exports skips at once.
        Summary s;
        if (corrector != Corrector::Refine) {
            settings.corrector = corrector;
            settings.workDir = work + "/ours";
            LoopResult ours = RunProofLoop(settings, tools);
            if (!ours.error.empty()) return state.SkipWithError(ours.error.c_str());
            s = Summarise(ours);
        }
        settings.corrector = Corrector::Refine;
        settings.workDir = work + "/refine";
        LoopResult peer = RunProofLoop(settings, tools);
        if (!peer.error.empty()) return state.SkipWithError(peer.error.c_str());
        Summary refine = Summarise(peer);
        state.counters["refine_mean1"] = refine.mean1;
        state.counters["refine_mean2"] = refine.mean2;
        state.counters["refine_mean8"] = refine.meanLast;
        state.counters["refine_rise"] = refine.worstRise;
        state.counters["refine_s"] = refine.seconds;
        if (corrector == Corrector::Refine) continue;
        state.counters["mean2"] = s.mean2;
        state.counters["mean8"] = s.meanLast;
        state.counters["rise"] = s.worstRise;
        state.counters["seconds"] = s.seconds;
        state.counters["mean2_vs_refine"] = s.mean2 / refine.mean2;
        state.counters["seconds_vs_refine"] = s.seconds / refine.seconds;
    }
}

BENCHMARK_CAPTURE(ProofLoopAgainstRefine, refine, Corrector::Refine)->Iterations(1)->Unit(benchmark::kSecond);
BENCHMARK_CAPTURE(ProofLoopAgainstRefine, optimize2, Corrector::Optimize2)->Iterations(1)->Unit(benchmark::kSecond);
BENCHMARK_CAPTURE(ProofLoopAgainstRefine, optimize3, Corrector::Optimize3)->Iterations(1)->Unit(benchmark::kSecond);

}  // namespace
