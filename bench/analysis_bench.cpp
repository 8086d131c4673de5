// analyse4 as a host calls it, on charts whose patches come in another order than the
// reference's: the FOGRA39 chart (1617 patches) and a 10 000-patch chart, each against a shuffled
// copy of itself. The alignment looks patches up in an index of device values; the ratio run puts
// it beside a walk over the file for every patch, the plain way to find the first match.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <memory>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <unistd.h>

#include "analysis/it8_kind.h"
#include "interface/tool_object.h"
#include "support/platform.h"
#include "vantrel.h"

namespace fs = std::filesystem;

namespace {

int Quiet(const char*, int, int) { return 0; }

// A folder of this run's own, removed at exit.
struct BenchDir {
    fs::path path = fs::temp_directory_path() / ("vantrel-bench-" + std::to_string(::getpid()));
    BenchDir() { fs::create_directories(path); }
    ~BenchDir() {
        std::error_code ignored;
        fs::remove_all(path, ignored);
    }
    std::string File(const std::string& name) const { return (path / name).string(); }
};

const BenchDir& Dir() {
    static const BenchDir dir;
    return dir;
}

std::vector<std::string> DataRows(const std::string& text) {
    std::istringstream in(text);
    std::vector<std::string> rows;
    bool data = false;
    for (std::string line; std::getline(in, line);) {
        if (line.rfind("END_DATA", 0) == 0 && line.rfind("END_DATA_FORMAT", 0) != 0) break;
        if (data) rows.push_back(line);
        if (line.rfind("BEGIN_DATA", 0) == 0 && line.rfind("BEGIN_DATA_FORMAT", 0) != 0) data = true;
    }
    return rows;
}

std::string Chart(const std::vector<std::string>& rows) {
    std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
                       "END_DATA_FORMAT\nNUMBER_OF_SETS " + std::to_string(rows.size()) + "\nBEGIN_DATA\n";
    for (const std::string& row : rows) text += row + "\n";
    return text + "END_DATA\n";
}

// The rows of the reference chart: FOGRA39's CMYK and Lab, or n generated patches.
std::vector<std::string> ReferenceRows(int patches) {
    std::vector<std::string> rows;
    if (patches == 1617) {
        std::ifstream in("/usr/share/color/icc/FOGRA39L.ti3");
        std::stringstream text;
        text << in.rdbuf();
        for (const std::string& row : DataRows(text.str())) {
            std::istringstream words(row);
            std::string id, c, m, y, k, x, yy, z, L, a, b;
            if (words >> id >> c >> m >> y >> k >> x >> yy >> z >> L >> a >> b)
                rows.push_back(id + " " + c + " " + m + " " + y + " " + k + " " + L + " " + a + " " + b);
        }
        return rows;
    }
    for (int i = 0; i < patches; ++i) {
        char row[128];
        std::snprintf(row, sizeof row, "%d %d %d %d 0 %.2f %.2f %.2f", i + 1, i % 101, i / 101 % 101, i / 10201,
                      95.0 - (i % 90), (i % 50) - 25.0, (i % 70) - 35.0);
        rows.push_back(row);
    }
    return rows;
}

struct Charts {
    std::string reference, measurement;
};

// The reference and a shuffled copy, written once per size.
Charts WriteCharts(int patches) {
    std::vector<std::string> rows = ReferenceRows(patches);
    const std::string tag = std::to_string(patches);
    Charts charts{Dir().File("ref" + tag + ".it8"), Dir().File("meas" + tag + ".it8")};
    std::ofstream(charts.reference) << Chart(rows);
    std::mt19937 random(7);
    std::shuffle(rows.begin(), rows.end(), random);
    std::ofstream(charts.measurement) << Chart(rows);
    return charts;
}

void Analyse4Shuffled(benchmark::State& state) {
    const int patches = static_cast<int>(state.range(0));
    const Charts charts = WriteCharts(patches);
    if (static_cast<int>(ReferenceRows(patches).size()) != patches) return state.SkipWithError("no FOGRA39 data");
    // A profile there would be applied to the measurement first, and replace it, in every run.
    if (fs::exists(vantrel::platform::IsdProfilePath())) return state.SkipWithError("a file stands at the ISD path");
    int out[4] = {};
    for (auto _ : state) {
        void* tool = nullptr;
        dllInit(Quiet, &tool, nullptr);
        analyse4(tool, "", "", charts.reference.c_str(), charts.measurement.c_str(), &out[0], &out[1], &out[2],
                 &out[3]);
        dllFree(tool);
    }
    // A shuffled copy of the same chart differs nowhere.
    state.counters["mean_x1000"] = out[0];
    state.SetItemsProcessed(state.iterations() * patches);
}
BENCHMARK(Analyse4Shuffled)->Arg(1617)->Arg(10000)->Unit(benchmark::kMillisecond);

// The indexed alignment and a walk over the reference for every patch of the measurement, in
// one run, alternating (the 10 000-patch walk takes seconds: two rounds only).
void AlignmentRatioToPatchWalk(benchmark::State& state) {
    const Charts charts = WriteCharts(static_cast<int>(state.range(0)));
    vantrel::CIterativtoolDlg tool(nullptr);
    double indexed = 0, walked = 0;
    for (auto _ : state) {
        tool.m_ReferenceIT8 = std::make_unique<vantrel::Measured_IT8>();
        tool.m_ReferenceIT8->ReadIt8(charts.reference);
        tool.m_MeasIT8 = std::make_unique<vantrel::Measured_IT8>();
        tool.m_MeasIT8->ReadIt8(charts.measurement);
        tool.m_MeasIT8Name = Dir().File("align.it8");
        const auto t0 = std::chrono::steady_clock::now();
        const vantrel::Measured_IT8& reference = *tool.m_ReferenceIT8;
        const vantrel::Measured_IT8& measurement = *tool.m_MeasIT8;
        double sum = 0;
        for (int i = 0; i < reference.PatchCount(); ++i) {
            double target[7] = {};
            for (int c = 0; c < 4; ++c) target[c] = reference.GetCmyk(i, c);
            sum += tool.ScanIt8ForValues(measurement, target).L;
        }
        benchmark::DoNotOptimize(sum);
        const auto t1 = std::chrono::steady_clock::now();
        tool.AlignMeasurementToReference();
        const auto t2 = std::chrono::steady_clock::now();
        walked += std::chrono::duration<double>(t1 - t0).count();
        indexed += std::chrono::duration<double>(t2 - t1).count();
    }
    state.counters["walk_s"] = walked / static_cast<double>(state.iterations());
    state.counters["indexed_s"] = indexed / static_cast<double>(state.iterations());
    state.counters["ratio"] = indexed / walked;
}
BENCHMARK(AlignmentRatioToPatchWalk)->Arg(1617)->Unit(benchmark::kMillisecond);
BENCHMARK(AlignmentRatioToPatchWalk)->Arg(10000)->Iterations(2)->Unit(benchmark::kMillisecond);

}  // namespace
