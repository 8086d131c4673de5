#include <gtest/gtest.h>

#include <lcms2.h>

#include <cmath>

#include "colour/colour_math.h"
#include "colour/cube_root_table.h"
#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// A profile whose direction-0 illuminant is D50 and whose media white is a paper white.
void LoadWhites(CProfil& p, const TempDir& dir, double wx = 0.8820, double wy = 0.9150, double wz = 0.7510) {
    const std::string path = WriteFile(dir.File("w.icc"), IccBuilder().AddTag("wtpt", XyzTag(wx, wy, wz)).Build());
    p.ReadTagTable(0, path);
    p.ReadTagTable(1, path);
}

}  // namespace

TEST(CieF, BranchesAndTable) {
    EXPECT_EQ(kCubeRootTable[1025], 1.0f);
    EXPECT_EQ(kCubeRootTable[1024], 1.0f);
    for (int k = 0; k <= 1024; k += 7) EXPECT_EQ(kCubeRootTable[k], static_cast<float>(std::cbrt(k / 1024.0))) << k;
    EXPECT_EQ(CieF(1.0), 1.0);
    EXPECT_DOUBLE_EQ(CieF(1.5), std::pow(1.5, 1.0 / 3.0));
    EXPECT_DOUBLE_EQ(CieF(0.008856), 7.787 * 0.008856 + 16.0 / 116.0);
    for (double t = 0.009; t < 1.0; t += 0.0137) EXPECT_NEAR(CieF(t), std::cbrt(t), 1e-4) << t;  // linear steps of 1/1024
}

TEST(ColourMath, LabAndXyzAgreeWithLcms) {
    TempDir dir;
    CProfil p;
    LoadWhites(p, dir);
    const cmsCIEXYZ white{p.m_Illuminant[0][0], p.m_Illuminant[0][1], p.m_Illuminant[0][2]};
    for (double L : {0.0, 3.0, 8.0, 25.0, 50.0, 75.0, 100.0})
        for (double a : {-100.0, -20.0, 0.0, 37.0, 90.0})
            for (double b : {-90.0, -5.0, 0.0, 60.0}) {
                const cmsCIELab lab{L, a, b};
                cmsCIEXYZ expected;
                cmsLab2XYZ(&white, &expected, &lab);
                const XYZ xyz = p.LabToXYZ(L, a, b);
                EXPECT_NEAR(xyz.X, expected.X, 1e-12);
                EXPECT_NEAR(xyz.Y, expected.Y, 1e-12);
                EXPECT_NEAR(xyz.Z, expected.Z, 1e-12);
                cmsCIELab back;
                cmsXYZ2Lab(&white, &back, &expected);
                const Lab ours = p.XYZToLab(expected.X, expected.Y, expected.Z);
                // The forward companding takes its cube root from a table (within 1e-4).
                EXPECT_NEAR(ours.L, back.L, 116 * 1e-4);
                EXPECT_NEAR(ours.a, back.a, 1000 * 1e-4);
                EXPECT_NEAR(ours.b, back.b, 400 * 1e-4);
            }
    const XYZ illuminant = p.LabToXYZ(100, 0, 0);
    EXPECT_DOUBLE_EQ(illuminant.X, p.m_Illuminant[0][0]);
    EXPECT_DOUBLE_EQ(illuminant.Z, p.m_Illuminant[0][2]);
    const Lab whiteLab = p.XYZToLab(illuminant.X, illuminant.Y, illuminant.Z);
    EXPECT_NEAR(whiteLab.L, 100, 1e-5);
    EXPECT_NEAR(whiteLab.a, 0, 1e-5);
}

TEST(ColourMath, ZeroIlluminantGivesZeroLab) {
    CProfil p;  // has read nothing
    const Lab lab = p.XYZToLab(0.5, 0.5, 0.5);
    EXPECT_EQ(lab.L, 0);
    EXPECT_EQ(lab.a, 0);
    EXPECT_EQ(lab.b, 0);
    const Lab same = p.LabToRelative(50, 10, 10, 0);
    EXPECT_EQ(same.L, 0);
}

