// analyse3 and analyse4 through the C interface: the figures of a proof against press data, charts
// in another order, repeatability, link correction between calibration runs, the simulated
// reference, the ISD step at the fixed path and bad charts.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "analysis/analyse3.h"
#include "helpers/cgats_files.h"
#include "helpers/ti3_chart.h"
#include "helpers/tool_handle.h"
#include "support/platform.h"

namespace fs = std::filesystem;
using namespace vantrel;
using namespace vantrel::test;

namespace {

const std::string kCmyk = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
const std::string kFogra = SystemIccDir() + "FOGRA39L.ti3";

using Lab3 = std::array<double, 3>;
double Dist(const Lab3& p, const Lab3& q) {
    return std::sqrt((p[0] - q[0]) * (p[0] - q[0]) + (p[1] - q[1]) * (p[1] - q[1]) + (p[2] - q[2]) * (p[2] - q[2]));
}
int HostValue(double v) { return static_cast<int>(v * 1000.0 + 0.5); }

// The figures an operator reads, from the charts themselves: dE76 of patch i against patch i (mean
// 0 below a total of 0.02), and the whites averaged over the patches without ink (K below 1 %).
Lab3 PaperWhite(const std::vector<ChartPatch>& chart) {
    Lab3 sum{};
    int count = 0;
    for (const ChartPatch& p : chart)
        if (p.cmyk[0] == 0 && p.cmyk[1] == 0 && p.cmyk[2] == 0 && p.cmyk[3] < 1 && ++count)
            for (int c = 0; c < 3; ++c) sum[c] += p.lab[c];
    for (double& v : sum) v /= std::max(count, 1);
    return sum;
}
std::array<int, 3> Figures(const std::vector<ChartPatch>& ref, const std::vector<ChartPatch>& meas) {
    double sum = 0, maximum = 0;
    for (std::size_t i = 0; i < ref.size(); ++i) {
        sum += Dist(ref[i].lab, meas[i].lab);
        maximum = std::max(maximum, Dist(ref[i].lab, meas[i].lab));
    }
    const double mean = sum >= 0.02 ? sum / static_cast<double>(ref.size()) : 0.0;
    return {HostValue(mean), HostValue(maximum), HostValue(Dist(PaperWhite(meas), PaperWhite(ref)))};
}
std::string ChartText(const std::vector<ChartPatch>& chart) {
    std::vector<std::string> rows;
    for (const ChartPatch& p : chart) {
        rows.push_back(std::to_string(rows.size() + 1));  // six decimals: the charts' values stand exactly
        for (double v : {p.cmyk[0], p.cmyk[1], p.cmyk[2], p.cmyk[3], p.lab[0], p.lab[1], p.lab[2]})
            rows.back() += " " + std::to_string(v);
    }
    return Cgats(kCmyk, rows);
}

// A tool whose directory holds the identity profiles; every file is the test's own copy.
struct Host {
    TempDir dir;
    ToolHandle tool{dir.Slash().c_str()};
    int out[4] = {-777, -777, -777, -777};
    std::string Copy(const std::string& from, const std::string& to) { return WriteText(dir, to, ReadText(from)); }
    void Run4(const std::string& paper, const std::string& refIcc, const std::string& ref, const std::string& meas) {
        ASSERT_EQ(analyse4(tool.h, paper.c_str(), refIcc.c_str(), ref.c_str(), meas.c_str(), &out[0], &out[1], &out[2],
                           &out[3]), 0);
    }
    void Run3(const std::string& link, const std::string& ref, const std::string& meas) {
        ASSERT_EQ(analyse3(tool.h, "", link.c_str(), ref.c_str(), meas.c_str(), &out[0], &out[1]), 0);
    }
};

// Clears the fixed ISD path for each test; whatever stood there comes back at the end.
class Analyse4 : public ::testing::Test {
protected:
    Analyse4() {
        if (fs::exists(path)) fs::rename(path, saved);
    }
    ~Analyse4() override {
        fs::remove(path, e);
        if (fs::exists(saved)) fs::rename(saved, path, e);
    }
    const std::string path = platform::IsdProfilePath(), saved = path + ".saved-by-test";
    std::error_code e;
};

}  // namespace

