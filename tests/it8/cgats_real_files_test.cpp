// The characterisation data of icc-profiles-free and files written by Argyll and lcms2, each read
// by the library and checked against an independent parse of the same file.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "helpers/test_paths.h"
#include "it8/measured_it8.h"
#include "it8_test_files.h"

namespace fs = std::filesystem;
using vantrel::Measured_IT8;
using namespace vantrel::test;
using namespace vantrel::test::it8;

namespace {

// A plain parse with the standard library: field names from the line after BEGIN_DATA_FORMAT,
// rows as whitespace-separated numbers up to END_DATA.
struct PlainTable {
    std::vector<std::string> fields;
    std::vector<std::vector<std::string>> rows;
    int announcedSets = -1;

    int Column(const std::string& name) const {
        for (std::size_t i = 0; i < fields.size(); ++i)
            if (fields[i] == name) return static_cast<int>(i);
        return -1;
    }
    double Value(std::size_t row, const std::string& name) const {
        return std::strtod(rows[row][static_cast<std::size_t>(Column(name))].c_str(), nullptr);
    }
};

std::vector<std::string> Words(const std::string& line) {
    std::istringstream in(line);
    std::vector<std::string> words;
    for (std::string w; in >> w;) words.push_back(w);
    return words;
}

PlainTable ParsePlain(const std::string& path) {
    PlainTable table;
    const std::vector<std::string> lines = Lines(ReadFile(path));
    enum { kHeader, kFormat, kData, kDone } state = kHeader;
    for (const std::string& line : lines) {
        const std::vector<std::string> words = Words(line);
        if (words.empty()) continue;
        if (state == kHeader) {
            if (words[0] == "BEGIN_DATA_FORMAT") state = kFormat;
            if (words[0] == "NUMBER_OF_SETS") table.announcedSets = std::atoi(words[1].c_str());
            if (words[0] == "BEGIN_DATA") state = kData;
        } else if (state == kFormat) {
            if (words[0] == "END_DATA_FORMAT") {
                state = kHeader;
            } else {
                for (const std::string& w : words) table.fields.push_back(w);
            }
        } else if (state == kData) {
            if (words[0] == "END_DATA") {
                state = kDone;
                break;
            }
            table.rows.push_back(words);
        }
    }
    return table;
}

// Every column the library understands, compared with the plain parse.
void ExpectSameValues(const Measured_IT8& it8, const PlainTable& plain, const std::string& what) {
    ASSERT_EQ(it8.PatchCount(), static_cast<int>(plain.rows.size())) << what;
    struct Probe {
        const char* name;
        double (Measured_IT8::*get)(int, int) const;
        int channel;
    };
    const Probe probes[] = {
        {"CMYK_C", &Measured_IT8::GetCmyk, 0}, {"CMYK_M", &Measured_IT8::GetCmyk, 1},
        {"CMYK_Y", &Measured_IT8::GetCmyk, 2}, {"CMYK_K", &Measured_IT8::GetCmyk, 3},
        {"RGB_R", &Measured_IT8::GetRgb, 0},   {"RGB_G", &Measured_IT8::GetRgb, 1},
        {"RGB_B", &Measured_IT8::GetRgb, 2},   {"XYZ_X", &Measured_IT8::GetXyz, 0},
        {"XYZ_Y", &Measured_IT8::GetXyz, 1},   {"XYZ_Z", &Measured_IT8::GetXyz, 2},
        {"LAB_L", &Measured_IT8::GetLab, 0},   {"LAB_A", &Measured_IT8::GetLab, 1},
        {"LAB_B", &Measured_IT8::GetLab, 2},
    };
    int compared = 0;
    for (const Probe& probe : probes) {
        const bool present = plain.Column(probe.name) >= 0;
        for (std::size_t r = 0; r < plain.rows.size(); ++r) {
            const double got = (it8.*probe.get)(static_cast<int>(r), probe.channel);
            if (!present) {
                EXPECT_EQ(got, Measured_IT8::kNoColumn) << what << " " << probe.name;
                break;
            }
            double expected = plain.Value(r, probe.name);
            if (std::string(probe.name) == "LAB_L") expected = std::clamp(expected, 0.0, 100.0);
            if (std::string(probe.name) == "LAB_A" || std::string(probe.name) == "LAB_B")
                expected = std::clamp(expected, -128.0, 127.0);
            ASSERT_EQ(got, expected) << what << " " << probe.name << " set " << r;
            ++compared;
        }
    }
    EXPECT_GT(compared, 0) << what;
}

}  // namespace

