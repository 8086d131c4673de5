// The value scan, the white point scan and the XYZ-to-Lab conversion of the tool object.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "helpers/cgats_files.h"
#include "helpers/icc_builder.h"
#include "helpers/ti3_chart.h"
#include "helpers/tool_handle.h"
#include "it8/measured_it8.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

class It8Scan : public ::testing::Test {
protected:
    CIterativtoolDlg& Tool() { return handle.Tool(); }
    Measured_IT8& Load(const std::string& fields, const std::vector<std::string>& rows) {
        EXPECT_EQ(it8.ReadIt8(WriteText(dir, "scan.it8", Cgats(fields, rows))), 0) << fields;
        return it8;
    }
    Lab Values(std::vector<double> target) {
        target.resize(7);
        return Tool().ScanIt8ForValues(it8, target.data());
    }
    Lab White() { return Tool().ScanIt8ForWhitePoint(it8); }

    TempDir dir;
    ProgressLog log;
    ToolHandle handle;
    Measured_IT8 it8;
    std::vector<std::string>& calls = log.calls;
};

void ExpectLab(const Lab& lab, const Lab& want, double tolerance = 1e-12) {
    EXPECT_NEAR(lab.L, want.L, tolerance);
    EXPECT_NEAR(lab.a, want.a, tolerance);
    EXPECT_NEAR(lab.b, want.b, tolerance);
}

// CIE Lab of XYZ (0..100) against a white, with the exact cube root.
Lab CieLab(double X, double Y, double Z, const double white[3]) {
    auto f = [](double r) { return r > 216.0 / 24389.0 ? std::cbrt(r) : (24389.0 / 27.0 * r + 16.0) / 116.0; };
    const double fx = f(X / 100 / white[0]), fy = f(Y / 100 / white[1]), fz = f(Z / 100 / white[2]);
    return Lab{116 * fy - 16, 500 * (fx - fy), 200 * (fy - fz)};
}

const double kD50[3] = {0.9642, 1.0, 0.8249};
const char* const kCmykLab = "ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";

}  // namespace

TEST_F(It8Scan, PaperAndFirstMatchByTheDeviceChannelsOfTheFilesKind) {
    const struct {
        const char* fields;
        std::vector<std::string> rows;
        Lab white;
        std::vector<double> target;  // found first at rows[1] or, for CMYK, rows[4]
    } cases[] = {
        // Paper carries no ink, a trace of black below 1 % allowed; channels past K are not compared.
        {kCmykLab,
         {"1 0 0 0 0.5 90 1 -2", "2 0 0 0 1 10 10 10", "3 0.1 0 0 0 20 20 20", "4 0 0 0 0 94 -1 -4",
          "5 50 50 50 50 40 40 40", "6 50 50 50 50 30 0 0"},
         {92, 0, -3}, {50, 50, 50, 50, 99, 99, 99}},
        {"ID RGB_R RGB_G RGB_B LAB_L LAB_A LAB_B",
         {"1 255 255 255 96 0 0", "2 254 255 255 40 40 40", "3 255 255 255 98 2 -2", "4 0 0 0 0 0 0"},
         {97, 1, -1}, {254, 255, 255, -1, -1, -1, -1}},
        {"ID 7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7 LAB_L LAB_A LAB_B",
         {"1 0 0 0 0 0 0 0 90 1 1", "2 0 0 0 0 0 0 5 40 40 40", "3 0 0 0 0 0 0 0 93 -2 4", "4 0 0 0 0 0 1 0 1 1 1",
          "5 0 0 0 0 0 0 0 96 4 -2"},
         {93, 1, 1}, {0, 0, 0, 0, 0, 0, 5}},
        // Six channels: the seventh column is not there and not looked at.
        {"ID 6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5 6CLR_6 LAB_L LAB_A LAB_B",
         {"1 0 0 0 0 0 0 90 2 2", "2 0 0 0 0 0 3 40 40 40", "3 0 0 0 0 0 0 92 0 0"},
         {91, 1, 1}, {0, 0, 0, 0, 0, 3, 12345}},
    };
    for (const auto& c : cases) {
        Load(c.fields, c.rows);
        const std::size_t n = c.rows.size(), found = c.fields == kCmykLab ? 4 : 1;
        const std::string of = "/" + std::to_string(n);
        calls.clear();
        ExpectLab(White(), c.white);
        ASSERT_EQ(calls.size(), n + 2) << c.fields;
        EXPECT_EQ(calls.front(), "Scan IT8 for White Point... 0" + of);
        EXPECT_EQ(calls[n], "Scan IT8 for White Point... " + std::to_string(n) + of);
        EXPECT_EQ(calls.back(), "Finished ... 1/1");

        calls.clear();
        ExpectLab(Values(c.target), {40, 40, 40});
        ASSERT_EQ(calls.size(), found + 3) << c.fields;  // reports up to the match, then finishes
        EXPECT_EQ(calls[found + 1], "Scan IT8 for Values... " + std::to_string(found + 1) + of);
        EXPECT_EQ(calls.back(), "Finished ... 1/1");
    }
    // No match: zeros after a report for every patch.
    calls.clear();
    ExpectLab(Values({1, 1, 1, 1, 1, 1}), {0, 0, 0});
    EXPECT_EQ(calls.size(), 5u);
}

