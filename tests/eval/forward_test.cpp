// Forward evaluation: real profiles against lcms2 on the same tags, and the decoding, kernel
// choice and media-white cases on small tables of known values.
#include <gtest/gtest.h>

#include <random>

#include "eval/forward.h"
#include "eval/inverse.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

// The two differ only where the interpolation schemes differ: lcms2 interpolates four-input
// tables as tetrahedra in CMY blended along K, and applies output curves after the grid.
TEST(ForwardEvaluation, RealProfilesAgreeWithLcmsOnTheSameTables) {
    struct Case {
        const char* name;
        std::string path;
        const char* a2b;
        cmsUInt32Number intent;
        double meanLimit, maxLimit;
    };
    const Case cases[] = {
        {"FOGRA39L A2B1", FixtureProfile("FOGRA39L"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 0.5, 3.0},
        {"TR003 A2B1", FixtureProfile("TR003"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 0.8, 5.0},
        {"default_cmyk A2B1", SystemProfile("ghostscript/default_cmyk.icc"), "A2B1", INTENT_RELATIVE_COLORIMETRIC,
         0.5, 3.0},
        // XYZ PCS and only A2B0, which A2B1 falls back to, as in lcms2. Its five-point grid is far
        // from linear (a* swings by 120 across one cell), where a four-input simplex and lcms2's
        // CMY tetrahedra blended along K part by up to 30 between the nodes; on the nodes they agree.
        {"ps_cmyk (XYZ) A2B0", SystemProfile("ghostscript/ps_cmyk.icc"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 1.5,
         35.0},
        {"sRGB (matrix/TRC)", SystemProfile("sRGB.icc"), "A2B1", INTENT_RELATIVE_COLORIMETRIC, 0.3, 1.5},
        {"AdobeRGB (matrix/TRC)", SystemProfile("compatibleWithAdobeRGB1998.icc"), "A2B1",
         INTENT_RELATIVE_COLORIMETRIC, 0.3, 1.5},
    };
    int tested = 0;
    for (const Case& c : cases) {
        if (c.path.empty()) continue;
        ++tested;
        CProfil p;
        p.ReadTagTable(0, c.path);
        ASSERT_EQ(p.LoadLut(0, c.a2b, c.path), 1) << c.name;
        const int channels = p.m_Lut[0].type == "MATR" ? 3 : 4;
        const auto oracle = MakeLcmsTransform(c.path, channels == 3 ? TYPE_RGB_DBL : TYPE_CMYK_DBL, true, c.intent);
        ASSERT_TRUE(oracle) << c.name;
        // Every node of a 9-point lattice, then random colours.
        std::vector<std::vector<double>> samples;
        for (int k = 0; k < std::pow(9, channels); ++k) {
            std::vector<double> s(4, 0.0);
            for (int i = 0, rest = k; i < channels; ++i, rest /= 9) s[i] = rest % 9 * 31.875;
            samples.push_back(s);
        }
        std::mt19937 rng(7);
        std::uniform_real_distribution<double> value(0, 255);
        for (int i = 0; i < 3000; ++i) samples.push_back({value(rng), value(rng), value(rng), value(rng)});
        DeltaStats stats;
        for (const auto& s : samples) {
            double v[4] = {s[0], s[1], s[2], s[3]};
            EXPECT_EQ(channels == 3 ? RgbToLab(p, v) : CmykToLab(p, v), 1);
            stats.Add(Difference(Lab{v[0] / 2.55, v[1], v[2]}, OracleLab(oracle, s.data(), channels)));
        }
        stats.Report(std::string(c.name) + " to Lab vs lcms2");
        EXPECT_LT(stats.Mean(), c.meanLimit) << c.name;
        EXPECT_LT(stats.max, c.maxLimit) << c.name;
    }
    if (tested == 0) GTEST_SKIP() << "no real profiles available";
}

TEST(ForwardEvaluation, ColourantCountAndColourSpaceChooseTheEvaluation) {
    // Direction 1: out0 = 255 f1 f2; at fractions (x, 0.5, 0.5) the multilinear kernel gives 63.75,
    // the simplex one 127.5; the other outputs are constants. The PCS white (255, 127.5, 127.5) of
    // the direction-1 paper white sits at such fractions. Direction 0: L* = 20 + 60 x the last
    // colourant, which only an evaluation of every channel sees.
    auto table = [](const std::vector<double>& f, int out) { return out == 0 ? 255.0 * f[1] * f[2] : 10.0 * out; };
    struct Case {
        const char* space;
        int channels;
        double first;
    };
    // Seven colourants get the multilinear kernel whichever of their two names the file uses.
    const Case cases[] = {{"CMYK", 4, 127.5}, {"6CLR", 6, 63.75}, {"MCH6", 6, 63.75}, {"7CLR", 7, 63.75},
                          {"MCH7", 7, 63.75}};
    TempDir dir;
    for (const Case& c : cases) {
        CProfil p;
        const auto last = [](const std::vector<double>& f) { return Lab{20 + 60 * f.back(), 0, 0}; };
        WriteAndLoad(p, dir, c.space,
                     {{"A2B1", Mft2Tag(DeviceToLabLut(c.channels, 2, last))},
                      {"B2A1", Mft2Tag(DeviceLut(3, c.channels, 2, table))}},
                     true);
        ASSERT_EQ(p.m_Lut[1].outputChannels, c.channels) << c.space;
        double v[20] = {40.0, 127.5, 127.5};
        v[c.channels] = -1;  // past the outputs: left alone
        EXPECT_EQ(EvaluateDirection1(p, v), 1);
        EXPECT_NEAR(v[0], c.first, 1e-9) << c.space;
        EXPECT_NEAR(v[1], 10.0, 1e-9) << c.space;
        EXPECT_EQ(v[c.channels], -1) << c.space;
        EXPECT_EQ(p.m_PaperWhite[1][0], static_cast<int>(c.first + 0.5)) << c.space;
        for (int k = 1; k < c.channels; ++k) EXPECT_EQ(p.m_PaperWhite[1][k], 10 * k) << c.space;

        double device[20] = {};
        device[c.channels - 1] = 255;
        DeviceToLab(p, device, c.channels);
        EXPECT_NEAR(device[0], 80 * 2.55, 0.01) << c.space;
        // The table inverse gives the profile's colourants and clears the entries past them.
        double lab[20] = {50 * 2.55, 0, 0, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9, 9};
        LabToMulti(p, lab);
        EXPECT_NEAR(lab[1], 10.0, 1e-9) << c.space;
        for (int k = c.channels; k < 20; ++k) EXPECT_EQ(lab[k], 0.0) << c.space << " " << k;
    }
}

TEST(ForwardEvaluation, LabThroughTableInEitherSlot) {
    // A Lab-to-Lab table that scales every colour by 0.9 and adds (2, -3, 4).
    auto shift = [](const std::vector<double>& f) {
        return Lab{0.9 * f[0] * 100.0 + 2.0, 0.9 * (f[1] * 255.0 - 127.5) - 3.0, 0.9 * (f[2] * 255.0 - 127.5) + 4.0};
    };
    TempDir dir;
    CProfil p;
    const Bytes table = Mft2Tag(DeviceToLabLut(3, 2, shift));
    WriteAndLoad(p, dir, "Lab ", {{"A2B1", table}, {"B2A1", table}});
    for (int slot = 0; slot < 2; ++slot) {
        double v[3] = {50.0 * 2.55, 20.0, -30.0};
        EXPECT_EQ(LabThroughTable(p, v, slot), 1);
        EXPECT_NEAR(v[0] / 2.55, 47.0, 0.01) << slot;
        EXPECT_NEAR(v[1], 15.0, 0.01) << slot;
        EXPECT_NEAR(v[2], -23.0, 0.01) << slot;
    }
}

TEST(ForwardEvaluation, PaperOfAnXyzTableGivesTheMediaWhiteAndLightnessIsCapped) {
    // Node 0 (no ink) holds the D50 white of the relative table; the media white is darker and
    // yellower. The last node holds 1.5 x the white, lighter than L* 100 even when absolute.
    const double d50[3] = {0.9642, 1.0, 0.8249};
    TempDir dir;
    IccBuilder builder("CMYK", "XYZ ");
    builder.AddTag("A2B1", Mft2Tag(MakeLut(4, 3, 2, [&](const std::vector<int>& n, int out) {
        const int sum = n[0] + n[1] + n[2] + n[3];
        const double scale = sum == 0 ? 1.0 : sum == 4 ? 1.5 : 0.2;
        return uint16_t(std::lround(d50[out] * scale * 32768.0));
    })));
    builder.AddTag("wtpt", XyzTag(0.86, 0.90, 0.66));
    CProfil p;
    LoadProfile(p, WriteFile(dir.File("xyz.icc"), builder.Build()), "A2B1", "B2A1", true);
    const double paper[4] = {0, 0, 0, 0};
    const Lab lab = CmykLab(p, paper);
    cmsCIEXYZ media{p.m_MediaWhite[0][0], p.m_MediaWhite[0][1], p.m_MediaWhite[0][2]};
    cmsCIEXYZ illuminant{p.m_Illuminant[0][0], p.m_Illuminant[0][1], p.m_Illuminant[0][2]};
    cmsCIELab expected;
    cmsXYZ2Lab(&illuminant, &expected, &media);
    EXPECT_NEAR(lab.L, expected.L, 0.05);
    EXPECT_NEAR(lab.a, expected.a, 0.05);
    EXPECT_NEAR(lab.b, expected.b, 0.05);
    double full[4] = {255, 255, 255, 255};
    CmykToLab(p, full);
    EXPECT_EQ(full[0], 255.0);
}

}  // namespace
}  // namespace vantrel
