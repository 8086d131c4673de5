// analyse3 through the C interface: a measurement against its reference, against itself, and the
// correction of a device link between calibration runs.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <filesystem>
#include <string>
#include <vector>

#include "analysis/analyse3.h"
#include "helpers/cgats_files.h"
#include "helpers/chart_figures.h"
#include "helpers/tool_handle.h"

namespace fs = std::filesystem;
using namespace vantrel;
using namespace vantrel::test;

namespace {

// A tool whose directory holds the embedded identity profiles; files are the test's own copies.
struct Host {
    TempDir dir;
    ToolHandle tool{dir.Slash().c_str()};
    int out1 = -777, out2 = -777;
    int Run(const std::string& paper, const std::string& link, const std::string& ref, const std::string& meas) {
        return analyse3(tool.h, paper.c_str(), link.c_str(), ref.c_str(), meas.c_str(), &out1, &out2);
    }
};

const char* const kFields = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";

}  // namespace

TEST(Analyse3, ChartPairsAgainstA3ccGiveTheirOwnMeanAndMaximum) {
    const std::string fogra39 = SystemIccDir() + "FOGRA39L.ti3";
    if (!fs::exists(fogra39)) GTEST_SKIP() << "no FOGRA data";
    for (const char* other : {"FOGRA40L.ti3", "FOGRA39L.ti3"}) {
        Host host;
        const std::string ref = WriteText(host.dir, "ref.ti3", ReadText(fogra39));
        const std::string meas = WriteText(host.dir, "meas.ti3", ReadText(SystemIccDir() + other));
        ASSERT_EQ(host.Run("", host.dir.File("neutral.3cc"), ref, meas), 0);
        const ChartFigures want = Figures(ReadCmykChart(ref), ReadCmykChart(meas));
        EXPECT_EQ(host.out1, want.mean) << other;
        EXPECT_EQ(host.out2, want.maximum) << other;
        if (std::string(other) == "FOGRA39L.ti3") {
            EXPECT_EQ(host.out1 + host.out2, 0);
        }
        // One layout: nothing is rewritten.
        EXPECT_FALSE(fs::exists(meas + ".$$$"));
        EXPECT_FALSE(fs::exists(ref + ".$$$"));
    }
}

TEST(Analyse3, RepeatedPatchesOfOneMeasurementAgreeOrNot) {
    Host host;
    // 39.5 % rounds to 40 and groups with 40; K 0.4 rounds to 0; 39.49 % stays apart.
    const std::string meas = WriteText(host.dir, "rep.it8",
                                       Cgats(kFields, {"1 39.5 0 0 0 50 0 0", "2 40 0 0 0 51 0 0", "3 40 0 0 0.4 52 0 0",
                                                       "4 10 0 0 0 70 0 0", "5 39.49 0 0 0 90 0 0"}));
    ASSERT_EQ(host.Run("", "", "", meas), 0);
    EXPECT_EQ(host.out1, 1333);  // pairs 1, 2, 1
    EXPECT_EQ(host.out2, 2000);
    // No repeated patch: no difference. No device columns: no figures at all.
    const std::string single = WriteText(host.dir, "one.it8", Cgats(kFields, {"1 0 0 0 0 90 0 0", "2 5 0 0 0 80 0 0"}));
    ASSERT_EQ(host.Run("", "", "", single), 0);
    EXPECT_EQ(host.out1 + host.out2, 0);
    const std::string labOnly = WriteText(host.dir, "lab.it8", Cgats("SAMPLE_ID LAB_L LAB_A LAB_B", {"1 50 0 0", "2 52 0 0"}));
    ASSERT_EQ(host.Run("", "", "", labOnly), 0);
    EXPECT_EQ(host.out1, 255000);
    EXPECT_EQ(host.out2, 300000);
}

TEST(Analyse3, CalibrationRunNumberFollowsCal) {
    EXPECT_EQ(CalibrationRun("d:/m/run_cal3.it8"), 3);
    EXPECT_EQ(CalibrationRun("run_cal.it8"), 0);
    EXPECT_EQ(CalibrationRun("run_cal12_cal4.it8"), 12);
    EXPECT_EQ(CalibrationRun("run.it8"), -1);
    EXPECT_EQ(CalibrationRun(nullptr), -1);
}

