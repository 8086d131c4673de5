// The measurement files the library writes: layouts, row text, number formats, round trips.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

#include "helpers/cgats_files.h"
#include "it8/cgats_writer.h"
#include "it8/measured_it8.h"
#include "it8/number_locale.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// A record: kind, sample number, device values, Lab, XYZ.
PatchRecord Record(uint32_t kind, uint32_t sample, std::array<double, 7> device, std::array<double, 3> lab,
                   std::array<double, 3> xyz) {
    PatchRecord r;
    r.kind = kind;
    r.sampleNumber = sample;
    std::copy(device.begin(), device.end(), r.device);
    std::copy(lab.begin(), lab.end(), r.lab);
    std::copy(xyz.begin(), xyz.end(), r.xyz);
    return r;
}

// Writes with a decimal point and returns the file's lines.
std::vector<std::string> WrittenLines(const std::vector<PatchRecord>& records, int32_t strips = 0,
                                      int32_t columns = 0, int32_t border = 0) {
    TempDir dir;
    const std::string path = dir.File("w.it8");
    EXPECT_EQ(WriteCgats(path, records.data(), records.size(), static_cast<int32_t>(records.size()), strips, columns,
                         border, MeasurementNumberLocale('.')),
              0);
    return Lines(ReadText(path));
}

// Sets an environment variable for the life of the object.
struct ScopedEnv {
    ScopedEnv(const char* name, const char* value) : name_(name) {
        if (const char* old = std::getenv(name)) old_ = old;
        setenv(name, value, 1);
    }
    ~ScopedEnv() { old_ ? setenv(name_, old_->c_str(), 1) : unsetenv(name_); }
    const char* name_;
    std::optional<std::string> old_;
};

char DecimalPoint(const std::locale& l) { return std::use_facet<std::numpunct<char>>(l).decimal_point(); }

const Measured_IT8 kEmpty;

}  // namespace

TEST(CgatsWriter, CmykRowTextAndTheWholeFile) {
    TempDir dir;
    const std::vector<PatchRecord> records = {
        Record(4, 7, {12.5, 0, 100, 0}, {50, 0, 0}, {18.42, 18.42, 18.42}),
        Record(4, 1234, {0.125, 99.999, 0, 5}, {-0.00001, 1.23456, -7.5}, {0, 100, 82.49})};
    EXPECT_EQ(WrittenLines(records),
              (std::vector<std::string>{
                  "IT8", "NUMBER_OF_FIELDS 11", "BEGIN_DATA_FORMAT",
                  "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z",
                  "END_DATA_FORMAT", "NUMBER_OF_SETS 2", "BEGIN_DATA",
                  "  7\t12.50\t0.00\t100.00\t0.00\t50.0000\t0.0000\t0.0000\t18.4200\t18.4200\t18.4200",
                  "1234\t0.12\t100.00\t0.00\t5.00\t-0.0000\t1.2346\t-7.5000\t0.0000\t100.0000\t82.4900", "END_DATA"}));
}

TEST(CgatsWriter, TheFirstRecordsKindChoosesTheLayout) {
    const std::string colour = "Lab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z";
    const struct {
        uint32_t kind;
        std::string devices;
        const char* row;  // of the first record, shortest-form numbers
    } cases[] = {
        {3, "RGB_R\tRGB_G\tRGB_B", "1\t10.5\t20.125\t255\t50.5\t-1.25\t3\t18.4\t19.1235\t20"},
        {6, "6CLR_1\t6CLR_2\t6CLR_3\t6CLR_4\t6CLR_5\t6CLR_6",
         "1\t10.5\t20.125\t255\t0.333333\t5\t6\t50.5\t-1.25\t3\t18.4\t19.1235\t20"},
        {7, "7CLR_1\t7CLR_2\t7CLR_3\t7CLR_4\t7CLR_5\t7CLR_6\t7CLR_7",
         "1\t10.5\t20.125\t255\t0.333333\t5\t6\t7\t50.5\t-1.25\t3\t18.4\t19.1235\t20"},
        {0, "CMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K", nullptr},
        {5, "CMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K", nullptr},
    };
    for (const auto& c : cases) {
        // The second record's kind is never looked at.
        const auto lines = WrittenLines({Record(c.kind, 1, {10.5, 20.125, 255, 1.0 / 3, 5, 6, 7}, {50.5, -1.25, 3},
                                                {18.4, 19.1234567, 20}),
                                         Record(3, 2, {}, {0, 0, 0}, {0, 0, 0})});
        ASSERT_EQ(lines.size(), 10u) << c.kind;
        const std::string fields = "Sample_Name\t" + c.devices + "\t" + colour;
        EXPECT_EQ(lines[3], fields) << c.kind;
        const auto tabs = std::count(fields.begin(), fields.end(), '\t');
        EXPECT_EQ(lines[1], "NUMBER_OF_FIELDS " + std::to_string(tabs + 1)) << c.kind;
        if (c.row) {
            EXPECT_EQ(lines[7], c.row) << c.kind;
        }
        EXPECT_EQ(std::count(lines[8].begin(), lines[8].end(), '\t'), tabs) << c.kind;
    }
}

