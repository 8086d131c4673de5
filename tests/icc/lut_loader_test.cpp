#include <gtest/gtest.h>

#include <cmath>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// A CMYK -> Lab table whose nodes are easy to predict: output o of node (i0..i3) = 1000 * o + sum of indices.
LutSpec SmallCmykLut(int grid = 3, int inEntries = 2, int outEntries = 2) {
    return MakeLut(4, 3, grid, [](const std::vector<int>& node, int out) {
        int sum = 0;
        for (int i : node) sum += i;
        return static_cast<uint16_t>(1000 * out + sum);
    }, inEntries, outEntries);
}

std::string Write(const TempDir& dir, const std::string& name, const IccBuilder& profile) {
    return WriteFile(dir.File(name), profile.Build());
}

int LoadBoth(CProfil& p, const std::string& path, const char* tag0, const char* tag1) {
    p.ReadTagTable(0, path);
    const int first = p.LoadLut(0, tag0, path);
    p.ReadTagTable(1, path);
    const int second = p.LoadLut(1, tag1, path);
    return first * 10 + second;
}

}  // namespace

TEST(LoadLut, Mft2TwoEntryInputCurvesAreHeldAs256) {
    TempDir dir;
    const LutSpec lut = SmallCmykLut();
    const std::string path = Write(dir, "p.icc", IccBuilder().AddTag("A2B1", Mft2Tag(lut)));
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
    const LutSlot& slot = p.m_Lut[0];
    EXPECT_EQ(slot.type, "mft2");
    EXPECT_EQ(slot.inputChannels, 4);
    EXPECT_EQ(slot.outputChannels, 3);
    EXPECT_EQ(slot.gridPoints, 3);
    EXPECT_EQ(slot.inputEntries, 256);
    EXPECT_EQ(slot.outputEntries, 2);
    EXPECT_EQ(slot.pcs, "Lab");
    EXPECT_EQ(slot.colourSpace, "CMYK");
    EXPECT_EQ(p.m_FileInputEntries[0], 2);
    EXPECT_EQ(p.m_Precision[0], 1);
    EXPECT_TRUE(p.HoldsTables());
    EXPECT_TRUE(p.SlotHolds(0));
    ASSERT_EQ(p.m_InputCurves[0].size(), 4u * 256u);
    for (int channel = 0; channel < 4; ++channel)
        for (int j = 0; j < 256; ++j) {
            const double expected = j == 255 ? 65535 : std::floor(65535.0 * j / 256 + j + 0.5);
            ASSERT_EQ(p.m_InputCurves[0][static_cast<size_t>(channel * 256 + j)], expected) << j;
        }
    EXPECT_EQ(p.m_Clut[0], lut.clut);
    EXPECT_EQ(p.m_OutputCurves[0], (std::vector<uint16_t>{0, 65535, 0, 65535, 0, 65535}));
    EXPECT_EQ(p.m_OutputIdentity[0], 1);
    EXPECT_DOUBLE_EQ(p.m_GridScale[0], 2.0 / 65535);
    EXPECT_DOUBLE_EQ(p.m_OutputScale[0], 1.0 / 65535);
}

TEST(LoadLut, CountsStridesAndCornerOffsets) {
    TempDir dir;
    const std::string path = Write(dir, "p.icc", IccBuilder().AddTag("A2B0", Mft2Tag(SmallCmykLut(5))));
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B0", path), 1);
    EXPECT_EQ(p.m_Corners[0], 16);
    const int multipliers[4] = {125, 25, 5, 1};
    for (int i = 0; i < 4; ++i) {
        EXPECT_EQ(p.m_ClutMultiplier[0][i], multipliers[i]);
        EXPECT_EQ(p.m_ClutStride[0][i], 3 * multipliers[i]);
    }
    EXPECT_EQ(p.m_GridPowers[0][0], 25);
    EXPECT_EQ(p.m_GridPowers[0][1], 5);
    EXPECT_EQ(p.m_GridPowers[0][2], 1);
    EXPECT_EQ(p.m_InputLast[0], 255);
    EXPECT_EQ(p.m_GridLast[0], 4);
    EXPECT_EQ(p.m_InputStride[0][19], 19 * 256);
    EXPECT_EQ(p.m_OutputStride[0][9], 9 * 2);
    // Corners by the number of raised channels, then by channel index.
    const int s0 = 375, s1 = 75, s2 = 15, s3 = 3;
    const int expected[16] = {0,       s0,      s1,      s2,      s3,           s0 + s1,      s0 + s2,      s0 + s3,
                              s1 + s2, s1 + s3, s2 + s3, s0 + s1 + s2, s0 + s1 + s3, s0 + s2 + s3, s1 + s2 + s3,
                              s0 + s1 + s2 + s3};
    for (int k = 0; k < 16; ++k) EXPECT_EQ(p.m_CornerOffsets[0][k], expected[k]) << k;
}

