// What the reader makes of the text of a measurement file: line ends, separators, decimal commas,
// field names, keywords and the accessors' answers.
#include <gtest/gtest.h>

#include <string>

#include "it8/measured_it8.h"
#include "it8_test_files.h"

using vantrel::It8Column;
using vantrel::Measured_IT8;
using namespace vantrel;
using namespace vantrel::test;
using namespace vantrel::test::it8;

namespace {

// A file of the given field names and rows, lines joined by `eol`.
std::string Cgats(const std::string& fields, const std::vector<std::string>& rows, const std::string& eol = "\n",
                  const std::string& extraHeader = "") {
    std::string text = "CGATS.17" + eol + extraHeader + "BEGIN_DATA_FORMAT" + eol + fields + eol +
                       "END_DATA_FORMAT" + eol + "NUMBER_OF_SETS " + std::to_string(rows.size()) + eol +
                       "BEGIN_DATA" + eol;
    for (const std::string& row : rows) text += row + eol;
    return text + "END_DATA" + eol;
}

int Read(Measured_IT8& it8, const std::string& text) {
    TempDir dir;
    return it8.ReadIt8(WriteFile(dir, "t.it8", text));
}

}  // namespace

TEST(CgatsReader, LineEndsSeparatorsAndDecimalCommasAllReadAlike) {
    for (const std::string eol : {"\n", "\r", "\r\n", "\n\n\r\n"}) {
        for (const std::string sep : {" ", "\t", " \t  "}) {
            const std::string fields = "SAMPLE_ID" + sep + "CMYK_C" + sep + "CMYK_M" + sep + "CMYK_Y" + sep +
                                       "CMYK_K" + sep + "Lab_L" + sep + "Lab_a" + sep + "Lab_b";
            const std::string row1 = "1" + sep + "12,5" + sep + "0" + sep + "100" + sep + "0,25" + sep + "50,5" +
                                     sep + "-3,25" + sep + "7";
            const std::string row2 = sep + "2" + sep + "0.5" + sep + "1" + sep + "2" + sep + "3" + sep + "60" + sep +
                                     "1e1" + sep + "-2.5E-1" + sep;
            Measured_IT8 it8;
            ASSERT_EQ(Read(it8, Cgats(fields, {row1, row2}, eol)), 0);
            ASSERT_EQ(it8.PatchCount(), 2);
            EXPECT_EQ(it8.GetCmyk(0, 0), 12.5);
            EXPECT_EQ(it8.GetCmyk(0, 3), 0.25);
            EXPECT_EQ(it8.GetLab(0, 0), 50.5);
            EXPECT_EQ(it8.GetLab(0, 1), -3.25);
            EXPECT_EQ(it8.GetLab(0, 2), 7.0);
            EXPECT_EQ(it8.GetCmyk(1, 0), 0.5);
            EXPECT_EQ(it8.GetLab(1, 1), 10.0);
            EXPECT_EQ(it8.GetLab(1, 2), -0.25);
            // Stored values are the upper-cased text with points.
            EXPECT_EQ(it8.Rows()[0][1], "12.5");
            EXPECT_EQ(it8.Rows()[1][6], "1E1");
        }
    }
}

TEST(CgatsReader, FieldNamesAreCaseBlindAndUnknownColumnsAreKept) {
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("Sample_Name cmyk_c Cmyk_M CMYK_Y cmyk_k Lab_L Lab_a Lab_b xyz_x XYZ_y Xyz_Z",
                              {"A1 1 2 3 4 50 1 2 40 41 42"})),
              0);
    EXPECT_EQ(it8.FieldCount(), 11);
    EXPECT_EQ(it8.Header().fieldNameCount, 11);
    EXPECT_EQ(it8.FieldMap().at("SAMPLE_NAME"), 0);
    EXPECT_EQ(it8.Fields()[5].name, "LAB_L");
    EXPECT_EQ(it8.Fields()[5].column, 5);
    EXPECT_EQ(it8.Column(vantrel::kColLabB), 7);
    EXPECT_EQ(it8.Rows()[0][0], "A1");
    for (int c = 0; c < 4; ++c) {
        EXPECT_EQ(it8.GetCmyk(0, c), c + 1.0);
        EXPECT_EQ(it8.GetChannel(0, c), c + 1.0);  // CMYK also fills channels 1 to 4
    }
    EXPECT_EQ(it8.GetChannel(0, 4), Measured_IT8::kNoColumn);
    EXPECT_EQ(it8.GetXyz(0, 1), 41.0);
    EXPECT_EQ(it8.GetRgb(0, 0), Measured_IT8::kNoColumn);
}

