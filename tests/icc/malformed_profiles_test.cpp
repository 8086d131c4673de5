// Broken profiles: each gives the documented failure, never a crash, a read outside the file or an
// unbounded allocation (these tests also run under the sanitizers).
#include <gtest/gtest.h>

#include <filesystem>
#include <functional>
#include <random>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"
#include "helpers/lcms_oracle.h"
#include "helpers/profile_corpus.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// Reads both directions the way the slot loaders do; answers the two LoadLut results.
std::pair<int, int> Load(const std::string& path, const char* a2b = "A2B1", const char* b2a = "B2A1") {
    CProfil p;
    p.MarkReleased();
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = 1;
    p.ReadTagTable(0, path);
    const int forward = p.LoadLut(0, a2b, path);
    p.ReadTagTable(1, path);
    const int backward = p.LoadLut(1, b2a, path);
    // Whatever happened, a slot holds a whole table exactly when it was loaded.
    EXPECT_EQ(p.SlotHolds(0), forward == 1);
    EXPECT_EQ(p.SlotHolds(1), backward == 1);
    // A refusal says why; a load that succeeds leaves no reason behind.
    EXPECT_EQ(p.m_LoadFailure.empty(), backward == 1) << p.m_LoadFailure;
    return {forward, backward};
}

// The tag-table position of the first tag named `signature`.
size_t Record(const Bytes& bytes, const char* signature) {
    for (size_t i = 0; i < GetU32(bytes, 128); ++i)
        if (std::equal(signature, signature + 4, bytes.begin() + static_cast<std::ptrdiff_t>(TagRecord(i)))) return i;
    ADD_FAILURE() << "no tag " << signature;
    return 0;
}

using Edit = std::function<void(Bytes&, size_t tag)>;
Edit Byte(size_t at, unsigned v) { return [=](Bytes& b, size_t tag) { b[tag + at] = static_cast<uint8_t>(v); }; }
Edit Word(size_t at, unsigned v) { return [=](Bytes& b, size_t tag) { Put(b, tag + at, v, 2); }; }
Edit Long(size_t at, uint32_t v) { return [=](Bytes& b, size_t tag) { Put(b, tag + at, v, 4); }; }
Edit Cut(size_t from) { return [=](Bytes& b, size_t tag) { b.resize(tag + from); }; }
// An edit at a position given by one of a v4 table's offsets (24 the CLUT, 28 the A curves).
Edit Inside(size_t offsetField, Edit edit) {
    return [=](Bytes& b, size_t tag) { edit(b, tag + GetU32(b, tag + offsetField)); };
}

}  // namespace