TEST(CgatsWriter, KeywordLinesOnlyWhenAskedAndRgbPercentagesInverted) {
    const std::vector<PatchRecord> records = {Record(3, 1, {0, 50, 100}, {1, 2, 3}, {4, 5, 6}),
                                              Record(3, 2, {39.2, 10, 0.2}, {1, 2, 3}, {4, 5, 6})};
    auto lines = WrittenLines(records);
    EXPECT_EQ(lines[5], "NUMBER_OF_SETS 2");
    EXPECT_EQ(lines[7], "1\t0\t50\t100\t1\t2\t3\t4\t5\t6");
    // A positive flag only adds the keyword.
    lines = WrittenLines(records, 4, 28, 1);
    EXPECT_EQ(std::vector<std::string>(lines.begin() + 4, lines.begin() + 11),
              (std::vector<std::string>{"END_DATA_FORMAT", "BORDER_PATCHES 1", "NUMBER_OF_COLS 28",
                                        "NUMBER_OF_STRIPS 4", "NUMBER_OF_SETS 2", "BEGIN_DATA",
                                        "1\t0\t50\t100\t1\t2\t3\t4\t5\t6"}));
    // A negative one writes 255 - trunc(p x 2.55) in double arithmetic: 50 % is 127.49999999999999
    // and 100 % is 254.99999999999997.
    lines = WrittenLines(records, 0, 0, -1);
    EXPECT_EQ(lines[5], "BORDER_PATCHES 1");
    EXPECT_EQ(lines[8], "1\t255\t128\t1\t1\t2\t3\t4\t5\t6");
    EXPECT_EQ(lines[9], "2\t156\t230\t255\t1\t2\t3\t4\t5\t6");
}

TEST(CgatsWriter, ResultsForMissingRecordsUncreatableFilesAndShortArrays) {
    TempDir dir;
    const std::vector<PatchRecord> records(2, Record(4, 1, {}, {0, 0, 0}, {0, 0, 0}));
    EXPECT_EQ(kEmpty.WriteIt8(dir.File("a.it8"), nullptr, 0, 2, 0, 0, 0), kIt8WriteNoRecords);
    EXPECT_FALSE(std::filesystem::exists(dir.File("a.it8")));
    EXPECT_EQ(kEmpty.WriteIt8(dir.File("no/such/dir/a.it8"), records, 2, 0, 0, 0), kIt8WriteCannotCreate);
    EXPECT_EQ(kEmpty.WriteIt8(dir.Path(), records, 2, 0, 0, 0), kIt8WriteCannotCreate);
    // More sets than records: refused before the file is touched.
    WriteText(dir, "keep.it8", "precious");
    EXPECT_EQ(kEmpty.WriteIt8(dir.File("keep.it8"), records, 3, 0, 0, 0), -1);
    EXPECT_EQ(ReadText(dir.File("keep.it8")), "precious");
    // An empty object has no set count to lend: set count 0 writes an empty data block.
    ASSERT_EQ(kEmpty.WriteIt8(dir.File("b.it8"), records, 0, 0, 0, 0), 0);
    EXPECT_EQ(ReadText(dir.File("b.it8")).find("NUMBER_OF_SETS"), std::string::npos);
    EXPECT_EQ(kEmpty.WriteIt8(dir.File("c.it8"), records, -4, 0, 0, 0), 0);
    if (std::filesystem::exists("/dev/full")) {
        EXPECT_EQ(kEmpty.WriteIt8("/dev/full", records, 2, 0, 0, 0), -1);
    }
}

