// Characterisation data of icc-profiles-free, read by the library and checked against an
// independent parse of the same file.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
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