TEST(LoadLut, Mft1HoldsBytesUnscaled) {
    TempDir dir;
    LutSpec lut = MakeLut(3, 3, 2, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(100 * node[0] + 10 * node[1] + node[2] + out);
    }, 256, 256, 255);
    const std::string path = Write(dir, "p.icc", IccBuilder("RGB ", "Lab ", "mntr").AddTag("B2A1", Mft1Tag(lut)));
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
    EXPECT_EQ(p.m_Lut[1].type, "mft1");
    EXPECT_EQ(p.m_Precision[1], 0);
    EXPECT_EQ(p.m_Clut[1], lut.clut);
    EXPECT_EQ(p.m_InputCurves[1][255], 255);
    EXPECT_EQ(p.m_OutputCurves[1][256 + 128], 128);
    EXPECT_EQ(p.m_OutputIdentity[1], 0);
    EXPECT_DOUBLE_EQ(p.m_GridScale[1], 1.0 / 255);
    EXPECT_DOUBLE_EQ(p.m_OutputScale[1], 1.0);
    EXPECT_EQ(p.m_Lut[1].colourSpace, "RGB ");
}

TEST(LoadLut, LegacyLabTablesAreStretchedToFullRange) {
    TempDir dir;
    // Lab -> Lab with the v2 encoding: L* 100 at 0xFF00, neutral a*/b* at 0x8000.
    LutSpec lut = MakeLut(3, 3, 2, [](const std::vector<int>& node, int out) {
        if (out == 0) return static_cast<uint16_t>(node[0] ? 0xFF00 : 0x1000);
        return static_cast<uint16_t>(0x8000);
    }, 256, 256, 0xFF00);
    lut.clut[0] = 0xFF00;  // the first node is the legacy white
    const std::string path = Write(dir, "p.icc", IccBuilder("Lab ", "Lab ", "abst").AddTag("A2B0", Mft2Tag(lut)));
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

TEST(LoadLut, A2B1FallsBackToA2B0ButB2A1DoesNot) {
    TempDir dir;
    const std::string path = Write(dir, "p.icc", IccBuilder().AddTag("A2B0", Mft2Tag(SmallCmykLut()))
                                                     .AddTag("B2A0", Mft2Tag(SmallCmykLut())));
    CProfil p;
    p.ReadTagTable(0, path);
    EXPECT_EQ(p.LoadLut(0, "A2B1", path), 1);
    EXPECT_EQ(p.m_Lut[0].tagIndex, 1);
    p.ReadTagTable(1, path);
    EXPECT_EQ(p.LoadLut(1, "B2A1", path), -1);
    EXPECT_TRUE(p.m_Tags[0].empty());
    EXPECT_TRUE(p.m_Tags[1].empty());
}

TEST(LoadLut, ReleaseFreesAndMarks) {
    TempDir dir;
    const std::string path = Write(dir, "p.icc", IccBuilder().AddTag("A2B1", Mft2Tag(SmallCmykLut()))
                                                     .AddTag("B2A1", Mft2Tag(SmallCmykLut())));
    CProfil p;
    p.MarkReleased();
    EXPECT_FALSE(p.HoldsTables());
    p.Release();
    EXPECT_EQ(LoadBoth(p, path, "A2B1", "B2A1"), 11);
    EXPECT_TRUE(p.HoldsTables());
    p.Release();
    EXPECT_EQ(p.m_Precision[0], CProfil::kReleasedMarker);
    EXPECT_TRUE(p.m_Clut[0].empty());
    EXPECT_TRUE(p.m_Tags[0].empty());
    EXPECT_FALSE(p.SlotHolds(0));
    p.Release();
    EXPECT_FALSE(p.HoldsTables());
}

TEST(LoadLut, V4TablesReadTheirCurveElements) {
    TempDir dir;
    LutSpec lut = SmallCmykLut(3, 17, 300);
    lut.inputCurves[2][5] = 1234;  // the channels stay apart
    lut.outputCurves[1][10] += 1;
    const std::string path = Write(dir, "v4.icc", IccBuilder("CMYK", "Lab ", "prtr", 0x04200000)
                                                      .AddTag("A2B0", MabTag(lut))
                                                      .AddTag("B2A0", MabTag(SmallCmykLut(3, 256, 2), true)));
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
    EXPECT_EQ(p.m_Lut[0].type, "mAB ");
    EXPECT_EQ(p.m_Precision[0], 3);
    EXPECT_EQ(p.m_FileInputEntries[0], 17);
    EXPECT_EQ(p.m_Lut[0].inputEntries, 256);
    EXPECT_EQ(p.m_Lut[0].outputEntries, 300);
    EXPECT_EQ(p.m_Clut[0], lut.clut);
    EXPECT_EQ(p.m_InputCurves[0].size(), 4u * 256);
    // Short curves are spread over 256 entries as "mft2" curves are; the last entry is the last sample.
    EXPECT_EQ(p.m_InputCurves[0][2 * 256 + 255], 65535);
    EXPECT_EQ(p.m_InputCurves[0][2 * 256 + 0], 0);
    EXPECT_EQ(p.m_OutputCurves[0].size(), 3u * 300);
    EXPECT_EQ(p.m_OutputCurves[0][300 + 299], 65535);
    EXPECT_DOUBLE_EQ(p.m_OutputScale[0], 299.0 / 65535);
    EXPECT_EQ(p.m_OutputIdentity[0], 0);  // one entry off the straight line
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A0", path), 1);
    EXPECT_EQ(p.m_Lut[1].type, "mBA ");
    EXPECT_EQ(std::vector<uint16_t>(p.m_InputCurves[1].begin(), p.m_InputCurves[1].begin() + 256), LinearCurve(256));
    EXPECT_EQ(p.m_OutputIdentity[1], 1);
}

TEST(LoadLut, MatrixTrcFromBuiltProfile) {
    TempDir dir;
    std::vector<uint16_t> sampled(20);
    for (int k = 0; k < 20; ++k) sampled[static_cast<size_t>(k)] = static_cast<uint16_t>(65535.0 * k * k / 361);
    const std::string path = Write(dir, "rgb.icc", IccBuilder("RGB ", "Lab ", "mntr")
                                                       .AddTag("rXYZ", XyzTag(0.4361, 0.2225, 0.0139))
                                                       .AddTag("gXYZ", XyzTag(0.3851, 0.7169, 0.0971))
                                                       .AddTag("bXYZ", XyzTag(0.1431, 0.0606, 0.7141))
                                                       .AddTag("rTRC", GammaCurvTag(2.2))
                                                       .AddTag("gTRC", CurvTag(sampled))
                                                       .AddTag("bTRC", CurvTag({})));
    CProfil p;
    EXPECT_EQ(LoadBoth(p, path, "A2B1", "B2A1"), 11);
    EXPECT_EQ(p.m_Lut[0].type, "MATR");
    EXPECT_EQ(p.m_Lut[0].pcs, "XYZ");  // an RGB matrix profile answers in XYZ whatever its header says
    EXPECT_EQ(p.m_Lut[0].colorantCount, 3);
    EXPECT_NEAR(p.m_Lut[0].matrix[1][1], 0.7169, 1e-4);
    EXPECT_NEAR(p.m_Trc[0].gamma[0], 2.2, 1.0 / 256);
    EXPECT_NEAR(p.m_Trc[0].curve[0][128], 255 * std::pow(128 / 255.0, p.m_Trc[0].gamma[0]), 1e-9);
    EXPECT_EQ(p.m_Trc[0].curve[2][77], 77);
    EXPECT_EQ(p.m_Trc[1].curve[2][77], 77);
    EXPECT_NEAR(p.m_Trc[0].curve[1][128], 255.0 * 128 * 128 / 255 / 255, 0.7);
    EXPECT_NEAR(p.m_Trc[1].curve[1][64], 255 * std::sqrt(64 / 255.0), 1.0);
    EXPECT_TRUE(p.SlotHolds(0));
    EXPECT_TRUE(p.SlotHolds(1));
}

TEST(LoadLut, PaperWhites) {
    TempDir dir;
    const std::string path = Write(dir, "p.icc", IccBuilder()
                                                     .AddTag("wtpt", XyzTag(0.8570, 0.8850, 0.7030))
                                                     .AddTag("A2B1", Mft2Tag(SmallCmykLut()))
                                                     .AddTag("B2A1", Mft2Tag(SmallCmykLut())));
    CProfil p;
    p.m_UseMediaWhite[0] = 1;
    EXPECT_EQ(LoadBoth(p, path, "A2B1", "B2A1"), 11);
    const Lab white = p.WhiteLab(0);
    EXPECT_NEAR(p.m_SlotWhite[0][0], white.L / 100, 1e-12);
    EXPECT_EQ(p.m_PaperWhite[0][0], static_cast<int>(white.L * 2.55 + 0.5));
    EXPECT_EQ(p.m_PaperWhite[0][1], static_cast<int>(white.a + 0.5));
    EXPECT_EQ(p.m_PaperWhite[0][2], static_cast<int>(white.b + 0.5));
    // Without the media white the direction-1 paper white is the colour space's own.
    EXPECT_EQ(p.m_SlotWhite[1][0], 1.0);
    EXPECT_EQ(p.m_PaperWhite[1][0], 0);
    EXPECT_EQ(p.m_PaperWhite[1][3], 0);
}
