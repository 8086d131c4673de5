// What the reader makes of the text of a measurement file (line ends, separators, decimal commas,
// field names, keywords, the accessors' answers), and every way it fails: the reader answers with
// its code, holds memory in proportion to the file, and leaves an empty object.
#include <gtest/gtest.h>

#include <filesystem>
#include <limits>
#include <random>
#include <string>

#include "helpers/cgats_files.h"
#include "it8/measured_it8.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

int Read(Measured_IT8& it8, const std::string& text) {
    TempDir dir;
    return it8.ReadIt8(WriteText(dir, "t.it8", text));
}

constexpr double kMissing = Measured_IT8::kNoColumn;
const std::string kHead = "CGATS.17\nBEGIN_DATA_FORMAT\nID CMYK_C LAB_L\nEND_DATA_FORMAT\n";

// A failed read leaves the object as constructed, even after a good one.
void ExpectEmpty(const Measured_IT8& it8, const std::string& what) {
    EXPECT_EQ(it8.PatchCount(), 0) << what;
    EXPECT_EQ(it8.FieldCount(), 0) << what;
    EXPECT_EQ(it8.Column(kColLabL), -1) << what;
    EXPECT_EQ(it8.Header().numberOfSets, -1) << what;
}

}  // namespace

TEST(CgatsReader, LineEndsSeparatorsAndDecimalCommasAllReadAlike) {
    for (const std::string eol : {"\n", "\r", "\r\n", "\n\n\r\n"}) {
        for (const std::string sep : {" ", "\t", " \t  "}) {
            auto with = [&](std::string line) {
                for (std::size_t at = 0; (at = line.find(' ', at)) != std::string::npos; at += sep.size())
                    line.replace(at, 1, sep);
                return line;
            };
            Measured_IT8 it8;
            ASSERT_EQ(Read(it8, Cgats(with("SAMPLE_ID CMYK_C cmyk_m CMYK_Y CMYK_K Lab_L Lab_a Lab_b"),
                                      {with("1 12,5 0 100 0,25 50,5 -3,25 7"),
                                       with(" 2 0.5 1 2 3 60 1e1 -2.5E-1 ")},
                                      eol)),
                      0);
            ASSERT_EQ(it8.PatchCount(), 2);
            EXPECT_EQ(it8.GetCmyk(0, 0), 12.5);
            EXPECT_EQ(it8.GetCmyk(0, 3), 0.25);
            EXPECT_EQ(it8.GetLab(0, 1), -3.25);
            EXPECT_EQ(it8.GetCmyk(1, 1), 1.0);
            EXPECT_EQ(it8.GetLab(1, 1), 10.0);
            EXPECT_EQ(it8.GetLab(1, 2), -0.25);
            EXPECT_EQ(it8.Rows()[1][6], "1E1");  // stored upper-cased, with points
        }
    }
}