TEST(CgatsWriter, RealDataRoundTripsInEveryLayoutThroughUsAndLcms2) {
    const std::string source = SystemIccDir() + "TR002.ti3";
    if (!std::filesystem::exists(source)) GTEST_SKIP() << source << " missing";
    Measured_IT8 it8;
    ASSERT_EQ(it8.ReadIt8(source), 0);
    const int n = it8.PatchCount();
    TempDir dir;
    const std::string path = dir.File("rt.it8");
    for (const uint32_t kind : {4u, 3u, 6u, 7u}) {
        std::vector<PatchRecord> records;
        for (int i = 0; i < n; ++i) {
            const double c = it8.GetCmyk(i, 0), m = it8.GetCmyk(i, 1), y = it8.GetCmyk(i, 2), k = it8.GetCmyk(i, 3);
            records.push_back(Record(kind, static_cast<uint32_t>(i + 1), {c, m, y, k, c / 3, m / 7, y + k / 9},
                                     {it8.GetLab(i, 0), it8.GetLab(i, 1), it8.GetLab(i, 2)},
                                     {it8.GetXyz(i, 0), it8.GetXyz(i, 1), it8.GetXyz(i, 2)}));
        }
        if (kind == 4) {  // set count 0 takes the object's
            ASSERT_EQ(it8.WriteIt8(path, records, 0, 0, 0, 0), 0);
            EXPECT_NE(ReadText(path).find("\nNUMBER_OF_SETS 928\n"), std::string::npos);
        }
        // Two decimals of CMYK and four of Lab and XYZ; six significant digits in the other layouts.
        const double deviceTolerance = kind == 4 ? 0.005 + 1e-9 : 5e-4;
        const double colourTolerance = kind == 4 ? 5e-5 + 1e-9 : 5e-4;
        const int channels = kind == 4 ? 4 : static_cast<int>(kind);
        for (const char point : {'.', ','}) {
            ASSERT_EQ(WriteCgats(path, records.data(), records.size(), n, 0, 0, 0, MeasurementNumberLocale(point)), 0);
            const std::string text = ReadText(path);
            EXPECT_EQ(text.find(point == ',' ? '.' : ',', text.find("BEGIN_DATA\n")), std::string::npos);
            Measured_IT8 back;
            ASSERT_EQ(back.ReadIt8(path), 0) << kind << point;
            ASSERT_EQ(back.PatchCount(), n);
            for (int i = 0; i < n; ++i) {
                const PatchRecord& r = records[static_cast<std::size_t>(i)];
                for (int c = 0; c < channels; ++c) {
                    const double device = kind == 3 ? back.GetRgb(i, c) : kind == 4 ? back.GetCmyk(i, c)
                                                                                     : back.GetChannel(i, c);
                    ASSERT_NEAR(device, r.device[c], deviceTolerance) << kind << point << " set " << i;
                }
                for (int c = 0; c < 3; ++c) {
                    ASSERT_NEAR(back.GetLab(i, c), r.lab[c], colourTolerance) << kind << point << " set " << i;
                    ASSERT_NEAR(back.GetXyz(i, c), r.xyz[c], colourTolerance) << kind << point << " set " << i;
                }
            }
            if (point == ',') continue;
            // lcms2 reads what we write, as an outside reader of the same format.
            cmsHANDLE lcms = cmsIT8LoadFromFile(nullptr, path.c_str());
            ASSERT_NE(lcms, nullptr) << kind;
            EXPECT_EQ(cmsIT8GetPropertyDbl(lcms, "NUMBER_OF_SETS"), n);
            EXPECT_NEAR(cmsIT8GetDataRowColDbl(lcms, 500, channels + 1), records[500].lab[0], colourTolerance);
            cmsIT8Free(lcms);
        }
    }
}

TEST(CgatsWriter, ABrokenLocaleSettingFallsBackToThePoint) {
    {
        ScopedEnv broken("LC_ALL", "xx_NOWHERE.broken");
        EXPECT_EQ(DecimalPoint(MeasurementNumberLocale()), '.');
        TempDir dir;
        EXPECT_EQ(kEmpty.WriteIt8(dir.File("b.it8"), {Record(4, 1, {12.5}, {1, 2, 3}, {4, 5, 6})}, 1, 0, 0, 0), 0);
        EXPECT_NE(ReadText(dir.File("b.it8")).find("\t12.50\t"), std::string::npos);
    }
    ScopedEnv c("LC_ALL", "C");
    EXPECT_EQ(DecimalPoint(MeasurementNumberLocale()), '.');
    EXPECT_EQ(DecimalPoint(MeasurementNumberLocale(',')), ',');
    EXPECT_EQ(DecimalPoint(MeasurementNumberLocale(' ')), '.');
}

TEST(CgatsWriter, AGermanUserWritesDecimalCommasWithoutGrouping) {
    // tools/make_fixtures.sh compiles the locale into the fixture directory.
    const std::string locales = FixtureDir() + "locale";
    if (!std::filesystem::exists(locales + "/de_DE.UTF-8")) GTEST_SKIP() << "de_DE locale fixture not built";
#if defined(__SANITIZE_ADDRESS__)
    // glibc loses the LOCPATH list on every newlocale() (38 bytes); not ours to find.
    __lsan::ScopedDisabler glibcLocalePathLeak;
#endif
    ScopedEnv path("LOCPATH", locales.c_str());
    ScopedEnv german("LC_ALL", "de_DE.UTF-8");
    TempDir dir;
    std::vector<PatchRecord> records(1500, Record(4, 1, {12.5, 0, 100, 0}, {50, 0, 0}, {18.42, 18.42, 18.42}));
    records[1499].sampleNumber = 1500;
    const std::string file = dir.File("de.it8");
    ASSERT_EQ(kEmpty.WriteIt8(file, records, 1500, 0, 0, 0), 0);
    const std::string text = ReadText(file);
    EXPECT_NE(text.find("\n  1\t12,50\t0,00\t100,00\t0,00\t50,0000\t0,0000\t0,0000\t18,4200\t18,4200\t18,4200\n"),
              std::string::npos);
    EXPECT_NE(text.find("NUMBER_OF_SETS 1500\n"), std::string::npos);
    EXPECT_NE(text.find("\n1500\t12,50"), std::string::npos);
}
