// The three conversion exports, called as a host calls them, against the measured data and
// against Argyll's xicclu and lcms2 on the same profiles.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <random>

#include "helpers/icc_builder.h"
#include "helpers/ti3_chart.h"
#include "helpers/tool_handle.h"
#include "helpers/xicclu.h"
#include "interface/host_number.h"

using namespace vantrel::test;
using Rows = std::vector<std::vector<double>>;

namespace {

// Converts rows of whole device numbers through an export and prints and returns the mean and
// maximum colour difference to `want`.
std::pair<double, double> Compare(decltype(&Cmyk2Lab_Double) convert, const std::string& profile, const Rows& rows,
                                  const std::vector<std::array<double, 3>>& want, const std::string& oracle) {
    EXPECT_EQ(want.size(), rows.size()) << profile;
    if (want.size() != rows.size()) return {1e9, 1e9};
    ToolHandle tool;
    std::vector<int> in, lab(3 * rows.size()), xyz(3 * rows.size());
    for (const auto& row : rows)
        for (double v : row) in.push_back(static_cast<int>(std::lround(v)));
    EXPECT_EQ(convert(tool.h, profile.c_str(), static_cast<int>(rows.size()), in.data(), 0, lab.data(), 0,
                      xyz.data()),
              0);
    double mean = 0, max = 0;
    for (size_t i = 0; i < rows.size(); ++i) {
        const double e = std::hypot(lab[3 * i] / 1000.0 - want[i][0], lab[3 * i + 1] / 1000.0 - want[i][1],
                                    lab[3 * i + 2] / 1000.0 - want[i][2]);
        mean += e / static_cast<double>(rows.size());
        max = std::max(max, e);
    }
    std::printf("[ %-8s ] %s: %zu colours, mean dE76 %.3f, max %.3f\n", oracle.c_str(), profile.c_str(), rows.size(),
                mean, max);
    return {mean, max};
}

// lcms2 in absolute colorimetric intent, for profiles xicclu does not read.
std::vector<std::array<double, 3>> LcmsAbsoluteLab(const std::string& profile, const Rows& cmyk) {
    cmsHPROFILE in = cmsOpenProfileFromFile(profile.c_str(), "r"), lab = cmsCreateLab4Profile(nullptr);
    cmsHTRANSFORM t = cmsCreateTransform(in, TYPE_CMYK_DBL, lab, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC,
                                         cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
    std::vector<std::array<double, 3>> labs(t ? cmyk.size() : 0);
    for (std::size_t i = 0; i < labs.size(); ++i) cmsDoTransform(t, cmyk[i].data(), labs[i].data(), 1);
    if (t) cmsDeleteTransform(t);
    cmsCloseProfile(lab);
    cmsCloseProfile(in);
    return labs;
}

}  // namespace

TEST(CmykConversion, ArgyllProfilesReproduceTheirMeasurements) {
    for (const char* name : {"FOGRA39L", "TR003"}) {
        const std::string profile = FixtureProfile(name);
        if (profile.empty()) GTEST_SKIP() << "no Argyll fixture " << name;
        Rows cmyk;
        std::vector<std::array<double, 3>> measured;
        for (const ChartPatch& p : ReadCmykChart(SystemIccDir() + name + ".ti3")) {
            if (std::any_of(p.cmyk.begin(), p.cmyk.end(), [](double v) { return v != std::floor(v); })) continue;
            cmyk.push_back({p.cmyk.begin(), p.cmyk.end()});
            measured.push_back(p.lab);
        }
        ASSERT_GT(cmyk.size(), 900u);
        const auto [mean, max] = Compare(Cmyk2Lab_Double, profile, cmyk, measured, "measured");
        EXPECT_LT(mean, 1.0);
        EXPECT_LT(max, 6.0);
    }
}

TEST(CmykConversion, AgreesWithXiccluInAbsoluteIntent) {
    if (!HaveXicclu()) GTEST_SKIP() << "no xicclu";
    std::vector<std::string> profiles = {SystemIccDir() + "ghostscript/default_cmyk.icc"};
    for (const char* name : {"FOGRA39L", "TR003"})
        if (!FixtureProfile(name).empty()) profiles.push_back(FixtureProfile(name));
    std::mt19937 random(5);
    std::uniform_int_distribution<int> percent(0, 100);
    Rows cmyk = {{0, 0, 0, 0}, {100, 100, 100, 100}, {100, 0, 0, 0}, {0, 0, 0, 100}};
    while (cmyk.size() < 400)
        cmyk.push_back({double(percent(random)), double(percent(random)), double(percent(random)),
                        double(percent(random))});
    for (const std::string& profile : profiles) {
        if (!std::filesystem::exists(profile)) continue;
        const auto [mean, max] =
            Compare(Cmyk2Lab_Double, profile, cmyk, XiccluAbsoluteLab(profile, cmyk, 100), "xicclu");
        EXPECT_LT(mean, 0.5) << profile;
        EXPECT_LT(max, 3.0) << profile;
    }
}

TEST(CmykConversion, AnXyzTableAgreesWithLcmsOnItsNodes) {
    // ghostscript's ps_cmyk: a coarse five-point XYZ table that xicclu does not read. Between the
    // nodes tetrahedral schemes of different shapes part widely on it; on the nodes they agree.
    const std::string profile = SystemIccDir() + "ghostscript/ps_cmyk.icc";
    if (!std::filesystem::exists(profile)) GTEST_SKIP() << "no ghostscript profiles";
    Rows nodes;
    for (int i = 0; i < 625; ++i)
        nodes.push_back({25.0 * (i / 125), 25.0 * (i / 25 % 5), 25.0 * (i / 5 % 5), 25.0 * (i % 5)});
    const auto [mean, max] = Compare(Cmyk2Lab_Double, profile, nodes, LcmsAbsoluteLab(profile, nodes), "lcms2");
    EXPECT_LT(mean, 0.5);
    EXPECT_LT(max, 2.0);
}

TEST(RgbConversion, MatrixTrcProfilesAgreeWithXicclu) {
    if (!HaveXicclu()) GTEST_SKIP() << "no xicclu";
    std::mt19937 random(9);
    std::uniform_int_distribution<int> value(0, 255);
    Rows rgb = {{0, 0, 0}, {255, 255, 255}, {255, 0, 0}, {0, 255, 0}, {0, 0, 255}};
    while (rgb.size() < 300) rgb.push_back({double(value(random)), double(value(random)), double(value(random))});
    for (const std::string name :
         {"sRGB.icc", "compatibleWithAdobeRGB1998.icc", "ghostscript/srgb.icc", "ghostscript/esrgb.icc"}) {
        const std::string profile = SystemIccDir() + name;
        if (!std::filesystem::exists(profile)) continue;
        auto oracle = XiccluAbsoluteLab(profile, rgb, 255);
        // The library keeps a* and b* inside -128..127 after adaptation; so does the comparison.
        for (auto& lab : oracle)
            for (int k = 1; k < 3; ++k) lab[k] = std::clamp(lab[k], -128.0, 127.0);
        const auto [mean, max] = Compare(RGB2Lab_Double, profile, rgb, oracle, "xicclu");
        EXPECT_LT(mean, 1.0) << name;
        EXPECT_LT(max, 4.0) << name;
    }
}

TEST(Conversion, DeviceScalesReachTheTableEndsAndXyzIsAgainstTheHeaderIlluminant) {
    // Tables whose L* rises linearly with the first channel: CMYK percent 0 and 100 reach its ends,
    // RGB goes as it is. The profile's illuminant is D65; XYZ of its white is that illuminant.
    TempDir dir;
    ToolHandle tool;
    int lab[9], xyz[9];
    for (const char* space : {"CMYK", "RGB "}) {
        const int channels = space[0] == 'C' ? 4 : 3;
        IccBuilder builder(space, "Lab ");
        builder.Illuminant(0.9505, 1.0, 1.089)
            .AddTag("A2B1", Mft2Tag(MakeLut(channels, 3, 2, [](const std::vector<int>& node, int out) -> uint16_t {
                        return out == 0 ? (node[0] ? 65535 : 0) : 32896;  // a*, b* 0 in the 16-bit encoding
                    })))
            .AddTag("wtpt", XyzTag(0.9505, 1.0, 1.089));
        const std::string path = WriteFile(dir.File(std::string(space, 3) + ".icc"), builder.Build());
        int cmyk[12] = {100, 0, 0, 0, 50, 0, 0, 0, 0, 0, 0, 0};
        int rgb[6] = {255, 255, 255, 51, 0, 0};
        ASSERT_EQ(channels == 4 ? Cmyk2Lab_Double(tool.h, path.c_str(), 3, cmyk, 0, lab, 0, xyz)
                                : RGB2Lab_Double(tool.h, path.c_str(), 2, rgb, 0, lab, 0, xyz),
                  0);
        EXPECT_NEAR(lab[0], 100000, 400) << space;
        if (channels == 4) {
            EXPECT_NEAR(lab[3], 50000, 50);  // 50 % is 127.5 of 255, half way
            EXPECT_NEAR(lab[6], 0, 400);
        } else {
            EXPECT_NEAR(lab[3], 20000, 50);  // 51 of 255 is a fifth of the way, not 51 %
        }
        EXPECT_NEAR(xyz[0], 95050, 1000) << space;
        EXPECT_NEAR(xyz[2], 108900, 1000) << space;
    }
    // With nothing loaded the white is D50 itself.
    const vantrel::XYZ d50 = tool.Tool().LabToXYZ(100, 0, 0);
    EXPECT_EQ(vantrel::ToHostInt(d50.X), 96420);
    EXPECT_EQ(vantrel::ToHostInt(d50.Y), 100000);
    EXPECT_EQ(vantrel::ToHostInt(d50.Z), 82490);
}

TEST(Conversion, BadProfilesAndCountsReturnTheirResultsWithoutHarm) {
    TempDir dir;
    ToolHandle tool;
    int in[7 * 4] = {10, 20, 30, 40, 50, 60, 70};
    int lab[3 * 4] = {}, xyz[3 * 4] = {};
    // Missing file, a directory, a truncated profile, a table of 15 inputs: the export still answers 0.
    IccBuilder good("CMYK", "Lab ");
    good.AddTag("A2B1", Mft2Tag(MakeLut(4, 3, 2, [](const std::vector<int>&, int) -> uint16_t { return 1000; })));
    const Bytes bytes = good.Build();
    WriteFile(dir.File("truncated.icc"), Bytes(bytes.begin(), bytes.begin() + bytes.size() / 2));
    Bytes fifteen = bytes;
    fifteen[TagOffset(fifteen, 0) + 8] = 15;
    WriteFile(dir.File("fifteen.icc"), fifteen);
    for (const std::string& profile :
         {dir.File("missing.icc"), dir.Path(), dir.File("truncated.icc"), dir.File("fifteen.icc")}) {
        for (auto convert : {Cmyk2Lab_Double, Cmykrgb2Lab_Double, RGB2Lab_Double})
            EXPECT_EQ(convert(tool.h, profile.c_str(), 4, in, 0, lab, 0, xyz), 0) << profile;
    }
    // A negative count converts nothing; null arrays with records to convert are refused.
    int untouched[3] = {7, 7, 7};
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, dir.File("missing.icc").c_str(), -5, in, 0, untouched, 0, untouched), 0);
    EXPECT_EQ(untouched[0], 7);
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, dir.File("missing.icc").c_str(), 1, nullptr, 0, lab, 0, xyz), -1);
    // Seven channels through a CMYK profile.
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (!fogra.empty()) {
        EXPECT_EQ(Cmykrgb2Lab_Double(tool.h, fogra.c_str(), 4, in, 0, lab, 0, xyz), 0);
    }
    // The reference slot holds no tables after any of these.
    EXPECT_FALSE(tool.Tool().m_Refprof->HoldsTables());
}
