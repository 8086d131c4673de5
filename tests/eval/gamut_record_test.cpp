// The gamut record of real profiles against the measurements they were built from, and the
// look-up rules of the in-gamut test.
#include <gtest/gtest.h>

#include <chrono>

#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "eval_helpers.h"
#include "it8/measured_it8.h"

namespace vantrel {
namespace {

using namespace test;

TEST(GamutRecord, PressProfilesHoldTheColoursTheyWereBuiltFrom) {
    int tested = 0;
    for (const char* name : {"FOGRA39L", "TR003"}) {
        const std::string path = FixtureProfile(name);
        // The measured colours, read as the library reads measurements.
        Measured_IT8 it8;
        if (path.empty() || it8.ReadIt8(SystemIccDir() + name + ".ti3") != 0 || it8.PatchCount() == 0) continue;
        ++tested;
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path, "A2B1", "B2A1", true));  // measurements are absolute
        const auto begin = std::chrono::steady_clock::now();
        const GamutRecord g = BuildGamutRecord(p);
        const double seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count();
        EXPECT_EQ(g.valid, 1);
        EXPECT_NEAR(g.paperWhite[0], p.WhiteL(0), 1e-12);
        int inside = 0;
        for (int set = 0; set < it8.PatchCount(); ++set)
            inside += IsInGamut(g, it8.GetLab(set, 0), it8.GetLab(set, 1), it8.GetLab(set, 2));
        const double share = double(inside) / it8.PatchCount();
        std::printf("[ gamut    ] %-10s %4d of %4d measured colours inside (%.1f %%), built in %.3f s\n", name, inside,
                    it8.PatchCount(), 100 * share, seconds);
        EXPECT_GE(share, 0.9) << name;
        // A measured colour inside the gamut is reproduced closely; one far outside is not.
        const Lab first = ReproducedLab(p, it8.GetLab(0, 0), it8.GetLab(0, 1), it8.GetLab(0, 2));
        EXPECT_LT(Difference(first, Lab{it8.GetLab(0, 0), it8.GetLab(0, 1), it8.GetLab(0, 2)}), 2.0) << name;
        EXPECT_GT(Difference(ReproducedLab(p, 50, 100, 90), Lab{50, 100, 90}), 10.0) << name;
        // Far outside any press: saturated RGB-primary colours, and lighter than the paper.
        for (const Lab& lab :
             {Lab{50, 100, 90}, Lab{88, -90, 10}, Lab{30, 60, -110}, Lab{99, 0, 0}, Lab{60, -100, -60}})
            EXPECT_FALSE(IsInGamut(g, lab.L, lab.a, lab.b)) << name << " " << lab.L;
    }
    if (tested == 0) GTEST_SKIP() << "press profiles not built";
}

TEST(GamutRecord, MatrixRgbProfileHoldsItsLattice) {
    const std::string path = SystemProfile("sRGB.icc");
    if (path.empty()) GTEST_SKIP();
    CProfil p;
    ASSERT_TRUE(LoadProfile(p, path));
    const GamutRecord g = BuildGamutRecord(p);
    const auto forward = MakeLcmsTransform(path, TYPE_RGB_DBL, true);
    // Inner colours are inside; of the surface ones, where the cell's largest chroma decides, most are.
    int inside[2] = {0, 0}, total[2] = {0, 0};
    for (int k = 0; k < 216; ++k) {
        const double rgb[3] = {k / 36 * 51.0, k / 6 % 6 * 51.0, k % 6 * 51.0};
        const Lab lab = OracleLab(forward, rgb, 3);
        const bool surface = *std::min_element(rgb, rgb + 3) == 0 || *std::max_element(rgb, rgb + 3) == 255;
        inside[surface] += IsInGamut(g, lab.L, lab.a, lab.b);
        ++total[surface];
    }
    std::printf("[ gamut    ] sRGB       inner lattice %d of %d inside, surface %d of %d\n", inside[0], total[0],
                inside[1], total[1]);
    EXPECT_EQ(inside[0], total[0]);
    EXPECT_GE(inside[1], total[1] * 3 / 4);
    EXPECT_FALSE(IsInGamut(g, 50, -110, -110));
}

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
