// Reading profiles: what LoadLut does that no real profile shows (short curves, the legacy Lab
// encoding, the choice of tag), and the header and white points.
#include <gtest/gtest.h>

#include <lcms2.h>

#include <cmath>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// CMYK to Lab on a 3-point grid with two-entry curves; every node holds its own values.
const LutSpec kCmykToLab = MakeLut(4, 3, 3, [](const std::vector<int>& node, int out) {
    return static_cast<uint16_t>(1000 * out + 27 * node[0] + 9 * node[1] + 3 * node[2] + node[3]);
});

}  // namespace

// Two-entry input curves are held spread over 256 entries, the last being the last sample.
TEST(LoadLut, Mft2TwoEntryCurvesAreHeldAs256) {
    TempDir dir;
    const std::string path = WriteFile(dir.File("p.icc"), IccBuilder().AddTag("A2B1", Mft2Tag(kCmykToLab)).Build());
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
    EXPECT_EQ(p.m_FileInputEntries[0], 2);
    ASSERT_EQ(p.m_InputCurves[0].size(), 4u * 256u);
    for (int channel = 0; channel < 4; ++channel)
        for (int j = 0; j < 256; ++j) {
            const double expected = j == 255 ? 65535 : std::floor(65535.0 * j / 256 + j + 0.5);
            ASSERT_EQ(p.m_InputCurves[0][static_cast<size_t>(channel * 256 + j)], expected) << j;
        }
    EXPECT_EQ(p.m_Clut[0], kCmykToLab.clut);
    EXPECT_EQ(p.m_OutputCurves[0], (std::vector<uint16_t>{0, 65535, 0, 65535, 0, 65535}));
    EXPECT_EQ(p.m_OutputIdentity[0], 1);
}

TEST(LoadLut, LegacyLabTablesAreStretchedToFullRange) {
    TempDir dir;
    // Lab -> Lab with the v2 encoding: L* 100 at 0xFF00, neutral a*/b* at 0x8000.
    LutSpec lut = MakeLut(3, 3, 2, [](const std::vector<int>& node, int out) {
        if (out == 0) return static_cast<uint16_t>(node[0] ? 0xFF00 : 0x1000);
        return static_cast<uint16_t>(0x8000);
    }, 256, 256, 0xFF00);
    lut.clut[0] = 0xFF00;  // the first node is the legacy white
    const std::string path = WriteFile(dir.File("p.icc"), IccBuilder("Lab ", "Lab ", "abst").AddTag("A2B0", Mft2Tag(lut)).Build());
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B0", path), 1);
    EXPECT_EQ(p.m_InputCurves[0][255], 65535);
    EXPECT_EQ(p.m_InputCurves[0][128], std::floor(lut.inputCurves[0][128] * 257.0 / 256 + 0.5));
    EXPECT_EQ(p.m_OutputCurves[0][255], 65535);
    EXPECT_EQ(p.m_Clut[0][0], 65535);
    EXPECT_EQ(p.m_Clut[0][3], std::floor(0x1000 * 257.0 / 256 + 0.5));  // L* of node 1
    EXPECT_EQ(p.m_Clut[0][1], 0x8000);                                   // a*, b* stay
}

// A2B1 falls back to A2B0; a missing B2A1 fails and empties both directories.
TEST(LoadLut, OnlyA2B1FallsBackAndReleaseEmptiesTheSlots) {
    TempDir dir;
    const std::string path = WriteFile(
        dir.File("p.icc"), IccBuilder().AddTag("A2B0", Mft2Tag(kCmykToLab)).AddTag("B2A0", Mft2Tag(kCmykToLab)).Build());
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
    EXPECT_EQ(p.m_Lut[0].tagIndex, 1);
    EXPECT_TRUE(p.HoldsTables());
    p.ReadTagTable(1, path);
    EXPECT_EQ(p.LoadLut(1, "B2A1", path), -1);
    EXPECT_TRUE(p.m_Tags[0].empty());
    EXPECT_TRUE(p.m_Tags[1].empty());
    EXPECT_TRUE(p.SlotHolds(0));
    p.Release();
    EXPECT_FALSE(p.HoldsTables());
    EXPECT_FALSE(p.SlotHolds(0));
}

// (Setting a white from Lab is checked through the file by the writer's tests.)
TEST(ProfileWhites, WhiteLabAgreesWithLcmsAboveTheKneeAndUsesItsOwnConstantBelow) {
    TempDir dir;
    const std::string path =
        WriteFile(dir.File("p.icc"), IccBuilder().AddTag("wtpt", XyzTag(0.8570, 0.8850, 0.7030)).Build());
    CProfil p;
    p.ReadTagTable(0, path);
    const cmsCIEXYZ white{p.m_Illuminant[0][0], p.m_Illuminant[0][1], p.m_Illuminant[0][2]};
    const cmsCIEXYZ media{p.m_MediaWhite[0][0], p.m_MediaWhite[0][1], p.m_MediaWhite[0][2]};
    cmsCIELab expected;
    cmsXYZ2Lab(&white, &expected, &media);
    EXPECT_NEAR(p.WhiteL(0), expected.L, 1e-9);
    EXPECT_NEAR(p.WhiteA(0), expected.a, 1e-9);
    EXPECT_NEAR(p.WhiteB(0), expected.b, 1e-9);
    // Below 0.008856 the straight line ends in 0.138, not 16/116.
    p.SetMediaWhite(0, 'y', 0.005 * p.m_Illuminant[0][1]);
    EXPECT_NEAR(p.WhiteL(0), 116 * (7.787 * 0.005 + 0.138) - 16, 1e-9);
}

TEST(ProfileWhites, ReadingReplacesHeaderAndDirectoryAndAMissingFileChangesNothing) {
    TempDir dir;
    const std::string a = WriteFile(dir.File("a.icc"), IccBuilder().Illuminant(0.95, 1.0, 1.09).Build());
    const std::string b = WriteFile(dir.File("b.icc"), IccBuilder("RGB ").AddTag("wtpt", XyzTag(0.9, 0.8, 0.7)).Build());
    CProfil p;
    p.ReadTagTable(0, b);
    EXPECT_NEAR(p.m_MediaWhite[0][1], 0.8, 1e-4);
    p.ReadTagTable(0, a);
    EXPECT_TRUE(p.m_Tags[0].empty());
    EXPECT_NEAR(p.m_Illuminant[0][2], 1.09, 1e-4);
    EXPECT_EQ(p.m_MediaWhite[0][2], p.m_Illuminant[0][2]);  // no "wtpt": the illuminant
    p.ReadTagTable(1, b);
    EXPECT_EQ(p.m_Tags[1].size(), 1u);
    EXPECT_EQ(p.m_Header[16], 'R');  // the header of the file read last
    p.ReadTagTable(1, dir.File("missing.icc"));
    EXPECT_EQ(p.m_Tags[1].size(), 1u);
    EXPECT_EQ(p.m_Header[16], 'R');
}
