// The value scan, the white point scan and the XYZ-to-Lab conversion of the tool object.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "interface/tool_object.h"
#include "it8/measured_it8.h"
#include "it8/it8_test_files.h"

using namespace vantrel;
using vantrel::test::TempDir;

namespace {

// What the host's progress function saw; the scans call a plain function, so it lives here.
struct ProgressLog {
    std::vector<std::string> calls;
    int cancelAtStep = -1;  // answer non-zero from this step of a scan text on
};
ProgressLog* g_log = nullptr;

int Record(const char* text, int step, int steps) {
    g_log->calls.push_back(std::string(text) + " " + std::to_string(step) + "/" + std::to_string(steps));
    return (g_log->cancelAtStep >= 0 && step >= g_log->cancelAtStep && std::string(text) != "Finished ...") ? 1 : 0;
}

class It8Scan : public ::testing::Test {
protected:
    It8Scan() : tool(nullptr) {
        for (auto* p : {tool.m_Outprof.get(), tool.m_ISDprof.get(), tool.m_Refprof.get(), tool.m_Paperprof.get(),
                        tool.m_PaperprofPerceptual.get()})
            p->MarkReleased();
        tool.m_Progress = Record;
        g_log = &log;
    }
    ~It8Scan() override { g_log = nullptr; }

    Measured_IT8& Load(const std::string& fields, const std::vector<std::string>& rows) {
        std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\n" + fields + "\nEND_DATA_FORMAT\nNUMBER_OF_SETS " +
                           std::to_string(rows.size()) + "\nBEGIN_DATA\n";
        for (const std::string& row : rows) text += row + "\n";
        text += "END_DATA\n";
        EXPECT_EQ(it8.ReadIt8(test::it8::WriteFile(dir, "scan.it8", text)), 0) << text;
        return it8;
    }

    TempDir dir;
    CIterativtoolDlg tool;
    Measured_IT8 it8;
    ProgressLog log;
};

void ExpectLab(const Lab& lab, double L, double a, double b, double tolerance = 1e-12) {
    EXPECT_NEAR(lab.L, L, tolerance);
    EXPECT_NEAR(lab.a, a, tolerance);
    EXPECT_NEAR(lab.b, b, tolerance);
}

// CIE Lab of XYZ (0..100) against a white, with the exact cube root.
Lab CieLab(double X, double Y, double Z, const double white[3]) {
    auto f = [](double r) { return r > 216.0 / 24389.0 ? std::cbrt(r) : (24389.0 / 27.0 * r + 16.0) / 116.0; };
    const double fx = f(X / 100 / white[0]), fy = f(Y / 100 / white[1]), fz = f(Z / 100 / white[2]);
    return Lab{116 * fy - 16, 500 * (fx - fy), 200 * (fy - fz)};
}

const char* const kCmykLab = "ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";

}  // namespace

