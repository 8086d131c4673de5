// Profile evaluation on the FOGRA39 press profile: device to Lab per colour beside lcms2's
// cmsDoTransform on the same profile and intent (absolute colorimetric), timed alternately in one
// run, and the costs of the table inverse, the inverse search and the gamut record.
#include <benchmark/benchmark.h>
#include <lcms2.h>

#include <chrono>
#include <filesystem>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "eval/forward.h"
#include "eval/gamut_record.h"
#include "eval/inverse.h"
#include "icc/profil.h"

#include "bench_fixtures.h"

namespace {

constexpr int kColours = 4096;

using vantrel::bench::Fogra;

// The paper profile as the tool loads it: both directions, absolute colorimetry.
std::unique_ptr<vantrel::CProfil> LoadFogra() {
    const std::string path = Fogra();
    if (path.empty()) return nullptr;
    auto p = std::make_unique<vantrel::CProfil>();
    p->m_UseMediaWhite[0] = p->m_UseMediaWhite[1] = 1;
    p->ReadTagTable(0, path);
    if (p->LoadLut(0, "A2B1", path) != 1) return nullptr;
    p->ReadTagTable(1, path);
    if (p->LoadLut(1, "B2A1", path) != 1) return nullptr;
    return p;
}

std::vector<double> RandomCmyk() {
    std::mt19937 rng(1);
    std::uniform_real_distribution<double> value(0, 255);
    std::vector<double> v(4 * kColours);
    for (double& x : v) x = value(rng);
    return v;
}

// lcms2's transform of the same profile and intent, one colour per call as the library works.
class LcmsForward {
public:
    LcmsForward() {
        device_ = cmsOpenProfileFromFile(Fogra().c_str(), "r");
        lab_ = cmsCreateLab4Profile(nullptr);
        if (device_ && lab_)
            transform_ =
                cmsCreateTransform(device_, TYPE_CMYK_DBL, lab_, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC, 0);
    }
    ~LcmsForward() {
        if (transform_) cmsDeleteTransform(transform_);
        if (lab_) cmsCloseProfile(lab_);
        if (device_) cmsCloseProfile(device_);
    }
    bool ok() const { return transform_ != nullptr; }
    void Run(const double* cmyk, double* lab) const { cmsDoTransform(transform_, cmyk, lab, 1); }

private:
    cmsHPROFILE device_ = nullptr, lab_ = nullptr;
    cmsHTRANSFORM transform_ = nullptr;
};

// Both in one run, alternating, so that the ratio compares like with like on a shared machine.
void CmykToLabRatioToLcms(benchmark::State& state) {
    auto p = LoadFogra();
    LcmsForward lcms;
    if (!p || !lcms.ok()) return state.SkipWithError("FOGRA39L fixture not built");
    const std::vector<double> cmyk = RandomCmyk();
    std::vector<double> percent = cmyk;
    for (double& x : percent) x /= 2.55;
    using Clock = std::chrono::steady_clock;
    double ours = 0, theirs = 0;
    for (auto _ : state) {
        const auto t0 = Clock::now();
        for (int i = 0; i < kColours; ++i) {
            double v[4] = {cmyk[4 * i], cmyk[4 * i + 1], cmyk[4 * i + 2], cmyk[4 * i + 3]};
            vantrel::CmykToLab(*p, v);
            benchmark::DoNotOptimize(v[0]);
        }
        const auto t1 = Clock::now();
        for (int i = 0; i < kColours; ++i) {
            double lab[3];
            lcms.Run(&percent[4 * i], lab);
            benchmark::DoNotOptimize(lab[0]);
        }
        const auto t2 = Clock::now();
        ours += std::chrono::duration<double, std::nano>(t1 - t0).count();
        theirs += std::chrono::duration<double, std::nano>(t2 - t1).count();
    }
    const double colours = static_cast<double>(state.iterations()) * kColours;
    state.counters["ours_ns"] = ours / colours;
    state.counters["lcms2_ns"] = theirs / colours;
    state.counters["ratio"] = ours / theirs;
}
BENCHMARK(CmykToLabRatioToLcms);

std::vector<double> PressLabs(vantrel::CProfil& p) {
    const std::vector<double> cmyk = RandomCmyk();
    std::vector<double> labs(3 * kColours);
    for (int i = 0; i < kColours; ++i) {
        double v[4] = {cmyk[4 * i], cmyk[4 * i + 1], cmyk[4 * i + 2], cmyk[4 * i + 3]};
        vantrel::CmykToLab(p, v);
        for (int k = 0; k < 3; ++k) labs[3 * i + k] = v[k];
    }
    return labs;
}

void LabToCmyk(benchmark::State& state) {
    auto p = LoadFogra();
    if (!p) return state.SkipWithError("FOGRA39L fixture not built");
    const std::vector<double> labs = PressLabs(*p);
    for (auto _ : state) {
        for (int i = 0; i < kColours; ++i) {
            double v[4] = {labs[3 * i], labs[3 * i + 1], labs[3 * i + 2], 0};
            vantrel::LabToCmyk(*p, v);
            benchmark::DoNotOptimize(v[0]);
        }
    }
    state.SetItemsProcessed(state.iterations() * kColours);
}
BENCHMARK(LabToCmyk);

// From the table's answer to the device values that reproduce the colour.
void InverseSearch(benchmark::State& state) {
    auto p = LoadFogra();
    if (!p) return state.SkipWithError("FOGRA39L fixture not built");
    const std::vector<double> labs = PressLabs(*p);
    constexpr int kTargets = 256;
    std::vector<double> starts(4 * kTargets);
    for (int i = 0; i < kTargets; ++i) {
        double v[4] = {labs[3 * i], labs[3 * i + 1], labs[3 * i + 2], 0};
        vantrel::LabToCmyk(*p, v);
        for (int k = 0; k < 4; ++k) starts[4 * i + k] = v[k];
    }
    double sumDelta = 0;
    for (auto _ : state) {
        for (int i = 0; i < kTargets; ++i) {
            double result[4], delta = 0;
            vantrel::InverseSearch(*p, labs[3 * i] / 2.55, labs[3 * i + 1], labs[3 * i + 2], &starts[4 * i], result,
                                   delta);
            sumDelta += delta;
        }
    }
    state.SetItemsProcessed(state.iterations() * kTargets);
    state.counters["mean_dE"] = sumDelta / (static_cast<double>(state.iterations()) * kTargets);
}
BENCHMARK(InverseSearch);

void BuildGamutRecord(benchmark::State& state) {
    auto p = LoadFogra();
    if (!p) return state.SkipWithError("FOGRA39L fixture not built");
    for (auto _ : state) benchmark::DoNotOptimize(vantrel::BuildGamutRecord(*p).lightnessMin);
}
BENCHMARK(BuildGamutRecord)->Unit(benchmark::kMillisecond);

}  // namespace
