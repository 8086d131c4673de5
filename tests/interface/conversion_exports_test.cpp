// The three conversion exports, called as a host calls them, against the measured data and
// against Argyll's xicclu on the same profiles.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <fstream>
#include <random>

#include <lcms2.h>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "helpers/ti3_chart.h"
#include "helpers/xicclu.h"
#include "interface/host_number.h"
#include "interface/tool_object.h"
#include "vantrel.h"

using namespace vantrel::test;

namespace {

int Quiet(const char*, int, int) { return 0; }

struct Tool {
    void* h = nullptr;
    Tool() { dllInit(Quiet, &h, nullptr); }
    ~Tool() { dllFree(h); }
};

double DeltaE(const double* a, const double* b) {
    return std::sqrt((a[0] - b[0]) * (a[0] - b[0]) + (a[1] - b[1]) * (a[1] - b[1]) + (a[2] - b[2]) * (a[2] - b[2]));
}

struct Agreement {
    double mean = 0, max = 0;
};

// Converts whole-percent CMYK patches through the export and compares them with `want`.
Agreement CompareCmyk(const std::string& profile, const std::vector<std::array<double, 4>>& cmyk,
                      const std::vector<std::array<double, 3>>& want) {
    Tool tool;
    std::vector<int> in, lab(3 * cmyk.size()), xyz(3 * cmyk.size());
    for (const auto& p : cmyk)
        for (double v : p) in.push_back(static_cast<int>(std::lround(v)));
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, profile.c_str(), static_cast<int>(cmyk.size()), in.data(), 0, lab.data(), 0,
                              xyz.data()),
              0);
    Agreement a;
    for (size_t i = 0; i < cmyk.size(); ++i) {
        const double got[3] = {lab[3 * i] / 1000.0, lab[3 * i + 1] / 1000.0, lab[3 * i + 2] / 1000.0};
        const double e = DeltaE(got, want[i].data());
        a.mean += e;
        a.max = std::max(a.max, e);
    }
    a.mean /= static_cast<double>(cmyk.size());
    return a;
}

// lcms2 in absolute colorimetric intent, for profiles xicclu does not read.
std::vector<std::array<double, 3>> LcmsAbsoluteLab(const std::string& profile,
                                                  const std::vector<std::array<double, 4>>& cmyk) {
    std::vector<std::array<double, 3>> labs;
    cmsHPROFILE in = cmsOpenProfileFromFile(profile.c_str(), "r");
    if (!in) return labs;
    cmsHPROFILE lab = cmsCreateLab4Profile(nullptr);
    cmsHTRANSFORM t = cmsCreateTransform(in, TYPE_CMYK_DBL, lab, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC,
                                         cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
    if (t) {
        for (const auto& p : cmyk) {
            cmsCIELab out;
            cmsDoTransform(t, p.data(), &out, 1);
            labs.push_back({out.L, out.a, out.b});
        }
        cmsDeleteTransform(t);
    }
    cmsCloseProfile(lab);
    cmsCloseProfile(in);
    return labs;
}

}  // namespace

TEST(CmykConversion, ArgyllProfilesReproduceTheirMeasurements) {
    for (const char* name : {"FOGRA39L", "TR003"}) {
        const std::string profile = FixtureProfile(name);
        if (profile.empty()) GTEST_SKIP() << "no Argyll fixture " << name;
        std::vector<std::array<double, 4>> cmyk;
        std::vector<std::array<double, 3>> measured;
        for (const ChartPatch& p : ReadCmykChart(SystemIccDir() + name + ".ti3")) {
            bool whole = true;
            for (double v : p.cmyk) whole = whole && v == std::floor(v);
            if (!whole) continue;
            cmyk.push_back(p.cmyk);
            measured.push_back(p.lab);
        }
        ASSERT_GT(cmyk.size(), 900u);
        const Agreement a = CompareCmyk(profile, cmyk, measured);
        std::printf("[ measured ] %s: %zu patches, mean dE76 %.3f, max %.3f\n", name, cmyk.size(), a.mean, a.max);
        EXPECT_LT(a.mean, 1.0);
        EXPECT_LT(a.max, 6.0);
    }
}

TEST(CmykConversion, AgreesWithXiccluInAbsoluteIntent) {
    if (!HaveXicclu()) GTEST_SKIP() << "no xicclu";
    std::vector<std::string> profiles = {SystemIccDir() + "ghostscript/default_cmyk.icc"};
    for (const char* name : {"FOGRA39L", "TR003"})
        if (!FixtureProfile(name).empty()) profiles.push_back(FixtureProfile(name));
    std::mt19937 random(5);
    std::uniform_int_distribution<int> percent(0, 100);
    std::vector<std::array<double, 4>> cmyk = {{0, 0, 0, 0}, {100, 100, 100, 100}, {100, 0, 0, 0}, {0, 0, 0, 100}};
    while (cmyk.size() < 400)
        cmyk.push_back({double(percent(random)), double(percent(random)), double(percent(random)),
                        double(percent(random))});
    for (const std::string& profile : profiles) {
        if (!std::filesystem::exists(profile)) continue;
        std::vector<std::vector<double>> input;
        for (const auto& p : cmyk) input.push_back({p[0], p[1], p[2], p[3]});
        const auto oracle = XiccluAbsoluteLab(profile, input, 100);
        ASSERT_EQ(oracle.size(), cmyk.size()) << profile;
        const Agreement a = CompareCmyk(profile, cmyk, oracle);
        std::printf("[ xicclu   ] %s: mean dE76 %.3f, max %.3f\n", profile.c_str(), a.mean, a.max);
        EXPECT_LT(a.mean, 0.5) << profile;
        EXPECT_LT(a.max, 3.0) << profile;
    }
}

