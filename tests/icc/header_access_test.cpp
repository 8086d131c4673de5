#include <gtest/gtest.h>

#include <lcms2.h>

#include <cmath>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

TEST(ProfileHeader, DefaultsAndSetters) {
    CProfil p;
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(p.m_Header + 4), 4), "appl");
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(p.m_Header + 12), 4), "prtr");
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(p.m_Header + 36), 4), "acsp");
    EXPECT_EQ(p.IlluminantX(), 63188u);
    EXPECT_EQ(p.IlluminantY(), 65535u);
    EXPECT_EQ(p.IlluminantZ(), 54059u);
    p.SetCmmType("lcms");
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(p.m_Header + 4), 4), "lcms");
    p.SetDeviceClass(0);
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(p.m_Header + 12), 4), "mntr");
    p.SetDeviceClass(2);
    EXPECT_EQ(std::string(reinterpret_cast<const char*>(p.m_Header + 12), 4), "scnr");
    p.SetIlluminant(0x0001F6D6, 0x00010000, 0x0000D32D);
    EXPECT_EQ(p.IlluminantX(), 0xF6D6u);  // X's integer part is written as zero
    EXPECT_EQ(p.IlluminantY(), 0x10000u);
    p.SetMediaWhite(1, 'y', 0.5);
    p.SetMediaWhite(1, 'Z', 0.25);
    p.SetMediaWhite(1, 'q', 9);
    EXPECT_EQ(p.m_MediaWhite[1][1], 0.5);
    EXPECT_EQ(p.m_MediaWhite[1][2], 0.25);
    EXPECT_EQ(p.m_MediaWhite[1][0], 0);
}

TEST(ProfileHeader, WhiteLabUsesItsOwnConstant) {
    TempDir dir;
    const std::string path =
        WriteFile(dir.File("p.icc"), IccBuilder().AddTag("wtpt", XyzTag(0.8570, 0.8850, 0.7030)).Build());
    CProfil p;
    p.ReadTagTable(0, path);
    // Above 0.008856 it is the CIE formula: lcms2 agrees.
    const cmsCIEXYZ white{p.m_Illuminant[0][0], p.m_Illuminant[0][1], p.m_Illuminant[0][2]};
    const cmsCIEXYZ media{p.m_MediaWhite[0][0], p.m_MediaWhite[0][1], p.m_MediaWhite[0][2]};
    cmsCIELab expected;
    cmsXYZ2Lab(&white, &expected, &media);
    EXPECT_NEAR(p.WhiteL(0), expected.L, 1e-9);
    EXPECT_NEAR(p.WhiteA(0), expected.a, 1e-9);
    EXPECT_NEAR(p.WhiteB(0), expected.b, 1e-9);
    // Below it the straight line ends in 0.138.
    p.SetMediaWhite(0, 'Y', 0.005 * p.m_Illuminant[0][1]);
    EXPECT_NEAR(p.WhiteL(0), 116 * (7.787 * 0.005 + 0.138) - 16, 1e-9);
    // The illuminant as its own white is L* 100.
    for (int axis = 0; axis < 3; ++axis) p.m_MediaWhite[0][axis] = p.m_Illuminant[0][axis];
    EXPECT_NEAR(p.WhiteL(0), 100, 1e-9);
    EXPECT_NEAR(p.WhiteA(0), 0, 1e-9);
}

TEST(ProfileHeader, SettingTheWhiteRecomputesTheMediaWhite) {
    CProfil p;  // D50 header illuminant
    p.SetWhiteL(0, 0.9);
    p.SetWhiteA(0, 2.0);
    p.SetWhiteB(0, -3.0);
    EXPECT_EQ(p.m_SlotWhite[0][0], 0.9);
    const cmsCIEXYZ d50{63188 / 65536.0, 65535 / 65536.0, 54059 / 65536.0};
    const cmsCIELab lab{90, 2, -3};
    cmsCIEXYZ expected;
    cmsLab2XYZ(&d50, &expected, &lab);
    EXPECT_NEAR(p.m_MediaWhite[0][0], expected.X, 1e-12);
    EXPECT_NEAR(p.m_MediaWhite[0][1], expected.Y, 1e-12);
    EXPECT_NEAR(p.m_MediaWhite[0][2], expected.Z, 1e-12);
}

TEST(ProfileHeader, ReadingReplacesHeaderAndDirectory) {
    TempDir dir;
    const std::string a = WriteFile(dir.File("a.icc"), IccBuilder().Illuminant(0.95, 1.0, 1.09)
                                                           .AddTag("cprt", TextTag("Made for a test"))
                                                           .AddTag("gamt", TextTag("x"))
                                                           .Build());
    const std::string b = WriteFile(dir.File("b.icc"), IccBuilder("RGB ").AddTag("wtpt", XyzTag(0.9, 0.9, 0.9)).Build());
    CProfil p;
    p.ReadTagTable(0, a);
    ASSERT_EQ(p.m_Tags[0].size(), 2u);
    EXPECT_EQ(p.m_Tags[0][0].copyright, std::string("Made for a test") + '\0');
    EXPECT_EQ(p.m_GamutTagIndex[0], 2);
    EXPECT_NEAR(p.m_Illuminant[0][2], 1.09, 1e-4);
    EXPECT_EQ(p.m_MediaWhite[0][2], p.m_Illuminant[0][2]);  // no "wtpt": the illuminant
    p.ReadTagTable(1, b);
    EXPECT_EQ(p.m_Tags[1].size(), 1u);
    EXPECT_EQ(p.m_Header[16], 'R');  // the header of the file read last
    p.ReadTagTable(0, b);
    EXPECT_EQ(p.m_Tags[0].size(), 1u);
    p.ReadTagTable(0, dir.File("missing.icc"));
    EXPECT_EQ(p.m_Tags[0].size(), 1u);
}
