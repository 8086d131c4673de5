#include <gtest/gtest.h>

#include <filesystem>
#include <random>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

LutSpec Cmyk2Lab(int grid = 3) {
    return MakeLut(4, 3, grid, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(1000 * out + node[0] + node[1]);
    });
}

// Reads both directions the way the slot loaders do; answers the two LoadLut results.
std::pair<int, int> LoadAsPaper(const std::string& path) {
    CProfil p;
    p.MarkReleased();
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = 1;
    p.ReadTagTable(0, path);
    const int forward = p.LoadLut(0, "A2B1", path);
    p.ReadTagTable(1, path);
    const int backward = p.LoadLut(1, "B2A1", path);
    // Whatever happened, a slot holds a whole table exactly when it was loaded.
    EXPECT_EQ(p.SlotHolds(0), forward == 1);
    EXPECT_EQ(p.SlotHolds(1), backward == 1);
    p.Release();
    return {forward, backward};
}

Bytes GoodProfile() {
    return IccBuilder()
        .AddTag("wtpt", XyzTag(0.9, 0.93, 0.75))
        .AddTag("A2B1", Mft2Tag(Cmyk2Lab()))
        .AddTag("B2A1", Mft2Tag(MakeLut(3, 4, 3, [](const std::vector<int>&, int) { return uint16_t{7}; })))
        .Build();
}

}  // namespace

TEST(MalformedProfiles, TruncatedFilesFailCleanly) {
    TempDir dir;
    const Bytes good = GoodProfile();
    ASSERT_EQ(LoadAsPaper(WriteFile(dir.File("good.icc"), good)), std::make_pair(1, 1));
    const size_t cuts[] = {0, 1, 100, 131, 132, 140, 168, TagOffset(good, 1) + 20, TagOffset(good, 1) + 60,
                           TagOffset(good, 2) - 1, good.size() - 1};
    for (size_t cut : cuts) {
        const Bytes bytes(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(cut));
        const auto result = LoadAsPaper(WriteFile(dir.File("cut.icc"), bytes));
        EXPECT_EQ(result.second, -1) << cut;  // the last table never fits a truncated file
        if (cut < TagOffset(good, 1) + TagSize(good, 1)) {
            EXPECT_EQ(result.first, -1) << cut;
        } else {
            EXPECT_EQ(result.first, 1) << cut;
        }
    }
    EXPECT_EQ(LoadAsPaper(dir.File("missing.icc")), std::make_pair(-1, -1));
}

TEST(MalformedProfiles, ImpossibleDirectories) {
    TempDir dir;
    for (uint32_t count : {0x80000000u, 0xFFFFFFFFu, 5000u}) {
        Bytes bytes = GoodProfile();
        PutU32(bytes, 128, count);
        CProfil p;
        p.ReadTagTable(0, WriteFile(dir.File("count.icc"), bytes));
        EXPECT_LE(p.m_Tags[0].size(), 4096u);
        // The three real records still read; the records after them are tag data, not tags.
        EXPECT_EQ(p.m_Tags[0][1].signature, "A2B1");
    }
    // A tag pointing past the end ends the directory there.
    Bytes bytes = GoodProfile();
    PutU32(bytes, TagRecord(1) + 4, 0xFFFFFFF0u);
    EXPECT_EQ(LoadAsPaper(WriteFile(dir.File("offset.icc"), bytes)), std::make_pair(-1, -1));
    bytes = GoodProfile();
    PutU32(bytes, TagRecord(2) + 4, static_cast<uint32_t>(bytes.size() - 60));
    EXPECT_EQ(LoadAsPaper(WriteFile(dir.File("late.icc"), bytes)), std::make_pair(1, -1));
}

TEST(MalformedProfiles, ImpossibleCounts) {
    TempDir dir;
    struct Patch {
        size_t at;  // inside the A2B1 tag
        unsigned value;
        bool wide;
    };
    // inputs, outputs, grid (byte 8, 9, 10); input and output entries (16-bit at 48 and 50).
    const Patch patches[] = {{8, 0, false},  {8, 8, false},  {8, 15, false},     {9, 0, false},     {9, 16, false},
                             {10, 0, false}, {10, 1, false}, {10, 255, false},   {48, 0, true},     {48, 1, true},
                             {50, 0, true},  {50, 1, true},  {48, 65535, true},  {50, 65535, true}};
    for (const Patch& patch : patches) {
        Bytes bytes = GoodProfile();
        const size_t tag = TagOffset(bytes, 1);
        if (patch.wide)
            PutU16(bytes, tag + patch.at, patch.value);
        else
            bytes[tag + patch.at] = static_cast<uint8_t>(patch.value);
        EXPECT_EQ(LoadAsPaper(WriteFile(dir.File("count.icc"), bytes)).first, -1) << patch.at << " " << patch.value;
    }
    // Grid 255 with 15 inputs: far beyond any memory, refused before allocating.
    Bytes bytes = GoodProfile();
    bytes[TagOffset(bytes, 1) + 8] = 15;
    bytes[TagOffset(bytes, 1) + 10] = 255;
    EXPECT_EQ(LoadAsPaper(WriteFile(dir.File("huge.icc"), bytes)).first, -1);
    // Seven inputs on a 255 grid pass the channel checks but not the size check.
    bytes[TagOffset(bytes, 1) + 8] = 7;
    EXPECT_EQ(LoadAsPaper(WriteFile(dir.File("huge7.icc"), bytes)).first, -1);
}