TEST_F(Analyse4, PressChartsGiveTheirOwnFiguresAndAPaperOfSmallerGamutHoldsFewer) {
    const std::string fogra = FixtureProfile("FOGRA39L"), swop = FixtureProfile("TR003");
    if (fogra.empty() || swop.empty()) GTEST_SKIP() << "no Argyll fixtures";
    int share[2] = {};
    for (const char* other : {"FOGRA40L", "FOGRA39L"}) {
        for (int paper = 0; paper < 2; ++paper) {
            Host host;
            const std::string ref = host.Copy(kFogra, "r"), meas = host.Copy(SystemIccDir() + other + ".ti3", "m");
            host.Run4(paper == 0 ? fogra : swop, "", ref, meas);
            const std::array<int, 3> want = Figures(ReadCmykChart(ref), ReadCmykChart(meas));
            for (int k = 0; k < 3; ++k) EXPECT_EQ(host.out[k], want[k]) << other << k;
            share[paper] = host.out[3];
        }
        EXPECT_GT(share[0], 80000);  // the chart's own printing condition
        EXPECT_LT(share[1], share[0] - 5000);
    }
}

// The measurement reversed (same count) is rewritten in the reference's order; a reversed subset
// has the reference rewritten in its order. Both by first match, in the writer's layout.
TEST_F(Analyse4, ChartsInAnotherOrderAreAlignedByFirstMatch) {
    if (!fs::exists(kFogra)) GTEST_SKIP() << "no FOGRA data";
    const std::vector<ChartPatch> ref39 = ReadCmykChart(kFogra), f40 = ReadCmykChart(SystemIccDir() + "FOGRA40L.ti3");
    std::vector<ChartPatch> reversed(f40.rbegin(), f40.rend()), subset;
    for (std::size_t i = 0; i < reversed.size(); i += 7) subset.push_back(reversed[i]);
    for (const bool whole : {true, false}) {
        Host host;
        const std::vector<ChartPatch>& measured = whole ? reversed : subset;
        const std::string ref = host.Copy(kFogra, "r"), meas = WriteText(host.dir, "m", ChartText(measured));
        host.Run4("", "", ref, meas);
        std::vector<ChartPatch> aligned = whole ? ref39 : measured;
        const std::vector<ChartPatch>& scanned = whole ? measured : ref39;
        for (ChartPatch& p : aligned)
            p.lab = std::find_if(scanned.begin(), scanned.end(), [&](auto& q) { return q.cmyk == p.cmyk; })->lab;
        const std::string written = (whole ? meas : ref) + ".$$$";
        const std::vector<ChartPatch> file = ReadCmykChart(written);
        ASSERT_EQ(file.size(), aligned.size());
        for (std::size_t i = 0; i < file.size(); ++i) {
            EXPECT_EQ(file[i].cmyk, aligned[i].cmyk) << i;
            for (int c = 0; c < 3; ++c) EXPECT_NEAR(file[i].lab[c], aligned[i].lab[c], 5e-5) << i;
        }
        EXPECT_EQ(Lines(ReadText(written))[3],
                  "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z");
        const std::array<int, 3> want = whole ? Figures(ref39, aligned) : Figures(aligned, measured);
        EXPECT_EQ(host.out[0], want[0]);
        EXPECT_EQ(host.out[1], want[1]);
        EXPECT_EQ(host.out[2], HostValue(Dist(PaperWhite(measured), PaperWhite(ref39))));  // whites as given
    }
    // Counts that stay apart (the aligned file cannot be written) give the unaligned figures.
    Host host;
    const std::string ref = WriteText(host.dir, "r", Cgats(kCmyk, {"1 0 0 0 0 95 0 0", "2 50 0 0 0 60 0 0"}));
    const std::string meas =
        WriteText(host.dir, "m", Cgats(kCmyk, {"1 0 0 0 0 95 0 0", "2 5 0 0 0 1 0 0", "3 9 0 0 0 6 0 0"}));
    fs::create_directory(meas + ".$$$");
    host.Run4("", "", ref, meas);
    EXPECT_EQ(host.out[0], 100000);
    EXPECT_EQ(host.out[1], 100000);
}

