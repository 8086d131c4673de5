// optimize4 as a host calls it after analyse3: one calibration run on identity links of 9 and
// 17 points (CMYK, FOGRA39L as the printer model) and of 5 and 7 points (seven colourants, the
// ink-model printer). No peer does this job: the time and the peak memory are printed beside
// their targets (peak RSS under 200 MB for the 17-point and the 7-point seven-colourant links).
#include <benchmark/benchmark.h>
#include <sys/resource.h>

#include <cmath>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "bench_fixtures.h"
#include "eval/forward.h"
#include "helpers/cgats_files.h"
#include "helpers/icc_builder.h"
#include "helpers/multi_ink_profiles.h"
#include "icc/profil.h"
#include "vantrel.h"

namespace {

using namespace vantrel::test;

int Quiet(const char*, int, int) { return 0; }

double PeakRssMb() {
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss / 1024.0;
}

// An identity device link of `channels` channels and `grid` points.
Bytes IdentityLink(int channels, int grid) {
    const LutSpec lut = MakeLut(channels, channels, grid, [grid](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(std::lround(node[static_cast<size_t>(out)] * 65535.0 / (grid - 1)));
    }, 256, 256);
    const char* space = channels == 4 ? "CMYK" : "7CLR";
    return IccBuilder(space, space, "link").AddTag("A2B0", Mft2Tag(lut)).Build();
}

// Reference and measurement of the link's C, M, Y plane (black and extras 0): colours from the
// model, the measurement 1.5 lighter and 1 more yellow.
void WriteCharts(const std::string& model, int channels, int grid, const std::string& ref, const std::string& meas) {
    vantrel::CProfil p;
    p.ReadTagTable(0, model);
    p.LoadLut(0, "A2B1", model);
    std::ostringstream refRows, measRows;
    const std::string device = channels == 4 ? "CMYK_C CMYK_M CMYK_Y CMYK_K" : "7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7";
    std::vector<std::string> a, b;
    int id = 1;
    for (int i = 0; i < grid; ++i)
        for (int j = 0; j < grid; ++j)
            for (int k = 0; k < grid; ++k, ++id) {
                const double percent[3] = {100.0 * i / (grid - 1), 100.0 * j / (grid - 1), 100.0 * k / (grid - 1)};
                double v[vantrel::CProfil::kEvalSize] = {percent[0] * 2.55, percent[1] * 2.55, percent[2] * 2.55};
                vantrel::DeviceToLab(p, v, channels);
                std::ostringstream row;
                row << id << ' ' << percent[0] << ' ' << percent[1] << ' ' << percent[2];
                for (int c = 3; c < channels; ++c) row << " 0";
                const std::string head = row.str();
                std::ostringstream r1, r2;
                r1 << head << ' ' << v[0] / 2.55 << ' ' << v[1] << ' ' << v[2];
                r2 << head << ' ' << v[0] / 2.55 + 1.5 << ' ' << v[1] << ' ' << v[2] + 1.0;
                a.push_back(r1.str());
                b.push_back(r2.str());
            }
    const std::string fields = "SAMPLE_ID " + device + " LAB_L LAB_A LAB_B";
    std::ofstream(ref) << Cgats(fields, a);
    std::ofstream(meas) << Cgats(fields, b);
}

void CalibrationRun(benchmark::State& state, int channels, int grid) {
    const std::string model = channels == 4 ? vantrel::bench::Fogra() : MultiInkProfile(InkSet::kCmykRGB);
    if (model.empty()) return state.SkipWithError("printer model not available");
    TempDir dir;
    const Bytes link = IdentityLink(channels, grid);
    const std::string linkPath = dir.File("link.mcc"), ref = dir.File("ref.it8"), meas = dir.File("meas_cal1.it8");
    WriteCharts(model, channels, grid, ref, meas);
    for (auto _ : state) {
        state.PauseTiming();
        WriteFile(linkPath, link);
        void* tool = nullptr;
        dllInit(Quiet, &tool, nullptr);
        int out[2];
        analyse3(tool, model.c_str(), linkPath.c_str(), ref.c_str(), meas.c_str(), &out[0], &out[1]);
        state.ResumeTiming();
        if (optimize4(tool, linkPath.c_str(), &out[0], &out[1], nullptr, model.c_str(), 1) != 0)
            state.SkipWithError("optimize4 failed");
        state.PauseTiming();
        dllFree(tool);
        state.ResumeTiming();
    }
    state.counters["patches"] = grid * grid * grid;
    state.counters["peak_RSS_MB"] = PeakRssMb();
    state.counters["target_RSS_MB"] = 200;
}
BENCHMARK_CAPTURE(CalibrationRun, Cmyk9, 4, 9)->Unit(benchmark::kMillisecond)->Iterations(2);
BENCHMARK_CAPTURE(CalibrationRun, SevenInks5, 7, 5)->Unit(benchmark::kMillisecond)->Iterations(2);
BENCHMARK_CAPTURE(CalibrationRun, Cmyk17, 4, 17)->Unit(benchmark::kMillisecond)->Iterations(1);
BENCHMARK_CAPTURE(CalibrationRun, SevenInks7, 7, 7)->Unit(benchmark::kMillisecond)->Iterations(1);

}  // namespace
