// Tables and white points patched back into profile files in place.
#include <gtest/gtest.h>

#include <filesystem>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"
#include "helpers/profile_corpus.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

LutSpec RgbToCmyk(int grid, int inEntries, unsigned top = 65535) {
    return MakeLut(3, 4, grid, [top](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>((4000 * node[0] + 300 * node[1] + 20 * node[2] + out) % (top + 1));
    }, inEntries, 256, top);
}

// Lab to Lab in the legacy encoding: white (0xFF00, 0x8000, 0x8000) at the first node, one L*
// above 100, curves ending at 0xFF00.
LutSpec LegacyLab() {
    return MakeLut(3, 3, 3, [](const std::vector<int>& node, int out) {
        if (out > 0) return static_cast<uint16_t>(0x8000 + 0x300 * node[out] - 0x100 * node[0]);
        if (node[0] == 1 && node[1] == 1 && node[2] == 1) return uint16_t{0xFF80};
        return static_cast<uint16_t>(0xFF00 - 0x2345 * node[0] - 0x111 * node[1] - 0x11 * node[2]);
    }, 256, 256, 0xFF00);
}

// How many bytes differ between two files of the same size.
size_t Differences(const Bytes& a, const Bytes& b) {
    size_t count = 0;
    for (size_t k = 0; k < a.size(); ++k) count += a[k] != b.at(k);
    return count;
}

}  // namespace

// Written back unchanged, every kind of table leaves its file byte-identical; one changed node
// changes only its own bytes, which lcms2 then reads as the new value.
TEST(WriteClut, UnchangedTablesRewriteIdenticallyAndOneNodeChangesOnlyItsBytes) {
    TempDir dir;
    struct Case {
        std::string path;
        int direction;
        const char* tag;
        cmsTagSignature signature;
    };
    std::vector<Case> cases = {
        // Two-entry input curves: the CLUT lies after the curves as the file holds them.
        {WriteFile(dir.File("two.icc"), IccBuilder().AddTag("B2A1", Mft2Tag(RgbToCmyk(5, 2))).Build()), 1, "B2A1",
         cmsSigBToA1Tag},
        {WriteFile(dir.File("mft1.icc"), IccBuilder("RGB ").AddTag("A2B0", Mft1Tag(RgbToCmyk(3, 256, 255))).Build()), 0,
         "A2B0", cmsSigAToB0Tag},
        {dir.File("v4.icc"), 0, "A2B0", cmsSigAToB0Tag},
        {dir.File("v4.icc"), 1, "B2A0", cmsSigBToA0Tag},
        // Legacy Lab encoding (L* 100 at 0xFF00), held stretched, written back as the file had it,
        // including an L* above 100 that the stretch clips.
        {WriteFile(dir.File("legacy.icc"), IccBuilder("Lab ", "Lab ", "abst").AddTag("B2A1", Mft2Tag(LegacyLab())).Build()),
         1, "B2A1", cmsSigBToA1Tag},
    };
    ASSERT_TRUE(WriteLcmsV4Profile(dir.File("v4.icc")));
    if (const std::string fogra = CorpusProfile("FOGRA39L").path; !fogra.empty()) {
        std::filesystem::copy_file(fogra, dir.File("fogra.icc"));
        cases.push_back({dir.File("fogra.icc"), 0, "A2B1", cmsSigAToB1Tag});
    }
    for (const Case& c : cases) {
        SCOPED_TRACE(c.path + " " + c.tag);
        const Bytes before = ReadFile(c.path);
        CProfil p;
        p.ReadTagTable(c.direction, c.path);
        ASSERT_EQ(p.LoadLut(c.direction, c.tag, c.path), 1);
        ASSERT_TRUE(p.WriteClut(c.direction, c.path));
        EXPECT_EQ(ReadFile(c.path), before);

        std::vector<uint16_t>& clut = p.m_Clut[c.direction];
        const size_t node = clut.size() / 2 + 1;
        const bool wide = p.m_Lut[c.direction].type != "mft1";
        clut[node] = static_cast<uint16_t>(clut[node] ^ (wide ? 0x0101 : 0x01));
        ASSERT_TRUE(p.WriteClut(c.direction, c.path));
        const Bytes after = ReadFile(c.path);
        ASSERT_EQ(after.size(), before.size());
        EXPECT_EQ(Differences(before, after), wide ? 2u : 1u);
        EXPECT_EQ(ReadWithLcms(c.path, c.signature).clut.at(node), wide ? clut[node] : clut[node] * 257);
    }
}

TEST(WriteClut, AnotherFileIsNeverTouched) {
    TempDir dir;
    const std::string loaded = WriteFile(dir.File("a.icc"), IccBuilder().AddTag("B2A1", Mft2Tag(RgbToCmyk(5, 2))).Build());
    const Bytes otherGrid = IccBuilder().AddTag("B2A1", Mft2Tag(RgbToCmyk(3, 2))).Build();
    const Bytes otherType = IccBuilder().AddTag("B2A1", Mft1Tag(RgbToCmyk(5, 256, 255))).Build();
    const Bytes otherCurves = IccBuilder().AddTag("B2A1", Mft2Tag(RgbToCmyk(5, 3))).Build();
    Bytes truncated = IccBuilder().AddTag("B2A1", Mft2Tag(RgbToCmyk(5, 2))).Build();
    truncated.resize(truncated.size() - 100);
    CProfil p;
    p.ReadTagTable(1, loaded);
    ASSERT_EQ(p.LoadLut(1, "B2A1", loaded), 1);
    for (const Bytes& bytes : {otherGrid, otherType, otherCurves, truncated}) {
        const std::string path = WriteFile(dir.File("b.icc"), bytes);
        EXPECT_FALSE(p.WriteClut(1, path));
        EXPECT_EQ(ReadFile(path), bytes);
    }
    EXPECT_FALSE(p.WriteClut(1, dir.File("missing.icc")));
    EXPECT_FALSE(std::filesystem::exists(dir.File("missing.icc")));
}

