#include <gtest/gtest.h>

#include <lcms2.h>
#include <lcms2_plugin.h>

#include <filesystem>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

LutSpec Rgb2Cmyk(int grid, int inEntries) {
    return MakeLut(3, 4, grid, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(4000 * node[0] + 300 * node[1] + 20 * node[2] + out);
    }, inEntries, 256);
}

// How many bytes differ, and where the first difference is.
size_t Differences(const Bytes& a, const Bytes& b, size_t* first = nullptr) {
    size_t count = 0;
    for (size_t k = 0; k < a.size() && k < b.size(); ++k)
        if (a[k] != b[k]) {
            if (count++ == 0 && first) *first = k;
        }
    return count + (a.size() > b.size() ? a.size() - b.size() : b.size() - a.size());
}

// The CLUT of a tag as lcms2 reads it from the patched file.
std::vector<uint16_t> LcmsClut(const std::string& path, cmsTagSignature tag) {
    std::vector<uint16_t> values;
    cmsHPROFILE profile = cmsOpenProfileFromFile(path.c_str(), "r");
    if (!profile) return values;
    if (auto* pipeline = static_cast<cmsPipeline*>(cmsReadTag(profile, tag)))
        for (cmsStage* stage = cmsPipelineGetPtrToFirstStage(pipeline); stage; stage = cmsStageNext(stage))
            if (cmsStageType(stage) == cmsSigCLutElemType) {
                auto* data = static_cast<_cmsStageCLutData*>(cmsStageData(stage));
                values.assign(data->Tab.T, data->Tab.T + data->nEntries);
            }
    cmsCloseProfile(profile);
    return values;
}

}  // namespace

TEST(WriteClut, UnchangedTableRewritesIdenticalBytes) {
    TempDir dir;
    std::vector<std::string> files = {
        WriteFile(dir.File("two.icc"), IccBuilder("CMYK").AddTag("B2A1", Mft2Tag(Rgb2Cmyk(5, 2))).Build())};
    if (const std::string fogra = FixtureProfile("FOGRA39L"); !fogra.empty()) {
        std::filesystem::copy_file(fogra, dir.File("fogra.icc"));
        files.push_back(dir.File("fogra.icc"));
    }
    for (const std::string& path : files) {
        const Bytes before = ReadFile(path);
        CProfil p;
        p.ReadTagTable(1, path);
        ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
        EXPECT_TRUE(p.WriteClut(1, path));
        EXPECT_EQ(ReadFile(path), before) << path;
    }
}

TEST(WriteClut, OneNodeChangesOnlyItsTwoBytes) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    TempDir dir;
    const std::string path = dir.File("fogra.icc");
    std::filesystem::copy_file(fogra, path);
    const Bytes before = ReadFile(path);
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
    const size_t node = 1234;
    p.m_Clut[0][node] = static_cast<uint16_t>(p.m_Clut[0][node] ^ 0x0101);
    ASSERT_TRUE(p.WriteClut(0, path));
    const Bytes after = ReadFile(path);
    size_t first = 0;
    EXPECT_EQ(Differences(before, after, &first), 2u);
    EXPECT_EQ(static_cast<int64_t>(first), p.FindClutOffset(0, path) + 2 * static_cast<int64_t>(node));
    // A2B0 and A2B2 share the table in this profile, so lcms2 sees the change under every tag.
    EXPECT_EQ(LcmsClut(path, cmsSigAToB1Tag)[node], p.m_Clut[0][node]);
}

TEST(WriteClut, PositionUsesTheFileCurveLength) {
    TempDir dir;
    const Bytes bytes = IccBuilder("CMYK").AddTag("B2A1", Mft2Tag(Rgb2Cmyk(3, 2))).Build();
    const std::string path = WriteFile(dir.File("p.icc"), bytes);
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
    EXPECT_EQ(p.m_Lut[1].inputEntries, 256);
    EXPECT_EQ(p.FindClutOffset(1, path), TagOffset(bytes, 0) + 52 + 3 * 2 * 2);
    EXPECT_EQ(p.FindClutOffset(1, dir.File("missing.icc")), 0);
}