TEST(CgatsReader, MultiChannelNamesFillTheSevenChannels) {
    struct Case {
        std::string fields;
        double expected[7];
    };
    const std::string values = "1 10 20 30 40 50 60 70";
    const Case cases[] = {
        // RED after the CMYK columns copies their positions; GREEN and BLUE follow.
        {"ID CMYK_C CMYK_M CMYK_Y CMYK_K RED GREEN BLUE", {10, 20, 30, 40, 50, 60, 70}},
        {"ID CMY_C CMY_M CMY_Y CMYK_K ORANGE GREEN BLUE", {10, 20, 30, 40, 50, 60, 70}},
        {"ID 7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7", {10, 20, 30, 40, 50, 60, 70}},
        {"ID PC7_7 PC7_6 PC7_5 PC7_4 PC7_3 PC7_2 PC7_1", {70, 60, 50, 40, 30, 20, 10}},
        {"ID 6CLR_1 6CLR_2 6CLR_3 6CLR_4 6CLR_5 6CLR_6 X", {10, 20, 30, 40, 50, 60, -255}},
        {"ID PC5_1 PC5_2 PC5_3 PC5_4 PC5_5 PC6_6 X", {10, 20, 30, 40, 50, 60, -255}},
        // RED before the CMYK columns copies nothing yet; the CMYK names then fill channels 1 to 4.
        {"ID RED CMYK_C CMYK_M CMYK_Y CMYK_K GREEN BLUE", {20, 30, 40, 50, 10, 60, 70}},
        // RED with no CMYK columns at all leaves channels 1 to 4 absent.
        {"ID RED GREEN BLUE A B C D", {-255, -255, -255, -255, 10, 20, 30}},
    };
    for (const Case& c : cases) {
        Measured_IT8 it8;
        ASSERT_EQ(Read(it8, Cgats(c.fields, {values, values})), 0) << c.fields;
        for (int ch = 0; ch < 7; ++ch) EXPECT_EQ(it8.GetChannel(1, ch), c.expected[ch]) << c.fields << " ch " << ch;
    }
}

TEST(CgatsReader, AccessorsAnswerBadSetsChannelsAndMissingColumns) {
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, SmallCmykLabFile()), 0);
    ASSERT_EQ(it8.PatchCount(), 3);
    for (int set : {-1, 3, 1 << 30}) {
        EXPECT_EQ(it8.GetCmyk(set, 0), -1.0);
        EXPECT_EQ(it8.GetLab(set, 0), -1.0);
        EXPECT_EQ(it8.GetXyz(set, 0), -1.0);  // the set is checked before the column
    }
    EXPECT_EQ(it8.GetCmyk(0, 4), -2.0);
    EXPECT_EQ(it8.GetCmyk(0, -1), -2.0);
    EXPECT_EQ(it8.GetChannel(0, 7), -2.0);
    EXPECT_EQ(it8.GetRgb(0, 3), -2.0);
    EXPECT_EQ(it8.GetXyz(0, 3), -2.0);
    EXPECT_EQ(it8.GetLab(0, 3), -2.0);
    EXPECT_EQ(it8.GetXyz(0, 0), -255.0);
    EXPECT_EQ(it8.GetRgb(2, 1), -255.0);
    EXPECT_EQ(it8.GetChannel(0, 5), -255.0);
    EXPECT_EQ(it8.GetCmyk(1, 0), 100.0);
    EXPECT_EQ(it8.GetLab(1, 2), -50.0);
}