TEST(MalformedProfiles, V4TablesOutsideTheSupportedShape) {
    TempDir dir;
    const LutSpec lut = Cmyk2Lab();
    auto load = [&dir](const Bytes& bytes) {
        CProfil p;
        const std::string path = WriteFile(dir.File("v4.icc"), bytes);
        p.ReadTagTable(0, path);
        return p.LoadLut(0, "A2B0", path);
    };
    const Bytes good = IccBuilder("CMYK", "Lab ", "prtr", 0x04200000).AddTag("A2B0", MabTag(lut)).Build();
    ASSERT_EQ(load(good), 1);
    const size_t tag = TagOffset(good, 0);
    const size_t clut = tag + GetU32(good, tag + 24);
    const size_t aCurves = tag + GetU32(good, tag + 28);
    auto variant = [&good](size_t at, uint32_t value, bool wide = true) {
        Bytes bytes = good;
        if (wide)
            PutU32(bytes, at, value);
        else
            bytes[at] = static_cast<uint8_t>(value);
        return bytes;
    };
    EXPECT_EQ(load(variant(tag + 16, 32)), -1);          // a matrix
    EXPECT_EQ(load(variant(tag + 20, 32)), -1);          // M curves
    EXPECT_EQ(load(variant(tag + 24, 0)), -1);           // no CLUT
    EXPECT_EQ(load(variant(tag + 28, 0)), -1);           // no A curves
    EXPECT_EQ(load(variant(tag + 24, 0x7FFFFFF0)), -1);  // CLUT past the end
    EXPECT_EQ(load(variant(clut + 16, 1, false)), -1);   // 8-bit CLUT
    EXPECT_EQ(load(variant(clut + 2, 2, false)), -1);    // uneven grid
    EXPECT_EQ(load(variant(aCurves, 0x70617261)), -1);   // "para" instead of "curv"
    EXPECT_EQ(load(variant(aCurves + 8, 0)), -1);        // a curve of no entries
    EXPECT_EQ(load(variant(aCurves + 8, 1)), -1);        // a gamma curve
    EXPECT_EQ(load(variant(aCurves + 8, 0x10002)), -1);  // more entries than the low 16 bits say
    EXPECT_EQ(load(Bytes(good.begin(), good.end() - 8)), -1);
}

TEST(MalformedProfiles, MatrixTrcTagsOutsideTheSupportedShape) {
    TempDir dir;
    auto rgb = [](Bytes red, Bytes redTrc) {
        return IccBuilder("RGB ", "XYZ ", "mntr")
            .AddTag("rXYZ", std::move(red))
            .AddTag("gXYZ", XyzTag(0.38, 0.71, 0.09))
            .AddTag("bXYZ", XyzTag(0.14, 0.06, 0.71))
            .AddTag("rTRC", std::move(redTrc))
            .AddTag("gTRC", GammaCurvTag(2.2))
            .AddTag("bTRC", CurvTag({}))
            .Build();
    };
    auto load = [&dir](const Bytes& bytes) {
        CProfil p;
        const std::string path = WriteFile(dir.File("rgb.icc"), bytes);
        p.ReadTagTable(1, path);
        return p.LoadLut(1, "B2A1", path);
    };
    EXPECT_EQ(load(rgb(XyzTag(0.44, 0.22, 0.01), GammaCurvTag(1.8))), 1);
    Bytes longXyz = XyzTag(0.44, 0.22, 0.01);
    longXyz.resize(24);
    EXPECT_EQ(load(rgb(longXyz, GammaCurvTag(1.8))), -1);
    EXPECT_EQ(load(rgb(XyzTag(0.44, 0.22, 0.01), ParaTag(1.8))), -1);
    EXPECT_EQ(load(rgb(XyzTag(0, 0, 0), GammaCurvTag(1.8))), -1);  // no inverse
    Bytes shortCurve = CurvTag({0, 100, 65535});
    PutU32(shortCurve, 8, 400000);  // more samples than the file holds
    EXPECT_EQ(load(rgb(XyzTag(0.44, 0.22, 0.01), shortCurve)), -1);
}

// Real profiles cut at every few hundred bytes and with random bytes in the tag table and the
// table heads: nothing may crash, read outside the file or allocate without bound.
TEST(MalformedProfiles, CorruptedRealProfiles) {
    std::vector<std::string> corpus = {SystemIccDir() + "ghostscript/default_cmyk.icc",
                                       SystemIccDir() + "ghostscript/ps_cmyk.icc", SystemIccDir() + "sRGB.icc"};
    if (const std::string fogra = FixtureProfile("TR003"); !fogra.empty()) corpus.push_back(fogra);
    TempDir dir;
    std::mt19937 random(2024);
    for (const std::string& source : corpus) {
        if (!std::filesystem::exists(source)) continue;
        const Bytes good = ReadFile(source);
        for (size_t cut = 0; cut < good.size(); cut += 1 + good.size() / 40)
            LoadAsPaper(WriteFile(dir.File("cut.icc"), Bytes(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(cut))));
        const size_t count = GetU32(good, 128);
        for (int round = 0; round < 100; ++round) {
            Bytes bytes = good;
            for (int k = 0; k < 4; ++k) {
                const size_t tag = random() % count;
                // A byte of the tag table, or of the first 64 bytes of a tag.
                const size_t at = random() % 2 ? TagRecord(tag) + random() % 12
                                               : std::min(bytes.size() - 1, size_t{TagOffset(good, tag)} + random() % 64);
                bytes[at] = static_cast<uint8_t>(random());
            }
            LoadAsPaper(WriteFile(dir.File("bad.icc"), bytes));
        }
    }
}