TEST(WriteClut, Mft1IsWrittenOneBytePerValue) {
    TempDir dir;
    const LutSpec lut = MakeLut(3, 3, 3, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(80 * node[0] + 9 * node[1] + node[2] + out);
    }, 256, 256, 255);
    const Bytes bytes = IccBuilder("RGB ").AddTag("A2B0", Mft1Tag(lut)).Build();
    const std::string path = WriteFile(dir.File("p.icc"), bytes);
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B0", path), 1);
    const int64_t clut = p.FindClutOffset(0, path);
    EXPECT_EQ(clut, TagOffset(bytes, 0) + 48 + 3 * 256);
    p.m_Clut[0][5] = 0x12AB;  // only the low byte fits
    ASSERT_TRUE(p.WriteClut(0, path));
    const Bytes after = ReadFile(path);
    EXPECT_EQ(Differences(bytes, after), 1u);
    EXPECT_EQ(after[static_cast<size_t>(clut) + 5], 0xAB);
}

TEST(WriteClut, V4TableIsPatchedAfterItsClutHead) {
    TempDir dir;
    const LutSpec lut = Rgb2Cmyk(3, 256);
    const std::string path = WriteFile(dir.File("p.icc"), IccBuilder("RGB ", "Lab ", "prtr", 0x04200000)
                                                              .AddTag("B2A1", MabTag(lut, true))
                                                              .Build());
    const Bytes before = ReadFile(path);
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
    ASSERT_TRUE(p.WriteClut(1, path));
    EXPECT_EQ(ReadFile(path), before);
    p.m_Clut[1][7] = 4321;
    ASSERT_TRUE(p.WriteClut(1, path));
    EXPECT_EQ(Differences(before, ReadFile(path)), 2u);
    EXPECT_EQ(LcmsClut(path, cmsSigBToA1Tag)[7], 4321);
}

TEST(WriteClut, AnotherFileIsNeverTouched) {
    TempDir dir;
    const std::string loaded = WriteFile(dir.File("a.icc"), IccBuilder().AddTag("B2A1", Mft2Tag(Rgb2Cmyk(5, 2))).Build());
    const Bytes otherGrid = IccBuilder().AddTag("B2A1", Mft2Tag(Rgb2Cmyk(3, 2))).Build();
    const Bytes otherType = IccBuilder().AddTag("B2A1", MabTag(Rgb2Cmyk(5, 2), true)).Build();
    Bytes truncated = IccBuilder().AddTag("B2A1", Mft2Tag(Rgb2Cmyk(5, 2))).Build();
    truncated.resize(truncated.size() - 100);
    CProfil p;
    p.ReadTagTable(1, loaded);
    ASSERT_EQ(p.LoadLut(1, "B2A1", loaded), 1);
    for (const Bytes& bytes : {otherGrid, otherType, truncated}) {
        const std::string path = WriteFile(dir.File("b.icc"), bytes);
        EXPECT_FALSE(p.WriteClut(1, path));
        EXPECT_EQ(ReadFile(path), bytes);
    }
    EXPECT_FALSE(p.WriteClut(1, dir.File("missing.icc")));
    EXPECT_FALSE(std::filesystem::exists(dir.File("missing.icc")));
}