TEST(CgatsReader, LabIsClampedOtherColumnsAreNot) {
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID LAB_L LAB_A LAB_B XYZ_X CMYK_C",
                              {"1 101 -130 200 -3 -7", "2 -255 -1 -2 250 120", "3 -0.5 127.5 -128.5 0 0",
                               "4 ABC .5X 7.E2 +1 -.25"})),
              0);
    EXPECT_EQ(it8.GetLab(0, 0), 100.0);
    EXPECT_EQ(it8.GetLab(0, 1), -128.0);
    EXPECT_EQ(it8.GetLab(0, 2), 127.0);
    EXPECT_EQ(it8.GetXyz(0, 0), -3.0);
    EXPECT_EQ(it8.GetCmyk(0, 0), -7.0);
    // Real values that look like the markers are clamped like any other.
    EXPECT_EQ(it8.GetLab(1, 0), 0.0);
    EXPECT_EQ(it8.GetLab(1, 1), -1.0);
    EXPECT_EQ(it8.GetLab(1, 2), -2.0);
    EXPECT_EQ(it8.GetXyz(1, 0), 250.0);
    EXPECT_EQ(it8.GetLab(2, 0), 0.0);
    EXPECT_EQ(it8.GetLab(2, 1), 127.0);
    EXPECT_EQ(it8.GetLab(2, 2), -128.0);
    // The leading number of the text, 0 when there is none.
    EXPECT_EQ(it8.GetLab(3, 0), 0.0);
    EXPECT_EQ(it8.GetLab(3, 1), 0.5);
    EXPECT_EQ(it8.GetLab(3, 2), 127.0);  // 7.E2 = 700
    EXPECT_EQ(it8.GetXyz(3, 0), 1.0);
    EXPECT_EQ(it8.GetCmyk(3, 0), -0.25);
}

TEST(CgatsReader, NumbersOutsideTheDoubleRangeAndWordsAreNotTrusted) {
    Measured_IT8 it8;
    const std::string longDigits(400, '9');
    ASSERT_EQ(Read(it8, Cgats("ID XYZ_X XYZ_Y XYZ_Z CMYK_C CMYK_M",
                              {"1 1E999 -1E999 1E-999 INF NAN", "2 " + longDigits + " 0." + longDigits + " 0X10 - ."})),
              0);
    EXPECT_EQ(it8.GetXyz(0, 0), std::numeric_limits<double>::max());
    EXPECT_EQ(it8.GetXyz(0, 1), -std::numeric_limits<double>::max());
    EXPECT_EQ(it8.GetXyz(0, 2), 0.0);
    EXPECT_EQ(it8.GetCmyk(0, 0), 0.0);
    EXPECT_EQ(it8.GetCmyk(0, 1), 0.0);
    EXPECT_EQ(it8.GetXyz(1, 0), std::numeric_limits<double>::max());
    EXPECT_NEAR(it8.GetXyz(1, 1), 1.0, 1e-15);
    EXPECT_EQ(it8.GetXyz(1, 2), 0.0);
    EXPECT_EQ(it8.GetCmyk(1, 0), 0.0);
    EXPECT_EQ(it8.GetCmyk(1, 1), 0.0);
}

TEST(CgatsReader, HeaderKeywordsAndSkippedBlocks) {
    const std::string header =
        "# a comment line\n"
        "X\n"
        "TARGET_ID it8.7/4\n"
        "TARGET \"ECI2002\" random\n"
        "LAYOUT_ID 42\n"
        "NUMBER_OF_STRIPS 12\n"
        "NUMBER_OF_COLS 33abc\n"
        "PATCHES_PER_PAGE x\n"
        "DEVICE 7\n"
        "BORDER_PATCHES 1\n"
        "VERTICAL_MEAS 0\n"
        "PATCH_SIZE_X 6\n"
        "PATCH_SIZE_Y 8\n"
        "GAP_SIZE 2\n"
        "BEGIN_TARGET_FORMAT\n"
        "NUMBER_OF_SETS 99\n"
        "GAP_SIZE 99\n"
        "END_TARGET_FORMAT\n"
        "BEGIN_REPORTING_FORMAT\n"
        "DEVICE 99\n"
        "END_REPORTING_FORMAT\n"
        "NUMBER_OF_FIELDS 4\n"
        "KEYWORD \"SPOTS\"\n"
        "SPOTS BEGIN_SPOTCOLOR_FORMAT\n"
        "Pantone_185 HKS_43\n";
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID CMYK_C CMYK_M CMYK_Y", {"1 2 3 4"}, "\n", header)), 0);
    EXPECT_EQ(it8.TargetId(), "IT8.7/4");
    EXPECT_EQ(it8.Target(), "\"ECI2002\"");
    EXPECT_EQ(it8.LayoutId(), "42");
    const vantrel::It8Header& h = it8.Header();
    EXPECT_EQ(h.numberOfStrips, 12);
    EXPECT_EQ(h.numberOfCols, 33);
    EXPECT_EQ(h.patchesPerPage, 0);
    EXPECT_EQ(h.device, 7);
    EXPECT_EQ(h.borderPatches, 1);
    EXPECT_EQ(h.verticalMeas, 0);
    EXPECT_EQ(h.patchSizeX, 6);
    EXPECT_EQ(h.patchSizeY, 8);
    EXPECT_EQ(h.gapSize, 2);
    EXPECT_EQ(h.measureOrientation, 0);
    EXPECT_EQ(h.numberOfSets, 1);
    EXPECT_EQ(it8.SpotColours(), (std::vector<std::string>{"PANTONE_185", "HKS_43"}));

    Measured_IT8 bare;
    ASSERT_EQ(Read(bare, SmallCmykLabFile()), 0);
    EXPECT_EQ(bare.Header().numberOfStrips, -1);
    EXPECT_EQ(bare.Header().gapSize, -1);
    EXPECT_EQ(bare.Header().measureOrientation, 0);
    EXPECT_EQ(bare.TargetId(), "");
}