TEST(CgatsReader, DeviceNamesFillTheirColumnsAndUnknownOnesAreKept) {
    const double no = kMissing;
    const struct {
        const char* fields;
        double channels[7];
    } cases[] = {
        // CMYK also fills channels 1 to 4.
        {"ID cmyk_c CMYK_M Cmyk_y CMYK_K D_VIS X Y", {10, 20, 30, 40, no, no, no}},
        // RED after the CMYK columns copies their positions; GREEN and BLUE follow.
        {"ID CMYK_C CMYK_M CMYK_Y CMYK_K RED GREEN BLUE", {10, 20, 30, 40, 50, 60, 70}},
        {"ID CMY_C CMY_M CMY_Y CMYK_K ORANGE GREEN BLUE", {10, 20, 30, 40, 50, 60, 70}},
        {"ID 7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7", {10, 20, 30, 40, 50, 60, 70}},
        {"ID PC7_7 PC7_6 PC7_5 PC7_4 PC7_3 PC7_2 PC7_1", {70, 60, 50, 40, 30, 20, 10}},
        {"ID 6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5 6CLR_6 X", {10, 20, 30, 40, 50, 60, no}},
        {"ID PC5_1 PC5_2 PC5_3 PC5_4 PC5_5 PC6_6 X", {10, 20, 30, 40, 50, 60, no}},
        // RED before the CMYK columns copies nothing yet; the CMYK names then fill channels 1 to 4.
        {"ID RED CMYK_C CMYK_M CMYK_Y CMYK_K GREEN BLUE", {20, 30, 40, 50, 10, 60, 70}},
        // RED after an explicit channel 1 takes the cyan position back.
        {"ID CMYK_C CMYK_M CMYK_Y CMYK_K 7CLR_1 RED GREEN", {10, 20, 30, 40, 60, 70, no}},
        {"ID RED GREEN BLUE A B C D", {no, no, no, no, 10, 20, 30}},
    };
    for (const auto& c : cases) {
        Measured_IT8 it8;
        ASSERT_EQ(Read(it8, Cgats(c.fields, {"A1 10 20 30 40 50 60 70", "A2 10 20 30 40 50 60 70"})), 0) << c.fields;
        EXPECT_EQ(it8.FieldCount(), 8);
        EXPECT_EQ(it8.Rows()[1][0], "A2");
        for (int ch = 0; ch < 7; ++ch) EXPECT_EQ(it8.GetChannel(1, ch), c.channels[ch]) << c.fields << " ch " << ch;
    }
}

TEST(CgatsReader, AccessorsAnswerBadSetsChannelsAndMissingColumns) {
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, SmallCmykLabFile()), 0);
    for (int set : {-1, 3, 1 << 30}) {
        EXPECT_EQ(it8.GetCmyk(set, 0), Measured_IT8::kBadSet);
        EXPECT_EQ(it8.GetXyz(set, 0), Measured_IT8::kBadSet);  // the set is checked before the column
    }
    EXPECT_EQ(it8.GetCmyk(0, 4), Measured_IT8::kBadChannel);
    EXPECT_EQ(it8.GetCmyk(0, -1), Measured_IT8::kBadChannel);
    EXPECT_EQ(it8.GetChannel(0, 7), Measured_IT8::kBadChannel);
    EXPECT_EQ(it8.GetRgb(0, 3), Measured_IT8::kBadChannel);
    EXPECT_EQ(it8.GetLab(0, 3), Measured_IT8::kBadChannel);
    EXPECT_EQ(it8.GetXyz(0, 0), kMissing);
    EXPECT_EQ(it8.GetLab(1, 2), -50.0);
}

TEST(CgatsReader, ValueTextToNumbers) {
    // The leading number of the text, 0 when there is none; nothing outside the double range.
    const double max = std::numeric_limits<double>::max();
    const std::string nines(400, '9');
    const std::pair<std::string, double> values[] = {
        {"-3", -3},       {"250", 250},   {"ABC", 0},          {".5X", 0.5},        {"7.E2", 700}, {"+1", 1},
        {"-.25", -0.25},  {"1E999", max}, {"-1E999", -max},    {"1E-999", 0},       {"INF", 0},    {"NAN", 0},
        {nines, max},     {"0X10", 0},    {"-", 0},            {".", 0},            {"0." + nines, 1.0},
    };
    std::vector<std::string> rows;
    for (const auto& [text, value] : values) rows.push_back(std::to_string(rows.size()) + " " + text);
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID XYZ_X", rows)), 0);
    for (std::size_t i = 0; i < rows.size(); ++i)
        EXPECT_NEAR(it8.GetXyz(static_cast<int>(i), 0), values[i].second, 1e-15) << values[i].first;

    // Lab alone is clamped, markers' look-alikes too: L* to 0..100, a* and b* to -128..127.
    ASSERT_EQ(Read(it8, Cgats("ID LAB_L LAB_A LAB_B", {"1 101 -130 200", "2 -255 -1 -2", "3 -0.5 127.5 -128.5"})), 0);
    const double clamped[3][3] = {{100, -128, 127}, {0, -1, -2}, {0, 127, -128}};
    for (int i = 0; i < 3; ++i)
        for (int c = 0; c < 3; ++c) EXPECT_EQ(it8.GetLab(i, c), clamped[i][c]) << i << " " << c;
}