TEST(WriteWhitePoint, NeutralWhiteWritesTheIlluminant) {
    TempDir dir;
    const Bytes bytes = IccBuilder().AddTag("wtpt", XyzTag(0.85, 0.9, 0.7)).AddTag("B2A1", Mft2Tag(Rgb2Cmyk(3, 2))).Build();
    const std::string path = WriteFile(dir.File("p.icc"), bytes);
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
    EXPECT_EQ(p.FindWhitePointOffset(1, path), TagOffset(bytes, 0) + 8);
    p.SetWhiteL(1, 1.0);
    p.SetWhiteA(1, 0.0);
    p.SetWhiteB(1, 0.0);
    ASSERT_TRUE(p.WriteWhitePoint(1, path));
    const Bytes after = ReadFile(path);
    const size_t at = TagOffset(bytes, 0) + 8;
    EXPECT_EQ(GetU32(after, at), p.IlluminantX());
    EXPECT_EQ(GetU32(after, at + 4), p.IlluminantY());
    EXPECT_EQ(GetU32(after, at + 8), p.IlluminantZ());
    EXPECT_EQ(Differences(bytes, after), Differences(Bytes(bytes.begin() + at, bytes.begin() + at + 12),
                                                     Bytes(after.begin() + at, after.begin() + at + 12)));
    // The value read back agrees with the Lab it came from.
    p.ReadTagTable(0, path);
    p.SetWhiteL(1, 0.93);
    p.SetWhiteA(1, 1.5);
    p.SetWhiteB(1, -4.0);
    ASSERT_TRUE(p.WriteWhitePoint(1, path));
    p.ReadTagTable(0, path);
    const Lab written = p.WhiteLab(0);
    EXPECT_NEAR(written.L, 93.0, 1e-3);
    EXPECT_NEAR(written.a, 1.5, 2e-3);
    EXPECT_NEAR(written.b, -4.0, 2e-3);
}

TEST(WriteWhitePoint, WithoutTagOnlyMemoryChanges) {
    TempDir dir;
    const Bytes bytes = IccBuilder().AddTag("B2A1", Mft2Tag(Rgb2Cmyk(3, 2))).Build();
    const std::string path = WriteFile(dir.File("p.icc"), bytes);
    CProfil p;
    p.ReadTagTable(1, path);
    EXPECT_EQ(p.FindWhitePointOffset(1, path), -1);
    p.SetWhiteL(1, 0.5);
    p.m_MediaWhite[1][1] = 0;
    EXPECT_FALSE(p.WriteWhitePoint(1, path));
    EXPECT_EQ(ReadFile(path), bytes);
    EXPECT_NEAR(p.m_MediaWhite[1][1], std::pow((50.0 + 16) / 116, 3), 1e-12);
}

TEST(ClutSnapshot, RestoreUndoesChanges) {
    TempDir dir;
    const std::string path = WriteFile(dir.File("p.icc"), IccBuilder().AddTag("B2A1", Mft2Tag(Rgb2Cmyk(3, 2))).Build());
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
    const std::vector<uint16_t> original = p.m_Clut[1];
    const std::vector<uint16_t> snapshot = p.SnapshotClut(7);  // non-zero means slot 1
    for (uint16_t& v : p.m_Clut[1]) v = 1;
    EXPECT_TRUE(p.RestoreClut(1, snapshot));
    EXPECT_EQ(p.m_Clut[1], original);
    EXPECT_FALSE(p.RestoreClut(1, {1, 2, 3}));
    EXPECT_EQ(p.m_Clut[1], original);
    EXPECT_EQ(p.GridPoints(1), 3);
    EXPECT_EQ(p.GridPoints(0), p.m_Lut[0].gridPoints);
}

TEST(ExportClut3, FillsTheHostLayout) {
    TempDir dir;
    const LutSpec lut = MakeLut(3, 3, 4, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(1000 * out + 16 * node[0] + 4 * node[1] + node[2]);
    });
    const std::string path = WriteFile(dir.File("p.icc"), IccBuilder("Lab ", "Lab ", "abst").AddTag("B2A1", Mft2Tag(lut)).Build());
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
    p.m_Clut[1][0] = 77;
    std::vector<uint16_t> buffer(13 + 3 * 64, 0xEEEE);
    EXPECT_FALSE(p.ExportClut3(path, buffer.data(), buffer.size() - 1));
    ASSERT_TRUE(p.ExportClut3(path, buffer.data(), buffer.size()));
    EXPECT_EQ(LcmsClut(path, cmsSigBToA1Tag)[0], 77);
    const std::vector<uint16_t> head = {4, 16, 4, 1, 0, 48, 12, 3, 60, 51, 15, 63};
    EXPECT_EQ(std::vector<uint16_t>(buffer.begin(), buffer.begin() + 12), head);
    EXPECT_EQ(buffer[12], 77);
    EXPECT_EQ(buffer[12 + 3 * 5 + 2], 2000 + 5);  // node (0, 1, 1), third output
    EXPECT_EQ(buffer[12 + 3 * 64], 6 * 64 + 26);
}