TEST(WriteWhitePoint, WritesTheWhiteIntoWtptOnly) {
    TempDir dir;
    const Bytes bytes = IccBuilder().AddTag("wtpt", XyzTag(0.85, 0.9, 0.7)).AddTag("B2A1", Mft2Tag(RgbToCmyk(3, 2))).Build();
    const std::string path = WriteFile(dir.File("p.icc"), bytes);
    CProfil p;
    p.ReadTagTable(1, path);
    p.SetWhiteL(1, 0.93);
    p.SetWhiteA(1, 1.5);
    p.SetWhiteB(1, -4.0);
    ASSERT_TRUE(p.WriteWhitePoint(1, path));
    Bytes rest = ReadFile(path);
    const auto at = static_cast<std::ptrdiff_t>(TagOffset(bytes, 0) + 8);  // the three numbers of the XYZ tag
    std::copy_n(bytes.begin() + at, 12, rest.begin() + at);
    EXPECT_EQ(rest, bytes);  // nothing else changed
    // Read back, the written white is the Lab it came from; a neutral one is the illuminant itself.
    p.ReadTagTable(0, path);
    const Lab written = p.WhiteLab(0);
    EXPECT_NEAR(written.L, 93.0, 1e-3);
    EXPECT_NEAR(written.a, 1.5, 2e-3);
    EXPECT_NEAR(written.b, -4.0, 2e-3);
    p.SetWhiteL(1, 1.0);
    p.SetWhiteA(1, 0.0);
    p.SetWhiteB(1, 0.0);
    ASSERT_TRUE(p.WriteWhitePoint(1, path));
    const Bytes neutral = ReadFile(path);
    EXPECT_EQ(GetU32(neutral, static_cast<size_t>(at)), p.IlluminantX());
    EXPECT_EQ(GetU32(neutral, static_cast<size_t>(at) + 8), p.IlluminantZ());
    // Without a "wtpt" tag only the profile in memory changes.
    const Bytes bare = IccBuilder().AddTag("B2A1", Mft2Tag(RgbToCmyk(3, 2))).Build();
    const std::string barePath = WriteFile(dir.File("bare.icc"), bare);
    p.SetWhiteL(1, 0.5);
    p.m_MediaWhite[1][1] = 0;  // recomputed all the same
    EXPECT_FALSE(p.WriteWhitePoint(1, barePath));
    EXPECT_EQ(ReadFile(barePath), bare);
    EXPECT_NEAR(p.m_MediaWhite[1][1], std::pow((50.0 + 16) / 116, 3), 1e-4);
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
    // A buffer one word short is left alone; the table is written all the same.
    EXPECT_TRUE(p.ExportClut3(path, buffer.data(), buffer.size() - 1));
    EXPECT_EQ(buffer, std::vector<uint16_t>(buffer.size(), 0xEEEE));
    ASSERT_TRUE(p.ExportClut3(path, buffer.data(), buffer.size()));
    EXPECT_EQ(ReadWithLcms(path, cmsSigBToA1Tag).clut.at(0), 77);  // written to the file first
    const std::vector<uint16_t> head = {4, 16, 4, 1, 0, 48, 12, 3, 60, 51, 15, 63};
    EXPECT_EQ(std::vector<uint16_t>(buffer.begin(), buffer.begin() + 12), head);
    EXPECT_EQ(buffer[12], 77);
    EXPECT_EQ(buffer[12 + 3 * 5 + 2], 2000 + 5);  // node (0, 1, 1), third output
    EXPECT_EQ(buffer[12 + 3 * 64], 6 * 64 + 26);
}

// Links of four to seven channels have no buffer layout, but their corrected table still reaches
// the file; a matrix/TRC slot has no CLUT at all and is refused.
TEST(ExportClut3, WritesEveryTableButFillsTheBufferForThreeInputsOnly) {
    TempDir dir;
    const LutSpec link = MakeLut(4, 4, 3, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(20000 * node[out] + 7);
    });
    const std::string path = WriteFile(dir.File("link.icc"), IccBuilder("CMYK", "CMYK", "link").AddTag("A2B0", Mft2Tag(link)).Build());
    CProfil p;
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "A2B0", path), 1);
    p.m_Clut[1][5] = 4321;
    std::vector<uint16_t> buffer(4096, 0xEEEE);
    EXPECT_TRUE(p.ExportClut3(path, buffer.data(), buffer.size()));
    EXPECT_EQ(ReadWithLcms(path, cmsSigAToB0Tag).clut.at(5), 4321);
    EXPECT_EQ(buffer, std::vector<uint16_t>(4096, 0xEEEE));

    const std::string srgb = CorpusProfile("sRGB").path;
    if (!std::filesystem::exists(srgb)) return;
    std::filesystem::copy_file(srgb, dir.File("srgb.icc"));
    const Bytes before = ReadFile(dir.File("srgb.icc"));
    CProfil rgb;
    rgb.ReadTagTable(1, dir.File("srgb.icc"));
    ASSERT_EQ(rgb.LoadLut(1, "B2A1", dir.File("srgb.icc")), 1);
    ASSERT_EQ(rgb.m_Lut[1].type, "MATR");
    EXPECT_FALSE(rgb.ExportClut3(dir.File("srgb.icc"), buffer.data(), buffer.size()));
    EXPECT_EQ(ReadFile(dir.File("srgb.icc")), before);
}