TEST_F(Analyse4, TheReferenceProfilePredictsAMissingReference) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "no Argyll fixture";
    Host host;
    const std::string profile = host.Copy(fogra, "ref.icc");
    const std::vector<ChartPatch> measured = {
        {{0, 0, 0, 0}, {95, 0, 0}}, {{39.5, 0, 0, 0}, {50, 10, -10}}, {{100, 60.25, 0, 20}, {30, 0, -30}}};
    host.Run4("", profile, "", WriteText(host.dir, "proof.it8", ChartText(measured)));
    const std::vector<ChartPatch> simulated = ReadCmykChart(profile + ".it8");
    ASSERT_EQ(simulated.size(), measured.size());
    cmsHPROFILE in = cmsOpenProfileFromFile(profile.c_str(), "r"), lab = cmsCreateLab4Profile(nullptr);
    cmsHTRANSFORM t = cmsCreateTransform(in, TYPE_CMYK_DBL, lab, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC, 0);
    for (std::size_t i = 0; i < measured.size(); ++i) {
        for (int c = 0; c < 4; ++c) EXPECT_EQ(simulated[i].cmyk[c], std::trunc(measured[i].cmyk[c] + 0.5)) << i;
        std::array<double, 3> want;
        cmsDoTransform(t, measured[i].cmyk.data(), want.data(), 1);
        EXPECT_LT(Dist(simulated[i].lab, want), 1.0) << i;
    }
    cmsDeleteTransform(t);
    cmsCloseProfile(lab);
    cmsCloseProfile(in);
    const std::array<int, 3> want = Figures(simulated, measured);  // judged against the predictions
    for (int k = 0; k < 3; ++k) EXPECT_EQ(host.out[k], want[k]);
}

TEST_F(Analyse4, AProfileOfTheNeutralSizeAtTheIsdPathReplacesTheMeasurementFirst) {
    for (const bool known : {true, false}) {
        Host host;
        fs::copy_file(host.dir.File("neutral.3cc"), path);
        if (!known) std::ofstream(path, std::ios::app | std::ios::binary) << '\0';
        const std::string text = Cgats(kCmyk, {"1 0 0 0 0 95 0 0", "2 40 0 0 0 60 -20 -30"});
        const std::string ref = WriteText(host.dir, "ref.it8", text), meas = WriteText(host.dir, "meas.it8", text);
        host.Run4("", "", ref, meas);
        EXPECT_EQ(fs::exists(meas + "isd.it8"), known);
        EXPECT_EQ(ReadText(meas), known ? ReadText(meas + "isd.it8") : text);
        EXPECT_LT(host.out[0], known ? 100 : 1);  // through the identity, within its precision
        fs::remove(path);
    }
}