TEST_F(It8Scan, AHostAnswerCancelsTheValueScanButNotTheWhiteScan) {
    Load(kCmykLab, {"1 0 0 0 0 95 0 0", "2 1 1 1 1 50 0 0", "3 2 2 2 2 40 0 0", "4 0 0 0 0 93 0 0"});
    log.cancelAt = 2;
    ExpectLab(Values({2, 2, 2, 2}), {0, 0, 0});
    EXPECT_EQ(calls, (std::vector<std::string>{"Scan IT8 for Values... 0/4", "Scan IT8 for Values... 1/4",
                                               "Scan IT8 for Values... 2/4"}));
    calls.clear();
    ExpectLab(White(), {94, 0, 0});
    EXPECT_EQ(calls.size(), 6u);
}

TEST_F(It8Scan, KindIsProbedOnTheSecondPatchAndFilesWithoutDevicesGiveZeros) {
    // Nothing read, no device columns, or the second patch's cyan holding the missing-column marker:
    // zeros without a report.
    const std::vector<std::string> deviceless = {"1 95 0 0 0", "2 50 0 0 1"}, marker = {"1 0 0 0 0 95 0 0",
                                                 "2 -255 0 0 0 50 0 0", "3 0 0 0 0 93 0 0"};
    for (int file = 0; file < 3; ++file) {
        if (file == 1) Load("ID LAB_L LAB_A LAB_B D_VIS", deviceless);
        if (file == 2) Load(kCmykLab, marker);
        ExpectLab(White(), {0, 0, 0});
        ExpectLab(Values({0}), {0, 0, 0});
    }
    EXPECT_TRUE(calls.empty());
    // One patch: the probes read past the end and take the file for seven channels; a CMYK file's
    // fifth channel is missing, so its paper is not found.
    Load(kCmykLab, {"1 0 0 0 0 95 0 0"});
    ExpectLab(White(), {0, 0, 0});
    EXPECT_EQ(calls.size(), 3u);
}

TEST_F(It8Scan, XyzOnlyFilesGoAgainstTheFirstLoadedProfilesIlluminantElseD50) {
    Load("ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z",
         {"1 0 0 0 0 96.42 100 82.49", "2 100 0 0 0 15 22 50", "3 0 0 0 0.5 80 84 70", "4 0 0 0 0 0.5 0.4 0.3"});
    ExpectLab(Values({0}), {100, 0, 0}, 1e-9);
    ExpectLab(Values({100}), CieLab(15, 22, 50, kD50), 1e-9);
    // A dark colour below the 0.008856 knee takes the linear part (7.787 r + 16/116).
    EXPECT_NEAR(Tool().MeasuredXyzToLab(0.5, 0.4, 0.3).L, 116 * (7.787 * 0.004 + 16.0 / 116) - 16, 1e-12);
    const Lab w1 = CieLab(96.42, 100, 82.49, kD50), w2 = CieLab(80, 84, 70, kD50), w4 = CieLab(0.5, 0.4, 0.3, kD50);
    ExpectLab(White(), {(w1.L + w2.L + w4.L) / 3, (w1.a + w2.a + w4.a) / 3, (w1.b + w2.b + w4.b) / 3}, 0.01);

    auto load = [&](CProfil& slot, const char* name, const double white[3]) {
        IccBuilder profile("CMYK", "Lab ");
        profile.Illuminant(white[0], white[1], white[2])
            .AddTag("A2B1", Mft2Tag(MakeLut(4, 3, 2, [](const std::vector<int>&, int) { return uint16_t{32768}; })));
        const std::string path = WriteFile(dir.File(name), profile.Build());
        slot.ReadTagTable(0, path);
        ASSERT_EQ(slot.LoadLut(0, "A2B1", path), 1);
    };
    const double whiteD65[3] = {0.9505, 1.0, 1.089}, whiteA[3] = {1.0985, 1.0, 0.3558};
    CIterativtoolDlg& tool = Tool();
    load(*tool.m_ISDprof, "a.icc", whiteA);
    ExpectLab(tool.MeasuredXyzToLab(40, 42, 30), CieLab(40, 42, 30, whiteA), 0.02);
    load(*tool.m_Refprof, "d65.icc", whiteD65);  // the reference profile comes before the ISD profile
    ExpectLab(tool.MeasuredXyzToLab(40, 42, 30), CieLab(40, 42, 30, whiteD65), 0.02);
    ExpectLab(tool.MeasuredXyzToLab(95.05, 100, 108.9), {100, 0, 0}, 0.01);
    load(*tool.m_Outprof, "a.icc", whiteA);  // the 3CC profile comes first of all
    ExpectLab(tool.MeasuredXyzToLab(40, 42, 30), CieLab(40, 42, 30, whiteA), 0.02);
}

TEST_F(It8Scan, PaperWhiteOfTheCharacterisationData) {
    // The FOGRA and TR data against the same rule applied to an independent parse of the file.
    for (const char* name : {"FOGRA39L.ti3", "TR002.ti3", "TR006.ti3"}) {
        const std::string path = SystemIccDir() + name;
        if (!std::filesystem::exists(path)) GTEST_SKIP() << path << " missing";
        Lab sum;
        int count = 0;
        for (const ChartPatch& p : ReadCmykChart(path)) {
            if (p.cmyk[0] != 0 || p.cmyk[1] != 0 || p.cmyk[2] != 0 || p.cmyk[3] >= 1) continue;
            sum = Lab{sum.L + p.lab[0], sum.a + p.lab[1], sum.b + p.lab[2]};
            ++count;
        }
        ASSERT_GT(count, 0) << name;
        ASSERT_EQ(it8.ReadIt8(path), 0);
        ExpectLab(White(), {sum.L / count, sum.a / count, sum.b / count}, 1e-9);
    }
}
