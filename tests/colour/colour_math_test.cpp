// The colour math against lcms2.
#include <gtest/gtest.h>

#include <lcms2.h>

#include <cmath>

#include "colour/colour_math.h"
#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// A profile whose illuminant is D50 and whose media white is a paper white.
void LoadWhites(CProfil& p, const TempDir& dir) {
    const std::string path = WriteFile(dir.File("w.icc"), IccBuilder().AddTag("wtpt", XyzTag(0.8820, 0.9150, 0.7510)).Build());
    p.ReadTagTable(0, path);
    p.ReadTagTable(1, path);
}

void ExpectNear(const XYZ& ours, const cmsCIEXYZ& expected, double tolerance) {
    EXPECT_NEAR(ours.X, expected.X, tolerance);
    EXPECT_NEAR(ours.Y, expected.Y, tolerance);
    EXPECT_NEAR(ours.Z, expected.Z, tolerance);
}

}  // namespace

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
                ExpectNear(p.LabToXYZ(L, a, b), expected, 1e-12);
                cmsCIELab back;
                cmsXYZ2Lab(&white, &back, &expected);
                const Lab ours = p.XYZToLab(expected.X, expected.Y, expected.Z);
                // The forward companding takes its cube root from a table (within 1e-4); the grid
                // crosses the knee and, with a* 90 or b* -90 at L* 100, the power function above 1.
                // Below the knee (L* 8) the straight line is exact, ending in 16/116.
                EXPECT_NEAR(ours.L, back.L, L < 8 ? 1e-4 : 116 * 1e-4);
                EXPECT_NEAR(ours.a, back.a, 1000 * 1e-4);
                EXPECT_NEAR(ours.b, back.b, 400 * 1e-4);
            }
    // A profile that has read nothing has no illuminant: Lab 0.
    EXPECT_EQ(CProfil().XYZToLab(0.5, 0.5, 0.5).L, 0);
}

TEST(ColourMath, BradfordAgreesWithLcmsAndAbsoluteLabIsClamped) {
    TempDir dir;
    CProfil p;
    LoadWhites(p, dir);
    const cmsCIEXYZ illuminant{p.m_Illuminant[1][0], p.m_Illuminant[1][1], p.m_Illuminant[1][2]};
    const cmsCIEXYZ media{p.m_MediaWhite[1][0], p.m_MediaWhite[1][1], p.m_MediaWhite[1][2]};
    for (const cmsCIEXYZ& value : {cmsCIEXYZ{0.2, 0.3, 0.1}, cmsCIEXYZ{0.9, 0.95, 0.8}, cmsCIEXYZ{0.05, 0.02, 0.4}}) {
        cmsCIEXYZ expected;
        cmsAdaptToIlluminant(&expected, &illuminant, &media, &value);
        const XYZ ours = p.AdaptToAbsolute(value.X, value.Y, value.Z, 1);
        ExpectNear(ours, expected, 2e-4);  // the inverse cone matrix is kept to four decimals
        ExpectNear(p.AdaptToRelative(ours.X, ours.Y, ours.Z, 1), value, 2e-4);
    }
    // The white of an absolute conversion is the paper itself.
    const Lab paper = p.LabToAbsolute(100, 0, 0, 0);
    const Lab expected = p.XYZToLab(p.m_MediaWhite[0][0], p.m_MediaWhite[0][1], p.m_MediaWhite[0][2]);
    EXPECT_NEAR(paper.L, expected.L, 0.02);
    EXPECT_NEAR(paper.a, expected.a, 0.02);
    EXPECT_NEAR(paper.b, expected.b, 0.02);
    EXPECT_EQ(p.LabToRelative(100, 0, 0, 0).L, 100.0);  // adapts above 100
    EXPECT_EQ(p.LabToRelative(50, -200, 0, 0).a, -128.0);
    EXPECT_EQ(p.LabToAbsolute(50, 0, 300, 1).b, 127.0);
}

TEST(ColourMath, LChAndDifferenceAgreeWithLcms) {
    for (double a : {-60.0, -3.0, 0.0, 4.0, 70.0})
        for (double b : {-50.0, 0.0, 8.0, 100.0}) {
            cmsCIELab lab{50, a, b};
            cmsCIELCh lch;
            cmsLab2LCh(&lch, &lab);
            const LCh ours = LabToLCh(50, a, b);
            EXPECT_NEAR(ours.C, lch.C, 1e-9);
            if (ours.C > 0) {
                EXPECT_NEAR(ours.h, lch.h, 1e-6) << a << " " << b;
            }
            const Lab back = LChToLab(ours.L, ours.C, ours.h);
            EXPECT_NEAR(back.a, a, 1e-6);
            EXPECT_NEAR(back.b, b, 1e-6);
        }
    const LCh clamped = LabToLCh(300, -200, 0);
    EXPECT_EQ(clamped.L, 255);
    EXPECT_EQ(clamped.C, 128);
    EXPECT_EQ(clamped.h, 180);
    EXPECT_EQ(LChToLab(50, 300, 0).a, 127);
    const cmsCIELab p1{50, 10, -20}, p2{61, -4, 7};
    EXPECT_DOUBLE_EQ(DeltaE(50, 10, -20, 61, -4, 7), cmsDeltaE(&p1, &p2));
}
