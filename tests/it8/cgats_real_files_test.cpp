// The characterisation data of icc-profiles-free and files written by Argyll and lcms2, each read
// by the library and checked against an independent parse of the same file.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <filesystem>
#include <map>
#include <string>

#include "helpers/cgats_files.h"
#include "it8/measured_it8.h"

namespace fs = std::filesystem;
using vantrel::Measured_IT8;
using namespace vantrel::test;

namespace {

// Every column the library understands, compared with the plain parse of the same file.
void ExpectSameValues(const std::string& path, const Measured_IT8& it8) {
    const PlainTable plain = ParsePlain(path);
    ASSERT_EQ(it8.PatchCount(), static_cast<int>(plain.rows.size())) << path;
    const struct {
        const char* prefix;
        const char* letters;
        double (Measured_IT8::*get)(int, int) const;
    } groups[] = {{"CMYK_", "CMYK", &Measured_IT8::GetCmyk},
                  {"RGB_", "RGB", &Measured_IT8::GetRgb},
                  {"XYZ_", "XYZ", &Measured_IT8::GetXyz},
                  {"LAB_", "LAB", &Measured_IT8::GetLab}};
    int compared = 0;
    for (const auto& g : groups) {
        for (int c = 0; g.letters[c]; ++c) {
            const std::string name = g.prefix + std::string(1, g.letters[c]);
            const int column = plain.Column(name);
            if (column < 0) {
                EXPECT_EQ((it8.*g.get)(0, c), Measured_IT8::kNoColumn) << path << " " << name;
                continue;
            }
            const bool lab = g.letters[0] == 'L';
            for (std::size_t r = 0; r < plain.rows.size(); ++r) {
                double want = plain.Value(r, column);
                if (lab) want = c == 0 ? std::clamp(want, 0.0, 100.0) : std::clamp(want, -128.0, 127.0);
                ASSERT_EQ((it8.*g.get)(static_cast<int>(r), c), want) << path << " " << name << " set " << r;
                ++compared;
            }
        }
    }
    EXPECT_GT(compared, 0) << path;
}

}  // namespace

// Two characterisation files that differ in layout: Fogra's, and an ANSI one whose set count is
// padded with spaces. (The other seven in the package repeat one of the two layouts.)
TEST(CgatsRealFiles, CharacterisationFilesReadWithTheirSetsAndValues) {
    int files = 0;
    for (const auto& [name, sets] : {std::pair<const char*, int>{"FOGRA39L.ti3", 1617}, {"TR002.ti3", 928}}) {
        const std::string path = SystemIccDir() + name;
        if (!fs::exists(path)) continue;
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(path), 0) << path;
        EXPECT_EQ(it8.PatchCount(), sets) << path;
        EXPECT_EQ(it8.FieldCount(), 11) << path;
        ExpectSameValues(path, it8);
        for (int c = 0; c < 4; ++c) EXPECT_EQ(it8.GetChannel(5, c), it8.GetCmyk(5, c)) << path;
        ++files;
    }
    if (files == 0) GTEST_SKIP() << "no characterisation data in " << SystemIccDir();
}

TEST(CgatsRealFiles, ArgyllTargenAndFakereadFilesRead) {
    const std::string profile = FixtureProfile("FOGRA39L");
    if (profile.empty()) GTEST_SKIP() << "FOGRA39L.icc fixture not built";
    TempDir dir;
    const std::string cmyk = dir.File("cmyk"), rgb = dir.File("rgb");
    if (!RunQuietly("targen -v0 -d4 -f60 " + cmyk) || !RunQuietly("fakeread " + profile + " " + cmyk))
        GTEST_SKIP() << "Argyll targen/fakeread not available";
    // targen's file carries further tables after the first END_DATA; the first one is read.
    for (const std::string& path : {cmyk + ".ti1", cmyk + ".ti3"}) {
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(path), 0) << path;
        EXPECT_EQ(it8.PatchCount(), 60) << path;
        ExpectSameValues(path, it8);
    }
    const std::string srgb = SystemIccDir() + "ghostscript/srgb.icc";
    if (fs::exists(srgb) && RunQuietly("targen -v0 -d2 -f24 " + rgb) && RunQuietly("fakeread " + srgb + " " + rgb)) {
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(rgb + ".ti3"), 0);
        EXPECT_EQ(it8.PatchCount(), 24);
        ExpectSameValues(rgb + ".ti3", it8);
    }
}

TEST(CgatsRealFiles, Lcms2SavedFileReads) {
    TempDir dir;
    const std::string path = dir.File("lcms.it8");
    const char* names[] = {"SAMPLE_ID", "CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "LAB_L", "LAB_A", "LAB_B"};
    const int sets = 25;
    cmsHANDLE it8 = cmsIT8Alloc(nullptr);
    ASSERT_NE(it8, nullptr);
    cmsIT8SetSheetType(it8, "CGATS.17");
    cmsIT8SetComment(it8, "written by lcms2");
    cmsIT8SetPropertyStr(it8, "ORIGINATOR", "vantrel tests");
    cmsIT8SetPropertyDbl(it8, "NUMBER_OF_FIELDS", 8);
    for (int i = 0; i < 8; ++i) cmsIT8SetDataFormat(it8, i, names[i]);
    cmsIT8SetPropertyDbl(it8, "NUMBER_OF_SETS", sets);
    for (int s = 0; s < sets; ++s) {
        cmsIT8SetDataRowColDbl(it8, s, 0, s + 1);
        for (int c = 1; c < 8; ++c) cmsIT8SetDataRowColDbl(it8, s, c, s * 3.125 + c * 0.5 - 20.0);
    }
    ASSERT_TRUE(cmsIT8SaveToFile(it8, path.c_str()));
    cmsIT8Free(it8);

    Measured_IT8 read;
    ASSERT_EQ(read.ReadIt8(path), 0) << ReadText(path);
    ASSERT_EQ(read.PatchCount(), sets);
    ExpectSameValues(path, read);
    EXPECT_DOUBLE_EQ(read.GetCmyk(4, 2), 4 * 3.125 + 1.5 - 20.0);
    EXPECT_EQ(read.GetLab(0, 0), 0.0);  // -17.5 clamps to 0
}