// Bad charts through both exports: clean figures, no crash, the given files untouched.
TEST_F(Analyse4, BadChartsGiveCleanFigures) {
    std::vector<std::string> many;
    for (int i = 0; i < 20000; ++i)
        many.push_back(std::to_string(i + 1) + " " + std::to_string(i % 101) + " " + std::to_string(i / 101 % 101) +
                       " " + std::to_string(i / 10201) + " 0 50 0 0");
    const std::string xyz =
        Cgats("ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z", {"1 0 0 0 0 96 99 82", "2 9 0 0 0 20 20 20"});
    const struct {
        const char* name;
        std::string ref, meas;
        std::array<int, 4> want;
    } cases[] = {
        {"no device columns", Cgats("ID LAB_L LAB_A LAB_B", {"1 95 0 0", "2 50 0 0"}),
         Cgats("ID LAB_L LAB_A LAB_B", {"1 95 0 0", "2 51 0 0"}), {255000, 300000, 0, 0}},
        {"XYZ only", xyz, xyz, {0, 0, 0, 0}},
        {"one patch", Cgats(kCmyk, {"1 0 0 0 0 95 0 0"}), Cgats(kCmyk, {"1 0 0 0 0 94 0 0"}), {1000, 1000, 0, 0}},
        {"20000 patches", Cgats(kCmyk, many), Cgats(kCmyk, many), {0, 0, 0, 0}},
        {"different kinds", Cgats("ID RGB_R RGB_G RGB_B LAB_L LAB_A LAB_B", {"1 255 255 255 95 0 0", "2 0 0 0 5 0 0"}),
         Cgats(kCmyk, {"1 0 0 0 0 95 0 0", "2 0 0 0 100 5 0 0"}), {255000, 300000, 0, 0}},
    };
    for (const auto& c : cases) {
        for (const bool three : {false, true}) {
            Host host;
            const std::string ref = WriteText(host.dir, "r", c.ref), meas = WriteText(host.dir, "m", c.meas);
            if (three) host.Run3(host.dir.File("neutral.3cc"), ref, meas);
            else host.Run4("", "", ref, meas);
            for (int k = 0; k < (three ? 2 : 4); ++k) EXPECT_EQ(host.out[k], c.want[k]) << c.name << " out" << k + 1;
            EXPECT_EQ(ReadText(ref) + ReadText(meas), c.ref + c.meas) << c.name;
        }
    }
    Host host;  // no measurement: nothing happens
    host.Run4("", "", "", "");
    EXPECT_EQ(host.out[0], -777);
    EXPECT_EQ(analyse4(host.tool.h, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
}

TEST(Analyse3, RepeatedPatchesOfOneMeasurementAndCalibrationRunNumbers) {
    Host host;
    // 39.5 % rounds to 40 and groups with 40; K 0.4 rounds to 0; 39.49 % stays apart. Pairs 1, 2, 1.
    host.Run3("", "", WriteText(host.dir, "rep.it8", Cgats(kCmyk, {"1 39.5 0 0 0 50 0 0", "2 40 0 0 0 51 0 0",
                                                                    "3 40 0 0 0.4 52 0 0", "4 39.49 0 0 0 90 0 0"})));
    EXPECT_EQ(host.out[0], 1333);
    EXPECT_EQ(host.out[1], 2000);
    host.Run3("", "", WriteText(host.dir, "lab.it8", Cgats("ID LAB_L LAB_A LAB_B", {"1 50 0 0", "2 52 0 0"})));
    EXPECT_EQ(host.out[0], 255000);
    EXPECT_EQ(host.out[1], 300000);
    EXPECT_EQ(CalibrationRun("d:/m/run_cal3.it8") * 10 + CalibrationRun("run_cal.it8"), 30);
    EXPECT_EQ(CalibrationRun("run.it8"), -1);
}

// Profiling mode on a copy of the identity CMYK link (5 grid points: nodes every 25 %). Patch 2
// sits on node (50, 25, 0, 0), which the first run printed as 48, 27, 0, 0; patch 3 on node
// (25, 0, 0, 0). In the second run patch 2 is 0.3 worse and goes back, patch 3 exactly 0.2 and stays.
TEST(Analyse3, SecondCalibrationRunPutsBackNodesThatGotWorse) {
    Host host;
    const std::string link = host.Copy(host.dir.File("cmyk2cmyk5neutral.mcc"), "link.mcc"), before = ReadText(link);
    auto chart = [&](const char* name, const char* patch2, const char* patch3) {
        return WriteText(host.dir, name,
                         Cgats(kCmyk, {"1 0 0 0 0 95 0 0", patch2, patch3, "4 10 0 0 0 60 0 0", "5 0 0 0 50 40 0 0"}));
    };
    const std::string ref = chart("ref.it8", "2 50 25 0 0 50 0 0", "3 25 0 0 0 50 0 0"),
                      run2 = chart("m_cal2.it8", "2 50 25 0 0 50 0.3 0", "3 25 0 0 0 50 0.2 0");
    host.Run3(link, ref, chart("m_cal1.it8", "2 48 27 0 0 50 0 0", "3 25 0 0 0 50 0 0"));
    EXPECT_EQ(ReadText(link), before);  // nothing to compare with yet
    host.Run3(link, ref, run2);
    EXPECT_EQ(host.tool.Tool().m_RecalcFlag, 0);
    EXPECT_EQ(host.out[0], 40);  // the second pass: patch 2 as the first run printed it, patch 3 0.2 off
    EXPECT_EQ(host.out[1], 200);
    const PlainTable merged = ParsePlain(run2 + "_merged.it8");
    ASSERT_EQ(merged.rows.size(), 5u);
    const int c = merged.Column("CMYK_C"), m = merged.Column("CMYK_M"), a = merged.Column("Lab_a");
    EXPECT_EQ(merged.Value(1, c) * 100 + merged.Value(1, m), 4827);
    EXPECT_EQ(merged.Value(1, a), 0);  // the previous run's colour
    EXPECT_NEAR(merged.Value(2, c), 25, 0.01);  // the link's own output at the node
    EXPECT_EQ(merged.Value(2, a), 0.2);
    // The link file prints node (50, 25, 0, 0) as 48, 27, 0, 0 now and (25, 0, 0, 0) as before.
    cmsHPROFILE profile = cmsOpenProfileFromFile(link.c_str(), "r");
    cmsHTRANSFORM t = cmsCreateTransform(profile, TYPE_CMYK_DBL, nullptr, TYPE_CMYK_DBL, INTENT_PERCEPTUAL, 0);
    ASSERT_NE(t, nullptr);
    const double in[2][4] = {{50, 25, 0, 0}, {25, 0, 0, 0}}, want[2][4] = {{48, 27, 0, 0}, {25, 0, 0, 0}};
    double out[2][4];
    cmsDoTransform(t, in, out, 2);
    for (int k = 0; k < 8; ++k) EXPECT_NEAR(out[k / 4][k % 4], want[k / 4][k % 4], 0.01) << k;
    cmsDeleteTransform(t);
    cmsCloseProfile(profile);
}