TEST(CmykConversion, AnXyzTableAgreesWithLcmsOnItsNodes) {
    // ghostscript's ps_cmyk: a coarse five-point XYZ table that xicclu does not read. Between the
    // nodes tetrahedral schemes of different shapes part widely on it; on the nodes they agree.
    const std::string profile = SystemIccDir() + "ghostscript/ps_cmyk.icc";
    if (!std::filesystem::exists(profile)) GTEST_SKIP() << "no ghostscript profiles";
    std::vector<std::array<double, 4>> nodes;
    for (int c = 0; c <= 100; c += 25)
        for (int m = 0; m <= 100; m += 25)
            for (int y = 0; y <= 100; y += 25)
                for (int k = 0; k <= 100; k += 25) nodes.push_back({double(c), double(m), double(y), double(k)});
    const auto oracle = LcmsAbsoluteLab(profile, nodes);
    ASSERT_EQ(oracle.size(), nodes.size());
    const Agreement a = CompareCmyk(profile, nodes, oracle);
    std::printf("[ lcms2    ] %s nodes: mean dE76 %.3f, max %.3f\n", profile.c_str(), a.mean, a.max);
    EXPECT_LT(a.mean, 0.5);
    EXPECT_LT(a.max, 2.0);
}

TEST(RgbConversion, MatrixTrcProfilesAgreeWithXicclu) {
    if (!HaveXicclu()) GTEST_SKIP() << "no xicclu";
    std::mt19937 random(9);
    std::uniform_int_distribution<int> value(0, 255);
    std::vector<std::array<int, 3>> rgb = {{0, 0, 0}, {255, 255, 255}, {255, 0, 0}, {0, 255, 0}, {0, 0, 255}};
    while (rgb.size() < 300) rgb.push_back({value(random), value(random), value(random)});
    std::vector<std::vector<double>> rows;
    std::vector<int> in;
    for (const auto& p : rgb) {
        rows.push_back({double(p[0]), double(p[1]), double(p[2])});
        in.insert(in.end(), p.begin(), p.end());
    }
    for (const std::string name : {"sRGB.icc", "compatibleWithAdobeRGB1998.icc", "ghostscript/srgb.icc",
                                   "ghostscript/esrgb.icc"}) {
        const std::string profile = SystemIccDir() + name;
        if (!std::filesystem::exists(profile)) continue;
        auto oracle = XiccluAbsoluteLab(profile, rows, 255);
        // The library keeps a* and b* inside -128..127 after adaptation; so does the comparison.
        for (auto& lab : oracle)
            for (int k = 1; k < 3; ++k) lab[k] = std::clamp(lab[k], -128.0, 127.0);
        ASSERT_EQ(oracle.size(), rgb.size()) << profile;
        Tool tool;
        std::vector<int> lab(3 * rgb.size()), xyz(3 * rgb.size());
        ASSERT_EQ(RGB2Lab_Double(tool.h, profile.c_str(), static_cast<int>(rgb.size()), in.data(), 0, lab.data(), 0,
                                 xyz.data()),
                  0);
        Agreement a;
        for (size_t i = 0; i < rgb.size(); ++i) {
            const double got[3] = {lab[3 * i] / 1000.0, lab[3 * i + 1] / 1000.0, lab[3 * i + 2] / 1000.0};
            const double e = DeltaE(got, oracle[i].data());
            a.mean += e;
            a.max = std::max(a.max, e);
        }
        a.mean /= static_cast<double>(rgb.size());
        std::printf("[ xicclu   ] %s: mean dE76 %.3f, max %.3f\n", name.c_str(), a.mean, a.max);
        EXPECT_LT(a.mean, 1.0) << name;
        EXPECT_LT(a.max, 4.0) << name;
    }
}