TEST(CgatsReader, HeaderKeywordsAndSkippedBlocks) {
    const std::string header =
        "# a comment line\nX\nTARGET_ID it8.7/4\nTARGET \"ECI2002\" random\nLAYOUT_ID 42\nNUMBER_OF_STRIPS 12\n"
        "NUMBER_OF_COLS 33abc\nPATCHES_PER_PAGE x\nDEVICE 7\nBORDER_PATCHES 1\nVERTICAL_MEAS 0\nPATCH_SIZE_X 6\n"
        "PATCH_SIZE_Y 8\nGAP_SIZE 2\n"
        "BEGIN_TARGET_FORMAT\nNUMBER_OF_SETS 99\nGAP_SIZE 99\nEND_TARGET_FORMAT\n"
        "BEGIN_REPORTING_FORMAT\nDEVICE 99\nEND_REPORTING_FORMAT\n"
        "NUMBER_OF_FIELDS 4\nKEYWORD \"SPOTS\"\nSPOTS BEGIN_SPOTCOLOR_FORMAT\nPantone_185 HKS_43\n";
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID CMYK_C CMYK_M CMYK_Y", {"1 2 3 4"}, "\n", header)), 0);
    EXPECT_EQ(it8.TargetId(), "IT8.7/4");
    EXPECT_EQ(it8.Target(), "\"ECI2002\"");
    EXPECT_EQ(it8.LayoutId(), "42");
    const It8Header& h = it8.Header();
    EXPECT_EQ((std::vector<int>{h.numberOfStrips, h.numberOfCols, h.patchesPerPage, h.device, h.borderPatches,
                                h.verticalMeas, h.patchSizeX, h.patchSizeY, h.gapSize, h.measureOrientation,
                                h.numberOfSets}),
              (std::vector<int>{12, 33, 0, 7, 1, 0, 6, 8, 2, 0, 1}));
    EXPECT_EQ(it8.SpotColours(), (std::vector<std::string>{"PANTONE_185", "HKS_43"}));
}

TEST(CgatsReader, SpectralColumnsAndTheirScale) {
    Measured_IT8 nm;
    ASSERT_EQ(Read(nm, Cgats("ID SPECTRAL_NM_400 SPECTRAL_NM_380 NM_390 SP_1 LAB_L", {"1 0.1 0.2 0.3 0.4 50"})), 0);
    EXPECT_EQ(nm.SpectralScale(), 100.0);
    EXPECT_EQ(nm.Wavelengths(), (std::map<int32_t, int32_t>{{380, 2}, {400, 1}}));
    ASSERT_EQ(nm.SpectralFields().size(), 4u);
    EXPECT_EQ(nm.SpectralFields()[0].name, "NM_390");  // sorted by name
    EXPECT_EQ(nm.SpectralFields()[1].column, 2);

    Measured_IT8 plain;
    ASSERT_EQ(Read(plain, Cgats("ID spectral_nm_380 spectral_700 SPECTRAL_NM", {"1 2 3 4"})), 0);
    EXPECT_EQ(plain.SpectralScale(), 1.0);  // the last numbered column decides
    EXPECT_EQ(plain.Wavelengths(), (std::map<int32_t, int32_t>{{380, 1}, {700, 2}}));
    EXPECT_EQ(plain.SpectralFields().size(), 3u);
}

TEST(CgatsReader, ReadingAgainStartsAfresh) {
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B SPECTRAL_NM_380", {"1 1 2 3 4 5 6 7 8"},
                              "\n", "TARGET_ID A\nGAP_SIZE 3\n")),
              0);
    ASSERT_EQ(Read(it8, Cgats("ID RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z", {"1 1 2 3 4 5 6", "2 1 2 3 4 5 6"})), 0);
    EXPECT_EQ(it8.GetLab(1, 0) + it8.GetChannel(1, 0), 2 * kMissing);
    EXPECT_EQ(it8.GetRgb(1, 2), 3.0);
    EXPECT_EQ(it8.TargetId(), "");
    EXPECT_EQ(it8.Header().gapSize, -1);
    EXPECT_TRUE(it8.Wavelengths().empty());
    EXPECT_EQ(it8.SpectralScale(), 1.0);
}