// Profiling mode on a copy of the identity CMYK link (5 grid points: nodes every 25 %).
// Patch 2 sits on node (50, 25, 0, 0), which the first run printed as 48, 27, 0, 0; patch 3 on
// node (25, 0, 0, 0). In the second run patch 2 got worse by 0.3 and is put back, patch 3 by
// exactly 0.2 and stays.
TEST(Analyse3, SecondCalibrationRunPutsBackNodesThatGotWorse) {
    Host host;
    const std::string link = host.dir.File("link.mcc");
    fs::copy_file(host.dir.File("cmyk2cmyk5neutral.mcc"), link);
    const std::string ref = WriteText(host.dir, "ref.it8",
                                      Cgats(kFields, {"1 0 0 0 0 95 0 0", "2 50 25 0 0 50 0 0", "3 25 0 0 0 50 0 0",
                                                      "4 10 0 0 0 60 0 0", "5 0 0 0 50 40 0 0"}));
    const std::string run1 = WriteText(host.dir, "m_cal1.it8",
                                       Cgats(kFields, {"1 0 0 0 0 95 0 0", "2 48 27 0 0 50 0 0", "3 25 0 0 0 50 0 0",
                                                       "4 10 0 0 0 60 0 0", "5 0 0 0 50 40 0 0"}));
    const std::string run2 = WriteText(host.dir, "m_cal2.it8",
                                       Cgats(kFields, {"1 0 0 0 0 95 0 0", "2 50 25 0 0 50 0.3 0", "3 25 0 0 0 50 0.2 0",
                                                       "4 10 0 0 0 60 0 0", "5 0 0 0 50 40 0 0"}));
    const std::string before = ReadText(link);
    ASSERT_EQ(host.Run("", link, ref, run1), 0);
    EXPECT_EQ(ReadText(link), before);  // nothing to compare with yet
    EXPECT_FALSE(fs::exists(run1 + "_merged.it8"));

    ASSERT_EQ(host.Run("", link, ref, run2), 0);
    EXPECT_EQ(host.tool.Tool().m_CalRun, 2);
    EXPECT_EQ(host.tool.Tool().m_RecalcFlag, 0);
    // The second pass compares the merged file: patch 2 as the first run printed it, patch 3 0.2 off.
    EXPECT_EQ(host.out1, 40);
    EXPECT_EQ(host.out2, 200);
    const PlainTable merged = ParsePlain(run2 + "_merged.it8");
    ASSERT_EQ(merged.rows.size(), 5u);
    const int c = merged.Column("CMYK_C"), m = merged.Column("CMYK_M"), a = merged.Column("Lab_a");
    ASSERT_GE(c, 0);
    EXPECT_EQ(merged.Value(1, c), 48);
    EXPECT_EQ(merged.Value(1, m), 27);
    EXPECT_EQ(merged.Value(1, a), 0);  // the previous run's colour
    EXPECT_NEAR(merged.Value(2, c), 25, 0.01);  // the link's own output at the node
    EXPECT_EQ(merged.Value(2, a), 0.2);

    // The link file now prints node (50, 25, 0, 0) as 48, 27, 0, 0 and leaves (25, 0, 0, 0) alone.
    cmsHPROFILE profile = cmsOpenProfileFromFile(link.c_str(), "r");
    ASSERT_NE(profile, nullptr);
    cmsHTRANSFORM t = cmsCreateTransform(profile, TYPE_CMYK_DBL, nullptr, TYPE_CMYK_DBL, INTENT_PERCEPTUAL,
                                         cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
    ASSERT_NE(t, nullptr);
    const double in[2][4] = {{50, 25, 0, 0}, {25, 0, 0, 0}};
    const double want[2][4] = {{48, 27, 0, 0}, {25, 0, 0, 0}};
    for (int p = 0; p < 2; ++p) {
        double out[4];
        cmsDoTransform(t, in[p], out, 1);
        for (int k = 0; k < 4; ++k) EXPECT_NEAR(out[k], want[p][k], 0.01) << p << " " << k;
    }
    cmsDeleteTransform(t);
    cmsCloseProfile(profile);
}