TEST_F(It8Scan, CmykWhiteIsNoColourInkAndBlackBelowOnePercent) {
    Load(kCmykLab, {"1 0 0 0 0.5 90 1 -2", "2 0 0 0 1 10 10 10", "3 0.1 0 0 0 20 20 20", "4 0 0 0 0 94 -1 -4",
                    "5 50 50 50 50 30 0 0"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 92, 0, -3);
    EXPECT_EQ(log.calls.front(), "Scan IT8 for White Point... 0/5");
    EXPECT_EQ(log.calls[5], "Scan IT8 for White Point... 5/5");
    EXPECT_EQ(log.calls.back(), "Finished ... 1/1");
    EXPECT_EQ(log.calls.size(), 7u);
}

TEST_F(It8Scan, RgbWhiteIsFullValueOnAllThree) {
    Load("ID RGB_R RGB_G RGB_B LAB_L LAB_A LAB_B", {"1 255 255 255 96 0 0", "2 254 255 255 50 50 50",
                                                     "3 255 255 255 98 2 -2", "4 0 0 0 0 0 0"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 97, 1, -1);
}

TEST_F(It8Scan, MultiChannelWhiteWithAndWithoutTheSeventh) {
    Load("ID 7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7 LAB_L LAB_A LAB_B",
         {"1 0 0 0 0 0 0 0 90 1 1", "2 0 0 0 0 0 0 5 40 40 40", "3 0 0 0 0 0 0 0 93 -2 4", "4 0 0 0 0 0 1 0 1 1 1",
          "5 0 0 0 0 0 0 0 96 4 -2"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 93, 1, 1);
    // Six channels: the seventh column is not there and not looked at.
    Load("ID 6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5 6CLR_6 LAB_L LAB_A LAB_B",
         {"1 0 0 0 0 0 0 90 2 2", "2 0 0 0 0 0 3 40 40 40", "3 0 0 0 0 0 0 92 0 0"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 91, 1, 1);
}

TEST_F(It8Scan, ValueScanReturnsTheFirstMatchAndReportsEachPatch) {
    Load(kCmykLab, {"1 0 0 0 0 95 0 0", "2 10 20 30 40 50 5 5", "3 10 20 30 40 60 6 6", "4 10 20 30 41 70 7 7"});
    const double target[7] = {10, 20, 30, 40, 99, 99, 99};  // channels past K are not compared
    ExpectLab(tool.ScanIt8ForValues(it8, target), 50, 5, 5);
    EXPECT_EQ(log.calls, (std::vector<std::string>{"Scan IT8 for Values... 0/4", "Scan IT8 for Values... 1/4",
                                                   "Scan IT8 for Values... 2/4", "Finished ... 1/1"}));
    log.calls.clear();
    const double absent[7] = {10, 20, 30, 40.5, 0, 0, 0};
    ExpectLab(tool.ScanIt8ForValues(it8, absent), 0, 0, 0);
    EXPECT_EQ(log.calls.size(), 6u);
    EXPECT_EQ(log.calls.back(), "Finished ... 1/1");
}

TEST_F(It8Scan, ValueScanComparesTheChannelsOfTheFilesKind) {
    Load("ID RGB_R RGB_G RGB_B LAB_L LAB_A LAB_B", {"1 1 2 3 10 0 0", "2 4 5 6 20 1 2"});
    const double rgb[7] = {4, 5, 6, -1, -1, -1, -1};
    ExpectLab(tool.ScanIt8ForValues(it8, rgb), 20, 1, 2);

    Load("ID 7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7 LAB_L LAB_A LAB_B",
         {"1 1 2 3 4 5 6 7 10 0 0", "2 1 2 3 4 5 6 8 20 0 0"});
    const double seven[7] = {1, 2, 3, 4, 5, 6, 8};
    ExpectLab(tool.ScanIt8ForValues(it8, seven), 20, 0, 0);

    Load("ID 6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5 6CLR_6 LAB_L LAB_A LAB_B", {"1 1 2 3 4 5 6 10 0 0", "2 1 2 3 4 5 7 20 0 0"});
    const double six[7] = {1, 2, 3, 4, 5, 6, 12345};
    ExpectLab(tool.ScanIt8ForValues(it8, six), 10, 0, 0);
}

TEST_F(It8Scan, AHostAnswerCancelsTheValueScanButNotTheWhiteScan) {
    Load(kCmykLab, {"1 0 0 0 0 95 0 0", "2 1 1 1 1 50 0 0", "3 2 2 2 2 40 0 0", "4 0 0 0 0 93 0 0"});
    log.cancelAtStep = 2;
    const double target[7] = {2, 2, 2, 2, 0, 0, 0};
    ExpectLab(tool.ScanIt8ForValues(it8, target), 0, 0, 0);
    EXPECT_EQ(log.calls, (std::vector<std::string>{"Scan IT8 for Values... 0/4", "Scan IT8 for Values... 1/4",
                                                   "Scan IT8 for Values... 2/4"}));
    log.calls.clear();
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 94, 0, 0);
    EXPECT_EQ(log.calls.size(), 6u);
}

TEST_F(It8Scan, KindIsProbedOnTheSecondPatchOnly) {
    // The second patch's cyan holds the missing-column marker: not CMYK, and no other device columns.
    Load(kCmykLab, {"1 0 0 0 0 95 0 0", "2 -255 0 0 0 50 0 0", "3 0 0 0 0 93 0 0"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 0, 0, 0);
    const double target[7] = {0, 0, 0, 0, 0, 0, 0};
    ExpectLab(tool.ScanIt8ForValues(it8, target), 0, 0, 0);
    EXPECT_TRUE(log.calls.empty());

    // One patch: the probes read past the end and take the file for seven channels; a CMYK file's
    // fifth channel is missing, so its paper is not found.
    Load(kCmykLab, {"1 0 0 0 0 95 0 0"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 0, 0, 0);
    EXPECT_EQ(log.calls.size(), 3u);
}

TEST_F(It8Scan, EmptyOrDevicelessFilesGiveZerosWithoutReports) {
    const double target[7] = {0, 0, 0, 0, 0, 0, 0};
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 0, 0, 0);
    ExpectLab(tool.ScanIt8ForValues(it8, target), 0, 0, 0);
    EXPECT_EQ(it8.ReadIt8(dir.File("missing.it8")), kIt8CannotOpen);
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 0, 0, 0);
    Load("ID LAB_L LAB_A LAB_B D_VIS", {"1 95 0 0 0", "2 50 0 0 1"});
    ExpectLab(tool.ScanIt8ForWhitePoint(it8), 0, 0, 0);
    ExpectLab(tool.ScanIt8ForValues(it8, target), 0, 0, 0);
    EXPECT_TRUE(log.calls.empty());
}

TEST_F(It8Scan, XyzOnlyFilesAreConvertedAgainstD50WithoutAProfile) {
    Load("ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z",
         {"1 0 0 0 0 96.42 100 82.49", "2 100 0 0 0 15 22 50", "3 0 0 0 0.5 80 84 70", "4 0 0 0 0 0.5 0.4 0.3"});
    const double d50[3] = {0.9642, 1.0, 0.8249};
    ExpectLab(tool.ScanIt8ForValues(it8, std::vector<double>{0, 0, 0, 0, 0, 0, 0}.data()), 100, 0, 0, 1e-9);
    const Lab cyan = CieLab(15, 22, 50, d50);
    ExpectLab(tool.ScanIt8ForValues(it8, std::vector<double>{100, 0, 0, 0, 0, 0, 0}.data()), cyan.L, cyan.a, cyan.b,
              1e-9);
    // A dark colour below the 0.008856 knee takes the linear part (7.787 r + 16/116).
    const Lab dark = tool.MeasuredXyzToLab(0.5, 0.4, 0.3);
    EXPECT_NEAR(dark.L, 116 * (7.787 * 0.004 + 16.0 / 116) - 16, 1e-12);
    const Lab white = tool.ScanIt8ForWhitePoint(it8);
    const Lab w1 = CieLab(96.42, 100, 82.49, d50), w2 = CieLab(80, 84, 70, d50), w4 = CieLab(0.5, 0.4, 0.3, d50);
    EXPECT_NEAR(white.L, (w1.L + w2.L + w4.L) / 3, 0.01);
    EXPECT_NEAR(white.a, (w1.a + w2.a + w4.a) / 3, 0.01);
}

TEST_F(It8Scan, XyzConversionTakesTheFirstLoadedProfilesIlluminant) {
    const auto lut = test::MakeLut(4, 3, 2, [](const std::vector<int>&, int) { return uint16_t{32768}; });
    auto build = [&](const char* name, double x, double y, double z) {
        test::IccBuilder profile("CMYK", "Lab ");
        profile.Illuminant(x, y, z).AddTag("A2B1", test::Mft2Tag(lut)).AddTag("B2A1", test::Mft2Tag(test::MakeLut(
            3, 4, 2, [](const std::vector<int>&, int) { return uint16_t{0}; })));
        return test::WriteFile(dir.File(name), profile.Build());
    };
    const std::string d65 = build("d65.icc", 0.9505, 1.0, 1.089);
    const std::string a = build("a.icc", 1.0985, 1.0, 0.3558);
    auto load = [](CProfil& p, const std::string& path) {
        p.ReadTagTable(0, path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
        ASSERT_TRUE(p.HoldsTables());
    };
    const double whiteD65[3] = {0.9505, 1.0, 1.089}, whiteA[3] = {1.0985, 1.0, 0.3558};

    load(*tool.m_ISDprof, a);
    Lab lab = tool.MeasuredXyzToLab(40, 42, 30);
    Lab expected = CieLab(40, 42, 30, whiteA);
    ExpectLab(lab, expected.L, expected.a, expected.b, 0.02);

    load(*tool.m_Refprof, d65);  // the reference profile comes before the ISD profile
    lab = tool.MeasuredXyzToLab(40, 42, 30);
    expected = CieLab(40, 42, 30, whiteD65);
    ExpectLab(lab, expected.L, expected.a, expected.b, 0.02);
    ExpectLab(tool.MeasuredXyzToLab(95.05, 100, 108.9), 100, 0, 0, 0.01);

    load(*tool.m_Outprof, a);  // the 3CC profile comes first of all
    expected = CieLab(40, 42, 30, whiteA);
    ExpectLab(tool.MeasuredXyzToLab(40, 42, 30), expected.L, expected.a, expected.b, 0.02);

    tool.m_Outprof->Release();
    tool.m_Refprof->Release();
    tool.m_ISDprof->Release();
    ExpectLab(tool.MeasuredXyzToLab(96.42, 100, 82.49), 100, 0, 0, 1e-9);
}

TEST_F(It8Scan, PaperWhiteOfTheCharacterisationData) {
    // The FOGRA and TR data against the same rule applied to the plain text of the file.
    for (const char* name : {"FOGRA39L.ti3", "TR002.ti3", "TR006.ti3"}) {
        const std::string path = test::SystemIccDir() + name;
        if (!std::filesystem::exists(path)) GTEST_SKIP() << path << " missing";
        ASSERT_EQ(it8.ReadIt8(path), 0);
        double sum[3] = {0, 0, 0};
        int count = 0;
        std::istringstream text(test::it8::ReadFile(path));
        bool data = false;
        for (std::string line; std::getline(text, line);) {
            std::istringstream words(line);
            std::vector<std::string> w;
            for (std::string s; words >> s;) w.push_back(s);
            if (w.empty()) continue;
            if (w[0] == "BEGIN_DATA") { data = true; continue; }
            if (w[0] == "END_DATA") break;
            if (!data) continue;
            // SAMPLE_ID C M Y K X Y Z L a b
            if (std::stod(w[1]) == 0 && std::stod(w[2]) == 0 && std::stod(w[3]) == 0 && std::stod(w[4]) < 1) {
                for (int c = 0; c < 3; ++c) sum[c] += std::stod(w[8 + static_cast<std::size_t>(c)]);
                ++count;
            }
        }
        ASSERT_GT(count, 0) << name;
        const Lab white = tool.ScanIt8ForWhitePoint(it8);
        ExpectLab(white, sum[0] / count, sum[1] / count, sum[2] / count, 1e-9);
    }
}
