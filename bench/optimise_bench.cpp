// optimize1 beside the profile maker it improves on: Argyll's colprof building the same FOGRA39
// profile in the same run, where the time of optimize1 goes, and (run on its own, it takes
// minutes) the round-trip error of a quick colprof profile after optimize1 next to colprof's
// slower qualities.
//   vantrel_bench --benchmark_filter=Optimize1
#include <benchmark/benchmark.h>
#include <sys/resource.h>
#include <sys/time.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "helpers/test_paths.h"
#include "helpers/xicclu.h"
#include "interface/tool_object.h"
#include "vantrel.h"

namespace {

using Clock = std::chrono::steady_clock;
using vantrel::test::TempDir;

const std::string kChart = "/usr/share/color/icc/FOGRA39L.ti3";

int Quiet(const char*, int, int) { return 0; }

double Seconds(Clock::time_point from) { return std::chrono::duration<double>(Clock::now() - from).count(); }

double CpuSeconds(int who) {
    rusage u{};
    getrusage(who, &u);
    return u.ru_utime.tv_sec + u.ru_stime.tv_sec + 1e-6 * (u.ru_utime.tv_usec + u.ru_stime.tv_usec);
}

double PeakRssMb(int who) {
    rusage u{};
    getrusage(who, &u);
    return u.ru_maxrss / 1024.0;
}

// Builds dir/FOGRA39L.icc with colprof at quality q ('l', 'm', 'h'); its wall and CPU seconds.
bool Colprof(const TempDir& dir, char q, double& wall, double& cpu) {
    std::filesystem::copy_file(kChart, dir.File("FOGRA39L.ti3"), std::filesystem::copy_options::overwrite_existing);
    const std::string command = "cd '" + dir.Path() + "' && colprof -q" + q + " -D bench FOGRA39L >/dev/null 2>&1";
    const double cpu0 = CpuSeconds(RUSAGE_CHILDREN);
    const auto t0 = Clock::now();
    const bool ok = std::system(command.c_str()) == 0;
    wall = Seconds(t0);
    cpu = CpuSeconds(RUSAGE_CHILDREN) - cpu0;
    return ok && std::filesystem::exists(dir.File("FOGRA39L.icc"));
}

// optimize1 on a fresh handle; its wall and CPU seconds and the returned mean.
bool Optimize1(const std::string& path, double& wall, double& cpu, double& mean) {
    void* tool = nullptr;
    dllInit(Quiet, &tool, nullptr);
    int out1 = 0, out2 = 0;
    const double cpu0 = CpuSeconds(RUSAGE_SELF);
    const auto t0 = Clock::now();
    const int rc = optimize1(tool, path.c_str(), &out1, &out2);
    wall = Seconds(t0);
    cpu = CpuSeconds(RUSAGE_SELF) - cpu0;
    dllFree(tool);
    mean = out1 / 1000.0;
    return rc == 0;
}

// colprof -qm builds the profile, optimize1 improves it: both times from one run, as a ratio.
void Optimize1RatioToColprof(benchmark::State& state) {
    if (std::system("command -v colprof >/dev/null 2>&1") != 0 || !std::filesystem::exists(kChart))
        return state.SkipWithError("colprof or FOGRA39L.ti3 missing");
    double colprofCpu = 0, oursCpu = 0, colprofWall = 0, oursWall = 0, mean = 0;
    for (auto _ : state) {
        TempDir dir;
        double wall = 0, cpu = 0;
        if (!Colprof(dir, 'm', wall, cpu)) return state.SkipWithError("colprof failed");
        colprofWall += wall;
        colprofCpu += cpu;
        if (!Optimize1(dir.File("FOGRA39L.icc"), wall, cpu, mean)) return state.SkipWithError("optimize1 failed");
        oursWall += wall;
        oursCpu += cpu;
    }
    const double n = static_cast<double>(state.iterations());
    state.counters["optimize1_s"] = oursCpu / n;
    state.counters["colprof_s"] = colprofCpu / n;
    state.counters["ratio_cpu"] = oursCpu / colprofCpu;
    state.counters["ratio_wall"] = oursWall / colprofWall;
    state.counters["peak_rss_MB"] = PeakRssMb(RUSAGE_SELF);
    state.counters["colprof_rss_MB"] = PeakRssMb(RUSAGE_CHILDREN);
    state.counters["mean_dE"] = mean;
}
BENCHMARK(Optimize1RatioToColprof)->Iterations(1)->Unit(benchmark::kSecond);

// The parts of one optimize1, on the tool object: loading with the gamut record, one analysis,
// the node step and the sample step.
void Optimize1Phases(benchmark::State& state) {
    const std::string fixture = vantrel::test::FixtureProfile("FOGRA39L");
    if (fixture.empty()) return state.SkipWithError("FOGRA39L fixture not built");
    double load = 0, analysis = 0, gamut = 0, step1 = 0, step2 = 0;
    for (auto _ : state) {
        state.PauseTiming();
        TempDir dir;
        const std::string path = dir.File("paper.icc");
        std::filesystem::copy_file(fixture, path);
        void* handle = nullptr;
        dllInit(Quiet, &handle, nullptr);
        auto& tool = *static_cast<vantrel::CIterativtoolDlg*>(handle);
        state.ResumeTiming();
        auto t = Clock::now();
        tool.m_PaperName = path;
        tool.LoadPaperProfile(false);
        load += Seconds(t);
        double mean = 0, max = 0;
        t = Clock::now();
        tool.AnalyzeOutputProfile(mean, max);
        analysis += Seconds(t);
        t = Clock::now();
        tool.m_Gamut = vantrel::BuildGamutRecord(*tool.m_Paperprof);
        gamut += Seconds(t);
        t = Clock::now();
        tool.OptimizeStep1();
        step1 += Seconds(t);
        t = Clock::now();
        tool.OptimizeStep2();
        step2 += Seconds(t);
        state.PauseTiming();
        dllFree(handle);
        state.ResumeTiming();
    }
    const double n = static_cast<double>(state.iterations());
    state.counters["load_ms"] = 1000 * load / n;
    state.counters["analysis_ms"] = 1000 * analysis / n;
    state.counters["gamut_ms"] = 1000 * gamut / n;
    state.counters["step1_ms"] = 1000 * step1 / n;
    state.counters["step2_ms"] = 1000 * step2 / n;
}
BENCHMARK(Optimize1Phases)->Iterations(3)->Unit(benchmark::kMillisecond);

// The figure of merit: Argyll's own round-trip error (7^4 grid) of colprof -ql after optimize1,
// beside -ql, -qm and -qh as colprof makes them, with the times.
void Optimize1FigureOfMerit(benchmark::State& state) {
    if (!vantrel::test::HaveXicclu() || std::system("command -v colprof >/dev/null 2>&1") != 0)
        return state.SkipWithError("Argyll missing");
    for (auto _ : state) {
        for (const char q : {'l', 'm', 'h'}) {
            TempDir dir;
            double wall = 0, cpu = 0;
            if (!Colprof(dir, q, wall, cpu)) return state.SkipWithError("colprof failed");
            const std::string path = dir.File("FOGRA39L.icc");
            const std::string name = std::string("q") + q;
            state.counters[name + "_colprof_s"] = cpu;
            state.counters[name + "_dE"] = vantrel::test::XiccluRoundTripMean(path, 7);
            if (q != 'l') continue;
            double mean = 0;
            if (!Optimize1(path, wall, cpu, mean)) return state.SkipWithError("optimize1 failed");
            state.counters["ql_optimize1_s"] = cpu;
            state.counters["ql_optimized_dE"] = vantrel::test::XiccluRoundTripMean(path, 7);
        }
    }
}
BENCHMARK(Optimize1FigureOfMerit)->Iterations(1)->Unit(benchmark::kSecond);

}  // namespace
