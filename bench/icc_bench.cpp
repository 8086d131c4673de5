// Profile reading and the companding function, each beside a peer measured in the same run:
// lcms2 opening a profile and decoding the same two tables, and the power-function cube root.
#include <benchmark/benchmark.h>
#include <lcms2.h>

#include <cmath>
#include <filesystem>
#include <string>

#include "colour/colour_math.h"
#include "icc/profil.h"

#include "bench_fixtures.h"

namespace {

using vantrel::bench::Fogra;

void LoadFograTables(benchmark::State& state) {
    const std::string path = Fogra();
    if (path.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    for (auto _ : state) {
        vantrel::CProfil p;
        p.ReadTagTable(0, path);
        p.LoadLut(0, "A2B1", path);
        p.ReadTagTable(1, path);
        p.LoadLut(1, "B2A1", path);
        benchmark::DoNotOptimize(p.m_Clut[1].data());
    }
}
BENCHMARK(LoadFograTables);

void LoadFograTablesLcms(benchmark::State& state) {
    const std::string path = Fogra();
    if (path.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    for (auto _ : state) {
        cmsHPROFILE profile = cmsOpenProfileFromFile(path.c_str(), "r");
        benchmark::DoNotOptimize(cmsReadTag(profile, cmsSigAToB1Tag));
        benchmark::DoNotOptimize(cmsReadTag(profile, cmsSigBToA1Tag));
        cmsCloseProfile(profile);
    }
}
BENCHMARK(LoadFograTablesLcms);

void CieFTable(benchmark::State& state) {
    double t = 0.01, sum = 0;
    for (auto _ : state) {
        sum += vantrel::CieF(t);
        t = t > 0.99 ? 0.01 : t + 0.000731;
    }
    benchmark::DoNotOptimize(sum);
}
BENCHMARK(CieFTable);

void CieFPower(benchmark::State& state) {
    double t = 0.01, sum = 0;
    for (auto _ : state) {
        sum += std::pow(t, 1.0 / 3.0);
        t = t > 0.99 ? 0.01 : t + 0.000731;
    }
    benchmark::DoNotOptimize(sum);
}
BENCHMARK(CieFPower);

}  // namespace