TEST(Conversion, XyzOfTheWhiteIsTheHeaderIlluminant) {
    const std::string profile = FixtureProfile("FOGRA39L");
    if (profile.empty()) GTEST_SKIP() << "no Argyll fixture";
    // The illuminant as the file's header holds it, decoded here byte by byte.
    std::ifstream file(profile, std::ios::binary);
    unsigned char header[80];
    file.read(reinterpret_cast<char*>(header), sizeof header);
    int want[3];
    for (int k = 0; k < 3; ++k) {
        const unsigned char* v = header + 68 + 4 * k;
        const double value = (v[0] << 8 | v[1]) + (v[2] << 8 | v[3]) / 65536.0;
        want[k] = static_cast<int>(value * 100 * 1000 + 0.5);
    }
    Tool tool;
    auto& t = *static_cast<vantrel::CIterativtoolDlg*>(tool.h);
    t.m_RefName = profile;
    t.LoadRefProfile();
    const vantrel::XYZ white = t.LabToXYZ(100, 0, 0);
    EXPECT_EQ(vantrel::ToHostInt(white.X), want[0]);
    EXPECT_EQ(vantrel::ToHostInt(white.Y), want[1]);
    EXPECT_EQ(vantrel::ToHostInt(white.Z), want[2]);
    t.m_Refprof->Release();
    // With nothing loaded the white is D50 itself.
    const vantrel::XYZ d50 = t.LabToXYZ(100, 0, 0);
    EXPECT_EQ(vantrel::ToHostInt(d50.X), 96420);
    EXPECT_EQ(vantrel::ToHostInt(d50.Y), 100000);
    EXPECT_EQ(vantrel::ToHostInt(d50.Z), 82490);
}

TEST(Conversion, CmykPercentReachesTheDeviceEndsAndRgbIsNotScaled) {
    // A CMYK -> Lab table whose L* falls linearly with cyan: percent 0 and 100 must reach its ends.
    TempDir dir;
    auto lut = MakeLut(4, 3, 2, [](const std::vector<int>& node, int out) -> uint16_t {
        if (out == 0) return node[0] ? 0 : 65535;
        return 32896;  // a*, b* 0 in the 16-bit encoding
    });
    IccBuilder cmyk("CMYK", "Lab ");
    cmyk.AddTag("A2B1", Mft2Tag(lut)).AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249));
    const std::string path = WriteFile(dir.File("cmyk.icc"), cmyk.Build());
    Tool tool;
    int in[8] = {0, 0, 0, 0, 100, 0, 0, 0};
    int lab[6], xyz[6];
    ASSERT_EQ(Cmyk2Lab_Double(tool.h, path.c_str(), 2, in, 0, lab, 0, xyz), 0);
    EXPECT_NEAR(lab[0], 100000, 400);
    EXPECT_NEAR(lab[3], 0, 400);

    auto rgbLut = MakeLut(3, 3, 2, [](const std::vector<int>& node, int out) -> uint16_t {
        if (out == 0) return node[0] ? 65535 : 0;
        return 32896;
    });
    IccBuilder rgb("RGB ", "Lab ");
    rgb.AddTag("A2B1", Mft2Tag(rgbLut)).AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249));
    const std::string rgbPath = WriteFile(dir.File("rgb.icc"), rgb.Build());
    int rgbIn[6] = {255, 255, 255, 51, 0, 0};
    ASSERT_EQ(RGB2Lab_Double(tool.h, rgbPath.c_str(), 2, rgbIn, 0, lab, 0, xyz), 0);
    EXPECT_NEAR(lab[0], 100000, 400);
    EXPECT_NEAR(lab[3], 20000, 400);  // 51 of 255 is a fifth of the way, not 51 %
}

TEST(Conversion, BadProfilesAndCountsReturnTheirResultsWithoutHarm) {
    TempDir dir;
    Tool tool;
    int in[7 * 4] = {10, 20, 30, 40, 50, 60, 70};
    int lab[3 * 4] = {}, xyz[3 * 4] = {};
    // Missing file, a directory, a truncated profile, a table of 15 inputs: the export still answers 0.
    auto wide = MakeLut(4, 3, 2, [](const std::vector<int>&, int) -> uint16_t { return 1000; });
    IccBuilder good("CMYK", "Lab ");
    good.AddTag("A2B1", Mft2Tag(wide));
    auto bytes = good.Build();
    WriteFile(dir.File("truncated.icc"), Bytes(bytes.begin(), bytes.begin() + bytes.size() / 2));
    Bytes fifteen = bytes;
    fifteen[TagOffset(fifteen, 0) + 8] = 15;
    WriteFile(dir.File("fifteen.icc"), fifteen);
    for (const std::string& profile : {dir.File("missing.icc"), dir.Path(), dir.File("truncated.icc"),
                                       dir.File("fifteen.icc")}) {
        EXPECT_EQ(Cmyk2Lab_Double(tool.h, profile.c_str(), 4, in, 0, lab, 0, xyz), 0) << profile;
        EXPECT_EQ(Cmykrgb2Lab_Double(tool.h, profile.c_str(), 4, in, 0, lab, 0, xyz), 0) << profile;
        EXPECT_EQ(RGB2Lab_Double(tool.h, profile.c_str(), 4, in, 0, lab, 0, xyz), 0) << profile;
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
    EXPECT_FALSE(static_cast<vantrel::CIterativtoolDlg*>(tool.h)->m_Refprof->HoldsTables());
}
