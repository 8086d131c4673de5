// Forward evaluation of real profiles against lcms2 on the same tags and intents. The two
// differ only where the interpolation schemes differ (lcms2 interpolates four-input tables as
// tetrahedra in CMY blended along K, and output curves after the grid).
#include <gtest/gtest.h>

#include <random>

#include "eval/forward.h"
#include "eval_oracle.h"
#include "icc/profil.h"
#include "synthetic_profiles.h"

namespace vantrel {
namespace {

using namespace test;

struct CmykCase {
    const char* name;
    std::string path;
    const char* a2b;
    cmsUInt32Number intent;
    double meanLimit, maxLimit;
};

std::vector<std::vector<double>> CmykSamples() {
    std::vector<std::vector<double>> samples;
    for (int c = 0; c <= 8; ++c)
        for (int m = 0; m <= 8; ++m)
            for (int y = 0; y <= 8; ++y)
                for (int k = 0; k <= 8; ++k) samples.push_back({c * 31.875, m * 31.875, y * 31.875, k * 31.875});
    std::mt19937 rng(7);
    std::uniform_real_distribution<double> value(0, 255);
    for (int i = 0; i < 3000; ++i) samples.push_back({value(rng), value(rng), value(rng), value(rng)});
    return samples;
}

DeltaStats CompareCmyk(const CmykCase& c, bool mediaWhite) {
    DeltaStats stats;
    CProfil p;
    p.m_UseMediaWhite[0] = mediaWhite;
    p.ReadTagTable(0, c.path);
    const bool loaded = p.LoadLut(0, c.a2b, c.path) == 1;
    EXPECT_TRUE(loaded) << c.name;
    LcmsTransform oracle(c.path, TYPE_CMYK_DBL, true, mediaWhite ? INTENT_ABSOLUTE_COLORIMETRIC : c.intent);
    EXPECT_TRUE(oracle.ok()) << c.name;
    if (!loaded || !oracle.ok()) return stats;
    for (const auto& s : CmykSamples()) {
        double v[4] = {s[0], s[1], s[2], s[3]};
        EXPECT_EQ(CmykToLab(p, v), 1);
        const Lab ours{v[0] / 2.55, v[1], v[2]};
        stats.Add(Difference(ours, OracleToLab(oracle, s.data(), 4)));
    }
    return stats;
}

std::vector<CmykCase> CmykCases() {
    std::vector<CmykCase> cases;
    auto add = [&cases](const char* name, const std::string& path, const char* tag, cmsUInt32Number intent,
                        double meanLimit, double maxLimit) {
        if (!path.empty()) cases.push_back({name, path, tag, intent, meanLimit, maxLimit});
    };
    add("FOGRA39L A2B1", FixtureProfile("FOGRA39L"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 0.5, 3.0);
    add("TR003 A2B1", FixtureProfile("TR003"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 0.8, 5.0);
    add("default_cmyk A2B1", SystemProfile("ghostscript/default_cmyk.icc"), "A2B1", INTENT_RELATIVE_COLORIMETRIC,
        0.5, 3.0);
    add("default_cmyk A2B0", SystemProfile("ghostscript/default_cmyk.icc"), "A2B0", INTENT_PERCEPTUAL, 0.5, 3.0);
    // An XYZ-PCS profile with only A2B0: asked for A2B1 it falls back to A2B0, as lcms2 does. Its
    // five-point grid is far from linear (a* swings by 120 across one cell), where a four-input
    // simplex and lcms2's CMY tetrahedra blended along K part by up to 30 between the nodes; on
    // the nodes they agree.
    add("ps_cmyk (XYZ) A2B0", SystemProfile("ghostscript/ps_cmyk.icc"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 1.5,
        35.0);
    return cases;
}

TEST(ForwardEvaluation, CmykProfilesAgreeWithLcmsOnTheSameTables) {
    const auto cases = CmykCases();
    if (cases.empty()) GTEST_SKIP() << "no CMYK profiles available";
    for (const auto& c : cases) {
        const DeltaStats stats = CompareCmyk(c, false);
        stats.Report(std::string(c.name) + " CmykToLab vs lcms2");
        EXPECT_LT(stats.Mean(), c.meanLimit) << c.name;
        EXPECT_LT(stats.max, c.maxLimit) << c.name;
    }
}

TEST(ForwardEvaluation, AbsoluteColorimetryFollowsTheMediaWhite) {
    // lcms2 scales XYZ by the media white where we adapt with Bradford: close, not equal.
    for (const auto& c : CmykCases()) {
        const DeltaStats stats = CompareCmyk(c, true);
        stats.Report(std::string(c.name) + " absolute vs lcms2");
        EXPECT_LT(stats.Mean(), c.meanLimit + 0.7) << c.name;
        EXPECT_LT(stats.max, c.maxLimit + 2.0) << c.name;
    }
}

TEST(ForwardEvaluation, MatrixTrcRgbProfilesAgreeWithLcms) {
    const char* names[] = {"sRGB.icc", "compatibleWithAdobeRGB1998.icc", "ghostscript/srgb.icc",
                           "ghostscript/a98.icc"};
    int tested = 0;
    for (const char* name : names) {
        const std::string path = SystemProfile(name);
        if (path.empty()) continue;
        ++tested;
        CProfil p;
        p.ReadTagTable(0, path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1) << name;
        ASSERT_EQ(p.m_Lut[0].type, "MATR") << name;
        LcmsTransform oracle(path, TYPE_RGB_DBL, true, INTENT_RELATIVE_COLORIMETRIC);
        ASSERT_TRUE(oracle.ok()) << name;
        DeltaStats stats;
        for (int r = 0; r <= 255; r += 15)
            for (int g = 0; g <= 255; g += 15)
                for (int b = 0; b <= 255; b += 15) {
                    const double device[3] = {double(r), double(g), double(b)};
                    double v[3] = {device[0], device[1], device[2]};
                    RgbToLab(p, v);
                    stats.Add(Difference(Lab{v[0] / 2.55, v[1], v[2]}, OracleToLab(oracle, device, 3)));
                }
        stats.Report(std::string(name) + " RgbToLab vs lcms2");
        EXPECT_LT(stats.Mean(), 0.3) << name;
        EXPECT_LT(stats.max, 1.5) << name;
    }
    if (tested == 0) GTEST_SKIP() << "no RGB profiles available";
}

// out0 = 255 f0 f1: the multilinear kernel gives 63.75 at (0.5, 0.5), the simplex one 127.5.
double Product(const std::vector<double>& f, int out) { return out == 0 ? 255.0 * f[0] * f[1] : 0.0; }

TEST(ForwardEvaluation, DirectionOneTablesGetTheKernelOfTheirColourSpace) {
    TempDir dir;
    struct Case {
        const char* space;
        int channels;
        double expected;
    };
    // Seven colourants get the multilinear kernel whichever of their two names the file uses.
    const Case cases[] = {{"CMYK", 4, 127.5}, {"6CLR", 6, 63.75}, {"MCH6", 6, 63.75}, {"7CLR", 7, 63.75},
                          {"MCH7", 7, 63.75}};
    for (const Case& c : cases) {
        CProfil p;
        WriteAndLoad(p, dir, std::string(c.space) + ".icc", c.space,
                     {{"B2A1", Mft2Tag(DeviceLut(c.channels, c.channels, 2, Product))}});
        ASSERT_EQ(p.m_Lut[1].inputChannels, c.channels) << c.space;
        double v[20] = {};
        v[0] = v[1] = 127.5;
        v[7] = -1;  // past the outputs: left alone
        EXPECT_EQ(EvaluateDirection1(p, v), 1);
        EXPECT_NEAR(v[0], c.expected, 1e-9) << c.space;
        EXPECT_NEAR(v[1], 0.0, 1e-9) << c.space;
        EXPECT_EQ(v[7], -1) << c.space;
    }
}

TEST(ForwardEvaluation, PaperWhiteOfTheDeviceTableUsesTheTableKernel) {
    // The PCS white (255, 127.5, 127.5) sits at fractions (1, 0.5, 0.5): out0 = 255 f1 f2 is 63.75
    // by the multilinear kernel, 127.5 by the simplex one; the other outputs are constants.
    auto table = [](const std::vector<double>& f, int out) { return out == 0 ? 255.0 * f[1] * f[2] : 10.0 * out; };
    TempDir dir;
    struct Case {
        const char* space;
        int channels;
        int first;
    };
    const Case cases[] = {{"CMYK", 4, 128}, {"6CLR", 6, 64}, {"MCH7", 7, 64}};
    for (const Case& c : cases) {
        CProfil p;
        WriteAndLoad(p, dir, std::string(c.space) + "w.icc", c.space,
                     {{"A2B1", Mft2Tag(DeviceToLabLut(c.channels, 2, [](const std::vector<double>&) {
                           return Lab{50, 0, 0};
                       }))},
                      {"B2A1", Mft2Tag(DeviceLut(3, c.channels, 2, table))}},
                     true);
        ASSERT_EQ(p.m_Lut[1].outputChannels, c.channels) << c.space;
        EXPECT_EQ(p.m_PaperWhite[1][0], c.first) << c.space;
        for (int k = 1; k < c.channels; ++k) EXPECT_EQ(p.m_PaperWhite[1][k], 10 * k) << c.space;
    }
}

TEST(ForwardEvaluation, LabThroughTableInEitherSlot) {
    // A Lab-to-Lab table that scales every colour by 0.9 and adds (2, -3, 4).
    auto shift = [](const std::vector<double>& f) {
        return Lab{0.9 * f[0] * 100.0 + 2.0, 0.9 * (f[1] * 255.0 - 127.5) - 3.0, 0.9 * (f[2] * 255.0 - 127.5) + 4.0};
    };
    TempDir dir;
    CProfil p;
    WriteAndLoad(p, dir, "abst.icc", "Lab ",
                 {{"A2B1", Mft2Tag(DeviceToLabLut(3, 2, shift))}, {"B2A1", Mft2Tag(DeviceToLabLut(3, 2, shift))}});
    for (int slot = 0; slot < 2; ++slot) {
        double v[3] = {50.0 * 2.55, 20.0, -30.0};
        EXPECT_EQ(LabThroughTable(p, v, slot), 1);
        EXPECT_NEAR(v[0] / 2.55, 47.0, 0.01) << slot;
        EXPECT_NEAR(v[1], 15.0, 0.01) << slot;
        EXPECT_NEAR(v[2], -23.0, 0.01) << slot;
    }
}

TEST(ForwardEvaluation, PaperOfAnXyzTableGivesTheMediaWhiteInAbsoluteColorimetry) {
    // Node 0 (no ink) holds the D50 white of the relative table; the media white is darker and
    // yellower.
    const double d50[3] = {0.9642, 1.0, 0.8249};
    TempDir dir;
    IccBuilder builder("CMYK", "XYZ ");
    builder.AddTag("A2B1", Mft2Tag(MakeLut(4, 3, 2, [&](const std::vector<int>& n, int out) {
        const double scale = n[0] + n[1] + n[2] + n[3] == 0 ? 1.0 : 0.2;
        return uint16_t(std::lround(d50[out] * scale * 32768.0));
    })));
    builder.AddTag("wtpt", XyzTag(0.86, 0.90, 0.66));
    const std::string path = WriteFile(dir.File("xyz.icc"), builder.Build());
    CProfil p;
    p.m_UseMediaWhite[0] = 1;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
    double v[4] = {0, 0, 0, 0};
    CmykToLab(p, v);
    cmsCIEXYZ media{p.m_MediaWhite[0][0], p.m_MediaWhite[0][1], p.m_MediaWhite[0][2]};
    cmsCIEXYZ illuminant{p.m_Illuminant[0][0], p.m_Illuminant[0][1], p.m_Illuminant[0][2]};
    cmsCIELab expected;
    cmsXYZ2Lab(&illuminant, &expected, &media);
    EXPECT_NEAR(v[0] / 2.55, expected.L, 0.05);
    EXPECT_NEAR(v[1], expected.a, 0.05);
    EXPECT_NEAR(v[2], expected.b, 0.05);
}

TEST(ForwardEvaluation, LightnessAbove255IsCappedAndLabOf16BitWhiteDecodes) {
    TempDir dir;
    CProfil p;
    // Node (1,1,1,1) holds L* 100 with a*, b* = 0 at 32768: a* = 0.5 / 257 above zero.
    WriteAndLoad(p, dir, "white.icc", "CMYK",
                 {{"A2B1", Mft2Tag(MakeLut(4, 3, 2, [](const std::vector<int>& n, int out) {
                       const bool top = n[0] + n[1] + n[2] + n[3] == 4;
                       return uint16_t(out == 0 ? (top ? 65535 : 30000) : 32768);
                   }))}});
    double v[4] = {255, 255, 255, 255};
    CmykToLab(p, v);
    EXPECT_NEAR(v[0], 255.0, 1e-9);
    EXPECT_NEAR(v[1], 32768 / 257.0 - 127.5, 1e-9);
}

}  // namespace
}  // namespace vantrel
