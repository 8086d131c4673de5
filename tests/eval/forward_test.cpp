// Forward evaluation: the decoding, kernel choice and media-white cases on small tables of known
// values (real profiles against lcms2: real_profiles_test.cpp).
#include <gtest/gtest.h>

#include "eval/forward.h"
#include "eval/inverse.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

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