TEST(ColourMath, BradfordAgreesWithLcms) {
    TempDir dir;
    CProfil p;
    LoadWhites(p, dir);
    const cmsCIEXYZ illuminant{p.m_Illuminant[1][0], p.m_Illuminant[1][1], p.m_Illuminant[1][2]};
    const cmsCIEXYZ media{p.m_MediaWhite[1][0], p.m_MediaWhite[1][1], p.m_MediaWhite[1][2]};
    for (const cmsCIEXYZ& value : {cmsCIEXYZ{0.2, 0.3, 0.1}, cmsCIEXYZ{0.9, 0.95, 0.8}, cmsCIEXYZ{0.05, 0.02, 0.4}}) {
        cmsCIEXYZ expected;
        cmsAdaptToIlluminant(&expected, &illuminant, &media, &value);
        const XYZ ours = p.AdaptToAbsolute(value.X, value.Y, value.Z, 1);
        // The inverse cone matrix is kept to four decimals.
        EXPECT_NEAR(ours.X, expected.X, 2e-4);
        EXPECT_NEAR(ours.Y, expected.Y, 2e-4);
        EXPECT_NEAR(ours.Z, expected.Z, 2e-4);
        const XYZ back = p.AdaptToRelative(ours.X, ours.Y, ours.Z, 1);
        EXPECT_NEAR(back.X, value.X, 2e-4);
        EXPECT_NEAR(back.Z, value.Z, 2e-4);
    }
    // The media white of an absolute conversion is the paper itself.
    const Lab paper = p.LabToAbsolute(100, 0, 0, 0);
    const Lab expected = p.XYZToLab(p.m_MediaWhite[0][0], p.m_MediaWhite[0][1], p.m_MediaWhite[0][2]);
    EXPECT_NEAR(paper.L, expected.L, 0.02);
    EXPECT_NEAR(paper.a, expected.a, 0.02);
    EXPECT_NEAR(paper.b, expected.b, 0.02);
}

TEST(ColourMath, RelativeAndAbsoluteClamp) {
    TempDir dir;
    CProfil p;
    LoadWhites(p, dir);
    EXPECT_EQ(p.LabToRelative(100, 0, 0, 0).L, 100.0);  // adapts above 100
    EXPECT_EQ(p.LabToRelative(50, -200, 0, 0).a, -128.0);
    EXPECT_EQ(p.LabToAbsolute(50, 0, 300, 1).b, 127.0);
    CProfil same;
    LoadWhites(same, dir, 0.9642, 1.0, 0.8249);
    const Lab unchanged = same.LabToRelative(40, 20, -30, 0);
    EXPECT_NEAR(unchanged.L, 40, 1e-3);
    EXPECT_NEAR(unchanged.a, 20, 1e-3);
    EXPECT_NEAR(unchanged.b, -30, 1e-3);
}

TEST(ColourMath, HueChromaAndDifference) {
    EXPECT_EQ(HueAngle(0, 0), 0);
    EXPECT_EQ(HueAngle(-1, 0), 180);
    EXPECT_EQ(HueAngle(0, -1), 270);
    EXPECT_EQ(HueAngle(0, 2), 90);
    EXPECT_NEAR(HueAngle(1, -1), 315, 1e-6);
    EXPECT_NEAR(HueAngle(-1, -1), 225, 1e-6);
    EXPECT_NEAR(HueAngle(-1, 1), 135, 1e-6);
    for (double a : {-60.0, -3.0, 4.0, 70.0})
        for (double b : {-50.0, 8.0, 100.0}) {
            cmsCIELab lab{50, a, b};
            cmsCIELCh lch;
            cmsLab2LCh(&lch, &lab);
            const LCh ours = LabToLCh(50, a, b);
            EXPECT_NEAR(ours.C, lch.C, 1e-9);
            EXPECT_NEAR(ours.h, lch.h, 1e-6);
            const Lab back = LChToLab(ours.L, ours.C, ours.h);
            EXPECT_NEAR(back.a, a, 1e-6);
            EXPECT_NEAR(back.b, b, 1e-6);
        }
    const LCh clamped = LabToLCh(300, -200, 0);
    EXPECT_EQ(clamped.L, 255);
    EXPECT_EQ(clamped.C, 128);
    EXPECT_EQ(clamped.h, 180);
    const Lab grey = LChToLab(50, 0, 123);
    EXPECT_EQ(grey.L, 50);
    EXPECT_EQ(grey.a, 0);
    EXPECT_EQ(grey.b, 0);
    EXPECT_EQ(LChToLab(50, 300, 0).a, 127);
    const cmsCIELab p1{50, 10, -20}, p2{61, -4, 7};
    EXPECT_DOUBLE_EQ(DeltaE(50, 10, -20, 61, -4, 7), cmsDeltaE(&p1, &p2));
    EXPECT_EQ(Square(-3), 9);
}
