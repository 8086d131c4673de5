// mergeMCHintoCMYK folding a seven-colourant separation into the FOGRA39L profile, as a host
// calls it. No peer does this job; the time and peak memory are printed beside their targets
// (under 2 s, under 200 MB).
#include <benchmark/benchmark.h>
#include <sys/resource.h>

#include <string>

#include "bench_fixtures.h"
#include "helpers/multi_ink_profiles.h"
#include "vantrel.h"

namespace {

int Quiet(const char*, int, int) { return 0; }

double PeakRssMb() {
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss / 1024.0;
}

void MergeSevenInksIntoFogra39(benchmark::State& state) {
    const std::string fogra = vantrel::bench::Fogra();
    if (fogra.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    const std::string& reference = vantrel::test::MultiInkProfile(vantrel::test::InkSet::kCmykRGB);
    vantrel::test::TempDir dir;
    const std::string out = dir.File("merged.icc");
    for (auto _ : state) {
        void* tool = nullptr;
        dllInit(Quiet, &tool, nullptr);
        if (mergeMCHintoCMYK(tool, reference.c_str(), fogra.c_str(), out.c_str()) != 0) state.SkipWithError("merge failed");
        dllFree(tool);
    }
    state.counters["peak_RSS_MB"] = PeakRssMb();
    state.counters["target_s"] = 2.0;
}
BENCHMARK(MergeSevenInksIntoFogra39)->Unit(benchmark::kMillisecond)->Iterations(3);

}  // namespace