TEST(MalformedProfiles, VariantsFailCleanly) {
    TempDir dir;
    const Bytes mft2 =
        IccBuilder()
            .AddTag("wtpt", XyzTag(0.9, 0.93, 0.75))
            .AddTag("A2B1", Mft2Tag(MakeLut(4, 3, 3, [](const std::vector<int>& n, int o) { return uint16_t(1000 * o + n[0]); })))
            .AddTag("B2A1", Mft2Tag(MakeLut(3, 4, 3, [](const std::vector<int>&, int) { return uint16_t{7}; })))
            .Build();
    ASSERT_TRUE(WriteLcmsV4Profile(dir.File("v4.icc")));
    const Bytes v4 = ReadFile(dir.File("v4.icc"));
    const Bytes rgb = ReadFile(SystemIccDir() + "sRGB.icc");  // matrix/TRC
    struct Variant {
        const char* what;
        const Bytes& base;
        const char* tag;  // the edit's positions count from this tag's data ("" from the file's start)
        Edit edit;
        std::pair<int, int> expected;
    };
    const std::pair<int, int> bothFail{-1, -1}, forwardFails{-1, 1}, backwardFails{1, -1}, fine{1, 1};
    const Variant variants[] = {
        {"good", mft2, "", [](Bytes&, size_t) {}, fine},
        {"cut in the header", mft2, "", Cut(100), bothFail},
        {"cut in the tag table", mft2, "", Cut(140), bothFail},
        {"cut in A2B1", mft2, "A2B1", Cut(60), bothFail},
        {"cut in B2A1", mft2, "B2A1", Cut(60), backwardFails},
        {"tag count 2^31", mft2, "", Long(128, 0x80000000u), fine},
        {"A2B1 offset past the end", mft2, "", Long(TagRecord(1) + 4, 0xFFFFFFF0u), bothFail},
        {"B2A1 running past the end", mft2, "", Long(TagRecord(2) + 4, static_cast<uint32_t>(mft2.size() - 60)), backwardFails},
        {"no inputs", mft2, "A2B1", Byte(8, 0), forwardFails},
        {"8 inputs", mft2, "A2B1", Byte(8, 8), forwardFails},
        {"15 inputs", mft2, "A2B1", Byte(8, 15), forwardFails},
        {"no outputs", mft2, "A2B1", Byte(9, 0), forwardFails},
        {"16 outputs", mft2, "A2B1", Byte(9, 16), forwardFails},
        {"grid 0", mft2, "A2B1", Byte(10, 0), forwardFails},
        {"grid 1", mft2, "A2B1", Byte(10, 1), forwardFails},
        {"grid 255", mft2, "A2B1", Byte(10, 255), forwardFails},
        {"grid 255, 15 inputs", mft2, "A2B1", [](Bytes& b, size_t t) { b[t + 8] = 15; b[t + 10] = 255; }, forwardFails},
        {"grid 255, 7 inputs", mft2, "A2B1", [](Bytes& b, size_t t) { b[t + 8] = 7; b[t + 10] = 255; }, forwardFails},
        {"0-entry input curves", mft2, "A2B1", Word(48, 0), forwardFails},
        {"65535-entry input curves", mft2, "A2B1", Word(48, 65535), forwardFails},
        {"0-entry output curves", mft2, "A2B1", Word(50, 0), forwardFails},
        {"v4 good", v4, "", [](Bytes&, size_t) {}, fine},
        {"v4 with a matrix", v4, "A2B0", Long(16, 32), bothFail},
        {"v4 with M curves", v4, "A2B0", Long(20, 32), bothFail},
        {"v4 without CLUT", v4, "A2B0", Long(24, 0), bothFail},
        {"v4 without A curves", v4, "A2B0", Long(28, 0), bothFail},
        {"v4 CLUT past the end", v4, "A2B0", Long(24, 0x7FFFFFF0u), bothFail},
        {"v4 8-bit CLUT", v4, "A2B0", Inside(24, Byte(16, 1)), forwardFails},
        {"v4 uneven grid", v4, "A2B0", Inside(24, Byte(2, 2)), forwardFails},
        {"v4 para curve", v4, "A2B0", Inside(28, Long(0, 0x70617261)), forwardFails},
        {"v4 0-entry curve", v4, "A2B0", Inside(28, Long(8, 0)), forwardFails},
        {"v4 gamma curve", v4, "A2B0", Inside(28, Long(8, 1)), forwardFails},
        {"v4 count beyond 16 bits", v4, "A2B0", Inside(28, Long(8, 0x10000 + 200)), forwardFails},
        {"v4 cut", v4, "", [](Bytes& b, size_t) { b.resize(b.size() - 8); }, backwardFails},
        {"rgb good", rgb, "", [](Bytes&, size_t) {}, fine},
        {"rXYZ of 24 bytes", rgb, "", [](Bytes& b, size_t) { Put(b, TagRecord(Record(b, "rXYZ")) + 8, 24, 4); }, bothFail},
        {"rXYZ zero: no inverse", rgb, "rXYZ", [](Bytes& b, size_t t) { std::fill_n(b.begin() + t + 8, 12, 0); }, backwardFails},
        {"para rTRC", rgb, "rTRC", Long(0, 0x70617261), bothFail},
        {"rTRC longer than the file", rgb, "rTRC", Long(8, 400000), bothFail},
    };
    // A tag whose head cannot be read ends the directory, so the tags after it are gone too; a table
    // whose body is unusable fails alone.
    for (const Variant& v : variants) {
        if (v.base.empty()) continue;
        Bytes bytes = v.base;
        v.edit(bytes, *v.tag ? TagOffset(v.base, Record(v.base, v.tag)) : 0);
        const std::string path = WriteFile(dir.File("variant.icc"), bytes);
        if (&v.base == &v4)
            EXPECT_EQ(Load(path, "A2B0", "B2A0"), v.expected) << v.what;
        else
            EXPECT_EQ(Load(path), v.expected) << v.what;
    }
    EXPECT_EQ(Load(dir.File("missing.icc")), bothFail);
}

TEST(MalformedProfiles, TheReasonNamesWhatWasWrong) {
    TempDir dir;
    ASSERT_TRUE(WriteLcmsV4Profile(dir.File("v4.icc")));
    Bytes matrixBased = ReadFile(dir.File("v4.icc"));
    Put(matrixBased, TagOffset(matrixBased, Record(matrixBased, "A2B0")) + 16, 32, 4);
    const std::string path = WriteFile(dir.File("matrix.icc"), matrixBased);
    const struct {
        std::string path;
        const char* tag;
        const char* reason;
    } cases[] = {
        {dir.File("missing.icc"), "A2B1", "has no \"A2B1\" table (cannot be read as an ICC profile)"},
        {path, "A2B0", "has no \"A2B0\" table (Wrong Type of ICC4 Profile (Matrix based) !)"},
        {dir.File("v4.icc"), "B2A1", "has no \"B2A1\" table"},
    };
    for (const auto& c : cases) {
        CProfil p;
        p.ReadTagTable(0, c.path);
        EXPECT_EQ(p.LoadLut(0, c.tag, c.path), -1);
        EXPECT_EQ(p.m_LoadFailure, c.reason);
    }
}

// Real profiles cut at every few hundred bytes and with random bytes in the tag table and the
// table heads: nothing may crash, read outside the file or allocate without bound.
TEST(MalformedProfiles, CorruptedRealProfiles) {
    TempDir dir;
    std::mt19937 random(2024);
    for (const RealProfile& source : ProfileCorpus()) {
        if (source.path.empty() || !source.corrupt) continue;
        const Bytes good = ReadFile(source.path);
        for (size_t cut = 0; cut < good.size(); cut += 1 + good.size() / 40)
            Load(WriteFile(dir.File("cut.icc"), Bytes(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(cut))));
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
            Load(WriteFile(dir.File("bad.icc"), bytes));
        }
    }
}