TEST(CgatsReader, SpectralColumnsAndTheirScale) {
    Measured_IT8 nm;
    ASSERT_EQ(Read(nm, Cgats("ID SPECTRAL_NM_400 SPECTRAL_NM_380 NM_390 SP_1 LAB_L", {"1 0.1 0.2 0.3 0.4 50"})), 0);
    EXPECT_EQ(nm.SpectralScale(), 100.0);
    EXPECT_EQ(nm.Wavelengths(), (std::map<int32_t, int32_t>{{380, 2}, {400, 1}}));
    ASSERT_EQ(nm.SpectralFields().size(), 4u);
    EXPECT_EQ(nm.SpectralFields()[0].name, "NM_390");
    EXPECT_EQ(nm.SpectralFields()[1].name, "SPECTRAL_NM_380");
    EXPECT_EQ(nm.SpectralFields()[1].column, 2);
    EXPECT_EQ(nm.SpectralFields()[3].name, "SP_1");

    Measured_IT8 plain;
    ASSERT_EQ(Read(plain, Cgats("ID spectral_nm_380 spectral_700 SPECTRAL_NM", {"1 2 3 4"})), 0);
    EXPECT_EQ(plain.SpectralScale(), 1.0);  // the last numbered column decides
    EXPECT_EQ(plain.Wavelengths(), (std::map<int32_t, int32_t>{{380, 1}, {700, 2}}));
    EXPECT_EQ(plain.SpectralFields().size(), 3u);
}

TEST(CgatsReader, ReadingAgainStartsAfresh) {
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B SPECTRAL_NM_380",
                              {"1 1 2 3 4 5 6 7 8"}, "\n", "TARGET_ID A\nGAP_SIZE 3\n")),
              0);
    ASSERT_EQ(Read(it8, Cgats("ID RGB_R RGB_G RGB_B XYZ_X XYZ_Y XYZ_Z", {"1 1 2 3 4 5 6", "2 1 2 3 4 5 6"})), 0);
    EXPECT_EQ(it8.PatchCount(), 2);
    EXPECT_EQ(it8.GetLab(0, 0), -255.0);
    EXPECT_EQ(it8.GetCmyk(0, 0), -255.0);
    EXPECT_EQ(it8.GetChannel(0, 0), -255.0);
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
    EXPECT_EQ(it8.FieldCount(), 3);
    EXPECT_EQ(it8.GetLab(0, 0), -255.0);
    EXPECT_EQ(it8.GetCmyk(0, 0), 3.0);
    Measured_IT8 four;
    EXPECT_EQ(Read(four, Cgats("ID ID CMYK_C LAB_L", {"1 2 3 4"})), vantrel::kIt8RowFieldCount);
}

TEST(CgatsReader, StrayBytesEndLinesButNotTheHeader) {
    // A NUL and a high-bit byte inside comments and keyword lines split those lines only.
    std::string header = "# comment \xC3\xBC with umlaut\n";
    header += std::string("ORIGINATOR x") + '\0' + "y\n";
    header += "\x80\xFF\n";
    Measured_IT8 it8;
    ASSERT_EQ(Read(it8, Cgats("ID CMYK_C CMYK_M CMYK_Y CMYK_K", {"1 1 2 3 4"}, "\n", header)), 0);
    EXPECT_EQ(it8.GetCmyk(0, 3), 4.0);
}
