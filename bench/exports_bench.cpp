// The exports as a host calls them: Cmyk2Lab_Double on 100 000 records beside lcms2 converting
// the same values with the same profile, and analyse1 for one-, two- and four-ink targets.
#include <benchmark/benchmark.h>
#include <lcms2.h>

#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "vantrel.h"

#include "bench_fixtures.h"

namespace {

constexpr int kRecords = 100000;

using vantrel::bench::Fogra;

int Quiet(const char*, int, int) { return 0; }

std::vector<int> RandomCmykPercent() {
    std::mt19937 random(1);
    std::uniform_int_distribution<int> percent(0, 100);
    std::vector<int> cmyk(4 * kRecords);
    for (int& v : cmyk) v = percent(random);
    return cmyk;
}

void Cmyk2LabDouble100k(benchmark::State& state) {
    const std::string path = Fogra();
    if (path.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    const std::vector<int> cmyk = RandomCmykPercent();
    std::vector<int> lab(3 * kRecords), xyz(3 * kRecords);
    void* tool = nullptr;
    dllInit(Quiet, &tool, nullptr);
    for (auto _ : state) {
        Cmyk2Lab_Double(tool, path.c_str(), kRecords, cmyk.data(), 0, lab.data(), 0, xyz.data());
        benchmark::DoNotOptimize(lab.data());
    }
    dllFree(tool);
    state.SetItemsProcessed(state.iterations() * kRecords);
}
BENCHMARK(Cmyk2LabDouble100k)->Unit(benchmark::kMillisecond);

// The peer: open the profile, convert the same values to Lab and XYZ in absolute colorimetric
// intent, close it, as a host would do it with lcms2.
void Cmyk2LabDouble100kLcms(benchmark::State& state) {
    const std::string path = Fogra();
    if (path.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    const std::vector<int> percent = RandomCmykPercent();
    std::vector<double> cmyk(percent.begin(), percent.end());
    std::vector<double> lab(3 * kRecords), xyz(3 * kRecords);
    for (auto _ : state) {
        cmsHPROFILE in = cmsOpenProfileFromFile(path.c_str(), "r");
        cmsHPROFILE labProfile = cmsCreateLab4Profile(nullptr);
        cmsHPROFILE xyzProfile = cmsCreateXYZProfile();
        cmsHTRANSFORM toLab = cmsCreateTransform(in, TYPE_CMYK_DBL, labProfile, TYPE_Lab_DBL,
                                                 INTENT_ABSOLUTE_COLORIMETRIC, 0);
        cmsHTRANSFORM toXyz = cmsCreateTransform(in, TYPE_CMYK_DBL, xyzProfile, TYPE_XYZ_DBL,
                                                 INTENT_ABSOLUTE_COLORIMETRIC, 0);
        cmsDoTransform(toLab, cmyk.data(), lab.data(), kRecords);
        cmsDoTransform(toXyz, cmyk.data(), xyz.data(), kRecords);
        benchmark::DoNotOptimize(lab.data());
        cmsDeleteTransform(toLab);
        cmsDeleteTransform(toXyz);
        cmsCloseProfile(xyzProfile);
        cmsCloseProfile(labProfile);
        cmsCloseProfile(in);
    }
    state.SetItemsProcessed(state.iterations() * kRecords);
}
BENCHMARK(Cmyk2LabDouble100kLcms)->Unit(benchmark::kMillisecond);

// analyse1 for a colour printed with the given inks (percent), from a 10 % start.
void Analyse1(benchmark::State& state, std::vector<int> inks) {
    const std::string path = Fogra();
    if (path.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    void* tool = nullptr;
    dllInit(Quiet, &tool, nullptr);
    int lab[3], xyz[3];
    Cmyk2Lab_Double(tool, path.c_str(), 1, inks.data(), 0, lab, 0, xyz);
    for (auto _ : state) {
        int values[7] = {25500, 25500, 25500, 25500, 0, 0, 0};
        analyse1(tool, path.c_str(), lab, values);
        benchmark::DoNotOptimize(values);
    }
    dllFree(tool);
}
BENCHMARK_CAPTURE(Analyse1, OneInk, std::vector<int>{0, 70, 0, 0})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Analyse1, TwoInks, std::vector<int>{60, 0, 80, 0})->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(Analyse1, FourInks, std::vector<int>{40, 30, 30, 20})->Unit(benchmark::kMillisecond);

}  // namespace