TEST(CgatsRealFiles, EveryCharacterisationFileReadsWithItsSetsAndValues) {
    int files = 0;
    for (const auto& entry : fs::directory_iterator(SystemIccDir())) {
        if (entry.path().extension() != ".ti3") continue;
        const std::string path = entry.path().string();
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(path), 0) << path;
        const PlainTable plain = ParsePlain(path);
        EXPECT_EQ(it8.PatchCount(), plain.announcedSets) << path;
        EXPECT_EQ(it8.Header().numberOfSets, plain.announcedSets) << path;
        EXPECT_EQ(it8.FieldCount(), 11) << path;
        EXPECT_EQ(it8.Header().fieldNameCount, 11) << path;
        ExpectSameValues(it8, plain, path);
        // The CMYK columns are also channels 1 to 4.
        for (int c = 0; c < 4; ++c) EXPECT_EQ(it8.GetChannel(5, c), it8.GetCmyk(5, c)) << path;
        ++files;
    }
    if (files == 0) GTEST_SKIP() << "no characterisation data in " << SystemIccDir();
    EXPECT_GE(files, 9);
}

TEST(CgatsRealFiles, KnownSetCountsOfTheFograAndTrData) {
    const std::map<std::string, int> counts = {{"FOGRA39L.ti3", 1617}, {"FOGRA28L.ti3", 1485},
                                               {"TR002.ti3", 928},     {"TR003.ti3", 1617},
                                               {"TR006.ti3", 1617}};
    for (const auto& [name, sets] : counts) {
        const std::string path = SystemIccDir() + name;
        if (!fs::exists(path)) GTEST_SKIP() << path << " missing";
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(path), 0) << name;
        EXPECT_EQ(it8.PatchCount(), sets) << name;
    }
}

TEST(CgatsRealFiles, ArgyllTargenAndFakereadFilesRead) {
    const std::string profile = FixtureProfile("FOGRA39L");
    if (profile.empty()) GTEST_SKIP() << "FOGRA39L.icc fixture not built";
    TempDir dir;
    const std::string cmyk = dir.File("cmyk");
    const std::string rgb = dir.File("rgb");
    if (!RunQuietly("targen -v0 -d4 -f60 " + cmyk) || !RunQuietly("fakeread " + profile + " " + cmyk))
        GTEST_SKIP() << "Argyll targen/fakeread not available";
    // targen's file carries further tables after the first END_DATA; the first one is read.
    for (const std::string& path : {cmyk + ".ti1", cmyk + ".ti3"}) {
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(path), 0) << path;
        EXPECT_EQ(it8.PatchCount(), 60) << path;
        ExpectSameValues(it8, ParsePlain(path), path);
    }
    const std::string srgb = SystemIccDir() + "ghostscript/srgb.icc";
    if (fs::exists(srgb) && RunQuietly("targen -v0 -d2 -f24 " + rgb) && RunQuietly("fakeread " + srgb + " " + rgb)) {
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(rgb + ".ti3"), 0);
        EXPECT_EQ(it8.PatchCount(), 24);
        EXPECT_EQ(it8.GetCmyk(0, 0), Measured_IT8::kNoColumn);
        ExpectSameValues(it8, ParsePlain(rgb + ".ti3"), "rgb.ti3");
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
    ASSERT_EQ(read.ReadIt8(path), 0) << ReadFile(path);
    const PlainTable plain = ParsePlain(path);
    ASSERT_EQ(plain.rows.size(), static_cast<std::size_t>(sets));
    ExpectSameValues(read, plain, "lcms2");
    EXPECT_DOUBLE_EQ(read.GetCmyk(4, 2), 4 * 3.125 + 1.5 - 20.0);
    EXPECT_EQ(read.GetLab(0, 0), 0.0);  // -17.5 clamps to 0
}