TEST(CgatsReader, RepeatedFieldNamesNeverReachPastARow) {
    // Two names alike: the field count is 3 while LAB_L stands in column 3.
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID ID CMYK_C LAB_L", {"1 2 3"})), 0);
    EXPECT_EQ(it8.GetLab(0, 0), kMissing);
    EXPECT_EQ(it8.GetCmyk(0, 0), 3.0);
}

TEST(CgatsReaderFailures, EachCodeByAMinimalFile) {
    const std::string huge(4 << 20, 'A');  // a line far beyond any real one ends the readable text
    const std::string nul(1, '\0');
    const struct {
        const char* what;
        std::string text;
        int code;
    } cases[] = {
        {"sets 0", kHead + "NUMBER_OF_SETS 0\nBEGIN_DATA\nEND_DATA\n", kIt8NoSets},
        {"sets absent", kHead + "BEGIN_DATA\n1 2 3\nEND_DATA\n", kIt8NoSets},
        {"sets negative", kHead + "NUMBER_OF_SETS -5\nBEGIN_DATA\nEND_DATA\n", kIt8NoSets},
        {"format empty", "BEGIN_DATA_FORMAT\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1\nEND_DATA\n",
         kIt8NoFieldNames},
        {"format blank line", "BEGIN_DATA_FORMAT\n \t \nID\nEND_DATA_FORMAT\n", kIt8NoFieldNames},
        {"format at the end", "NUMBER_OF_SETS 1\nBEGIN_DATA_FORMAT\n", kIt8NoFieldNames},
        {"no format", "NUMBER_OF_SETS 1\nBEGIN_DATA\n1\nEND_DATA\n", kIt8NoFieldNames},
        {"no data block", kHead + "NUMBER_OF_SETS 1\n1 2 3\nEND_DATA\n", kIt8NoDataBlock},
        {"empty file", "", kIt8NoDataBlock},
        {"ends in data", kHead + "NUMBER_OF_SETS 2\nBEGIN_DATA\n1 2 3\n", kIt8EndsInDataBlock},
        {"too few sets", kHead + "NUMBER_OF_SETS 3\nBEGIN_DATA\n1 2 3\nEND_DATA\n", kIt8TooFewSets},
        {"row short", kHead + "NUMBER_OF_SETS 2\nBEGIN_DATA\n1 2 3\n2 3\nEND_DATA\n", kIt8RowFieldCount},
        {"row long", kHead + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3 4\nEND_DATA\n", kIt8RowFieldCount},
        {"too many sets", kHead + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3\n2 3 4\nEND_DATA\n", kIt8TooManySets},
        {"repeated names", Cgats("ID ID CMYK_C LAB_L", {"1 2 3 4"}), kIt8RowFieldCount},
        // Huge announced counts need the rows in the file; nothing is reserved for them.
        {"2e9 sets", kHead + "NUMBER_OF_SETS 2000000000\nBEGIN_DATA\n1 2 3\n2 3 4\n", kIt8EndsInDataBlock},
        {"1e20 sets", kHead + "NUMBER_OF_SETS 99999999999999999999\nBEGIN_DATA\n1 2 3\nEND_DATA\n", kIt8TooFewSets},
        // NUL and high-bit bytes end a line: inside a row or the format they break it.
        {"NUL in row", kHead + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 2" + nul + " 3\nEND_DATA\n", kIt8RowFieldCount},
        {"high bit in row", kHead + "NUMBER_OF_SETS 1\nBEGIN_DATA\n1 \xE9 2 3\nEND_DATA\n", kIt8RowFieldCount},
        {"NUL in format", "BEGIN_DATA_FORMAT\nID CMYK_C" + nul + " LAB_L\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\n"
                          "BEGIN_DATA\n1 2 3\nEND_DATA\n", kIt8RowFieldCount},
        {"huge comment", "CGATS.17\n# " + huge + "\n" + SmallCmykLabFile(), kIt8NoDataBlock},
        {"huge format", "BEGIN_DATA_FORMAT\n" + huge + "\nEND_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n",
         kIt8NoFieldNames},
        {"huge row", kHead + "NUMBER_OF_SETS 2\nBEGIN_DATA\n1 2 3\n" + huge + "\nEND_DATA\n", kIt8EndsInDataBlock},
        // Just below the limit a line is still a line; in comments and keyword lines stray bytes split
        // those lines only.
        {"stray bytes in header",
         Cgats("ID CMYK_C", {"1 2"}, "\n", "# \xC3\xBC\nORIGINATOR x" + nul + "y\n\x80\xFF\n"), 0},
        {"wide comment", kHead + "# " + std::string(64 * 1024 - 10, 'B') + "\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1 2 3\n"
                         "END_DATA\n", 0},
    };
    TempDir dir;
    const std::string good = WriteText(dir, "good.it8", SmallCmykLabFile());
    for (const auto& c : cases) {
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(good), 0);
        EXPECT_EQ(it8.ReadIt8(WriteText(dir, "t.it8", c.text)), c.code) << c.what;
        if (c.code != 0) ExpectEmpty(it8, c.what);
    }
}

TEST(CgatsReaderFailures, WhatIsNotARegularFileCannotBeOpened) {
    TempDir dir;
    Measured_IT8 it8;
    ASSERT_EQ(it8.ReadIt8(WriteText(dir, "good.it8", SmallCmykLabFile())), 0);
    // Devices never end; they are not measurement files.
    for (const std::string& path : {dir.File("absent.it8"), dir.Path(), std::string(), std::string("/dev/zero"),
                                   std::string("/dev/null"), std::string("/dev/urandom")}) {
        EXPECT_EQ(it8.ReadIt8(path), kIt8CannotOpen) << path;
        ExpectEmpty(it8, path);
    }
}

TEST(CgatsReaderFailures, BinaryGarbageEndsInACode) {
    std::mt19937 random(1234);
    TempDir dir;
    Measured_IT8 it8;
    for (int round = 0; round < 8; ++round) {
        std::string bytes(1 << 16, '\0');
        for (char& b : bytes) b = static_cast<char>(random());
        if (round % 2) bytes = kHead + "NUMBER_OF_SETS 5\nBEGIN_DATA\n" + bytes;
        EXPECT_LT(it8.ReadIt8(WriteText(dir, "noise.it8", bytes)), 0) << round;
        ExpectEmpty(it8, "noise");
    }
    // A real profile is not a measurement file either.
    const std::string icc = SystemIccDir() + "ghostscript/default_cmyk.icc";
    if (std::filesystem::exists(icc)) {
        EXPECT_LT(it8.ReadIt8(icc), 0);
    }
}

// A refused file says where the reader stopped, counting lines as an editor does (LF, CR LF or a
// lone CR each end one), so that the user can be told which line to look at.
TEST(CgatsReader, AFailedReadKeepsTheLineItStoppedOn) {
    for (const std::string eol : {"\n", "\r\n", "\r"}) {
        const std::string text = "CGATS.17" + eol + "NUMBER_OF_SETS 2" + eol + eol + "BEGIN_DATA_FORMAT" + eol +
                                 "ID CMYK_C LAB_L" + eol + "END_DATA_FORMAT" + eol + "BEGIN_DATA" + eol + "1 0 95" + eol +
                                 "2 0" + eol + "END_DATA" + eol;
        Measured_IT8 it8;
        EXPECT_EQ(Read(it8, text), kIt8RowFieldCount);
        EXPECT_EQ(it8.FailureLine(), 9) << "line end " << (eol == "\n" ? "LF" : eol == "\r" ? "CR" : "CRLF");
    }
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID CMYK_C LAB_L", {"1 0 95"})), 0);
    EXPECT_EQ(it8.FailureLine(), 0);
    EXPECT_STREQ(It8ErrorText(kIt8RowFieldCount), "a row has another number of values than the data format");
}
