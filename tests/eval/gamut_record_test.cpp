// The gamut record of real profiles against the measurements they were built from, and the
// look-up rules of the in-gamut test.
#include <gtest/gtest.h>

#include <chrono>

#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "eval_oracle.h"
#include "it8/measured_it8.h"
#include "synthetic_profiles.h"

namespace vantrel {
namespace {

using namespace test;

// The measured colours of a characterisation file, read as the library reads measurements.
std::vector<Lab> MeasuredLab(const std::string& path) {
    Measured_IT8 it8;
    std::vector<Lab> rows;
    if (it8.ReadIt8(path) != 0) return rows;
    for (int set = 0; set < it8.PatchCount(); ++set)
        rows.push_back({it8.GetLab(set, 0), it8.GetLab(set, 1), it8.GetLab(set, 2)});
    return rows;
}

struct PressCase {
    const char* name;
    double minimumShare;
};

TEST(GamutRecord, PressProfilesHoldTheColoursTheyWereBuiltFrom) {
    const PressCase cases[] = {{"FOGRA39L", 0.9}, {"TR003", 0.9}};
    int tested = 0;
    for (const PressCase& c : cases) {
        const std::string path = FixtureProfile(c.name);
        const std::vector<Lab> measured = MeasuredLab(SystemIccDir() + c.name + ".ti3");
        if (path.empty() || measured.empty()) continue;
        ++tested;
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path, "A2B1", "B2A1", true));  // measurements are absolute
        const auto begin = std::chrono::steady_clock::now();
        const GamutRecord g = BuildGamutRecord(p);
        const double seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count();
        EXPECT_EQ(g.valid, 1);
        EXPECT_NEAR(g.paperWhite[0], p.WhiteL(0), 1e-12);
        int inside = 0;
        for (const Lab& lab : measured) inside += IsInGamut(g, lab.L, lab.a, lab.b);
        const double share = double(inside) / measured.size();
        std::printf("[ gamut    ] %-10s %4d of %4zu measured colours inside (%.1f %%), built in %.3f s\n", c.name,
                    inside, measured.size(), 100 * share, seconds);
        EXPECT_GE(share, c.minimumShare) << c.name;

        // Far outside any press: saturated RGB-primary colours, and lighter than the paper.
        const Lab outside[] = {{50, 100, 90}, {88, -90, 10}, {30, 60, -110}, {99, 0, 0}, {60, -100, -60}};
        for (const Lab& lab : outside) EXPECT_FALSE(IsInGamut(g, lab.L, lab.a, lab.b)) << c.name << " " << lab.L;
    }
    if (tested == 0) GTEST_SKIP() << "press profiles not built";
}

TEST(GamutRecord, MatrixRgbProfileHoldsItsPrimaries) {
    const std::string path = SystemProfile("sRGB.icc");
    if (path.empty()) GTEST_SKIP();
    CProfil p;
    ASSERT_TRUE(LoadProfile(p, path, "A2B1", "B2A1", false));
    const GamutRecord g = BuildGamutRecord(p);
    LcmsTransform forward(path, TYPE_RGB_DBL, true, INTENT_RELATIVE_COLORIMETRIC);
    // Inner colours are inside; of the surface ones, where the cell's largest chroma decides,
    // most are.
    int inside[2] = {0, 0}, total[2] = {0, 0};
    for (int r = 0; r <= 255; r += 51)
        for (int gr = 0; gr <= 255; gr += 51)
            for (int b = 0; b <= 255; b += 51) {
                const double rgb[3] = {double(r), double(gr), double(b)};
                const Lab lab = OracleToLab(forward, rgb, 3);
                const bool surface = std::min({r, gr, b}) == 0 || std::max({r, gr, b}) == 255;
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
    WriteAndLoad(p, dir, "gray.icc", "GRAY",
                 {{"B2A1", Mft2Tag(DeviceLut(3, 1, 2, [](const std::vector<double>& f, int) { return 255 * f[0]; }))}});
    const GamutRecord g = BuildGamutRecord(p);
    EXPECT_EQ(g.valid, 1);
    EXPECT_EQ(g.lightnessMin, 255.0);
    EXPECT_EQ(g.lightnessMax, 0.0);
    for (const auto& row : g.chroma)
        for (uint8_t cell : row) EXPECT_EQ(cell, 255);
    for (double L : {0.0, 50.0, 100.0}) EXPECT_FALSE(IsInGamut(g, L, 0, 0));
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
    // L* 50 is L* x 2.55 = 127.5: lightness bin 16. Hue 45 degrees: bin 4.
    g.chroma[4][16] = 40;
    auto at = [](double L, double C, double h) {
        const Lab lab = LChToLab(L, C, h);
        return lab;
    };
    Lab in = at(50, 39.6, 45), out = at(50, 40.6, 45);
    EXPECT_TRUE(IsInGamut(g, in.L, in.a, in.b));
    EXPECT_FALSE(IsInGamut(g, out.L, out.a, out.b));
    // Neutral colours use hue bin 0; hues just below 360 round into bin 32.
    g.chroma[0][16] = 3;
    EXPECT_TRUE(IsInGamut(g, 50, 0, 0));
    g.chroma[32][16] = 30;
    const Lab late = at(50, 20, 355);
    EXPECT_TRUE(IsInGamut(g, late.L, late.a, late.b));
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
