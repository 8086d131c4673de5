// The look-up rules of the in-gamut test and the empty record (real profiles against the colours
// they were built from: real_profiles_test.cpp).
#include <gtest/gtest.h>

#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

TEST(GamutRecord, OtherColourSpacesGiveTheEmptyRecordThatHoldsNothing) {
    TempDir dir;
    CProfil p;
    WriteAndLoad(p, dir, "GRAY",
                 {{"B2A1", Mft2Tag(DeviceLut(3, 1, 2, [](const std::vector<double>& f, int) { return 255 * f[0]; }))}});
    const GamutRecord g = BuildGamutRecord(p);
    for (int L = 0; L <= 100; L += 5)
        for (int a = -100; a <= 100; a += 20) EXPECT_FALSE(IsInGamut(g, L, a, -a / 2)) << L << " " << a;
    const Lab same = ReproducedLab(p, 50, 10, -10);
    EXPECT_NEAR(same.L, 50, 1e-12);
    EXPECT_EQ(same.a, 10);
}

TEST(GamutRecord, LookUpRoundsToTheCellAndComparesRoundedChroma) {
    GamutRecord g;
    g.valid = 1;
    g.lightnessMin = 20;
    g.lightnessMax = 240;
    for (auto& row : g.chroma)
        for (auto& cell : row) cell = 255;
    auto inside = [&g](double L, double C, double h) {
        const Lab lab = LChToLab(L, C, h);
        return IsInGamut(g, lab.L, lab.a, lab.b);
    };
    // L* 50 is L* x 2.55 = 127.5: lightness bin 16. Hue 45 degrees: bin 4.
    g.chroma[4][16] = 40;
    EXPECT_TRUE(inside(50, 39.6, 45));
    EXPECT_TRUE(inside(50, 40.4, 45));
    EXPECT_FALSE(inside(50, 40.6, 45));
    // Neutral colours use hue bin 0; hues just below 360 round into bin 32.
    g.chroma[0][16] = 3;
    EXPECT_TRUE(IsInGamut(g, 50, 0, 0));
    g.chroma[32][16] = 30;
    EXPECT_TRUE(inside(50, 20, 355));
    // Outside the recorded lightness whatever the chroma; cells of 0 or 255 hold nothing.
    g.lightnessMax = 120;  // below 127.5
    EXPECT_FALSE(IsInGamut(g, 50, 0, 0));
    g.lightnessMax = 240;
    g.chroma[0][16] = 0;
    EXPECT_FALSE(IsInGamut(g, 50, 0, 0));
    // Lightness far beyond the table is outside, not a read past it; so is no number at all.
    EXPECT_FALSE(IsInGamut(g, 250, 0, 0));
    EXPECT_FALSE(IsInGamut(g, std::nan(""), 0, 0));
    EXPECT_FALSE(IsInGamut(g, 50, INFINITY, 0));
}

}  // namespace
}  // namespace vantrel
