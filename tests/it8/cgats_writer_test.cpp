// The measurement files the library writes: layouts, row text, number formats, round trips.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <cstdlib>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

#include "it8/cgats_writer.h"
#include "it8/measured_it8.h"
#include "it8/number_locale.h"
#include "it8_test_files.h"

using namespace vantrel;
using namespace vantrel::test;
using namespace vantrel::test::it8;

namespace {

PatchRecord Record(uint32_t kind, uint32_t sample, std::vector<double> device, std::vector<double> lab,
                   std::vector<double> xyz) {
    PatchRecord r;
    r.kind = kind;
    r.sampleNumber = sample;
    for (std::size_t i = 0; i < device.size(); ++i) r.device[i] = device[i];
    for (int i = 0; i < 3; ++i) r.lab[i] = lab[static_cast<std::size_t>(i)];
    for (int i = 0; i < 3; ++i) r.xyz[i] = xyz[static_cast<std::size_t>(i)];
    return r;
}

// Sets an environment variable for the life of the object.
class ScopedEnv {
public:
    ScopedEnv(const char* name, const char* value) : name_(name) {
        if (const char* old = std::getenv(name)) old_ = old;
        setenv(name, value, 1);
    }
    ~ScopedEnv() {
        if (old_)
            setenv(name_, old_->c_str(), 1);
        else
            unsetenv(name_);
    }

private:
    const char* name_;
    std::optional<std::string> old_;
};

const Measured_IT8& EmptyObject() {
    static const Measured_IT8 empty;
    return empty;
}

}  // namespace

TEST(CgatsWriter, CmykRowTextAndTheWholeFile) {
    TempDir dir;
    const std::vector<PatchRecord> records = {Record(4, 7, {12.5, 0, 100, 0}, {50, 0, 0}, {18.42, 18.42, 18.42}),
                                              Record(4, 1234, {0.125, 99.999, 0, 5}, {-0.00001, 1.23456, -7.5},
                                                     {0, 100, 82.49})};
    const std::string path = dir.File("cmyk.it8");
    ASSERT_EQ(WriteCgats(path, records.data(), records.size(), 2, 0, 0, 0, MeasurementNumberLocale('.')), 0);
    EXPECT_EQ(ReadFile(path),
              "IT8\n"
              "NUMBER_OF_FIELDS 11\n"
              "BEGIN_DATA_FORMAT\n"
              "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z\n"
              "END_DATA_FORMAT\n"
              "NUMBER_OF_SETS 2\n"
              "BEGIN_DATA\n"
              "  7\t12.50\t0.00\t100.00\t0.00\t50.0000\t0.0000\t0.0000\t18.4200\t18.4200\t18.4200\n"
              "1234\t0.12\t100.00\t0.00\t5.00\t-0.0000\t1.2346\t-7.5000\t0.0000\t100.0000\t82.4900\n"
              "END_DATA\n");
}

TEST(CgatsWriter, TheFourLayoutsByTheFirstRecordsKind) {
    struct Case {
        uint32_t kind;
        const char* countLine;
        const char* fieldLine;
        const char* row;
    };
    const Case cases[] = {
        {3, "NUMBER_OF_FIELDS 10", "Sample_Name\tRGB_R\tRGB_G\tRGB_B\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z",
         "1\t10.5\t20.125\t255\t50.5\t-1.25\t3\t18.4\t19.1235\t20"},
        {7, "NUMBER_OF_FIELDS 14",
         "Sample_Name\t7CLR_1\t7CLR_2\t7CLR_3\t7CLR_4\t7CLR_5\t7CLR_6\t7CLR_7\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z",
         "1\t10.5\t20.125\t255\t0.333333\t5\t6\t7\t50.5\t-1.25\t3\t18.4\t19.1235\t20"},
        {6, "NUMBER_OF_FIELDS 13",
         "Sample_Name\t6CLR_1\t6CLR_2\t6CLR_3\t6CLR_4\t6CLR_5\t6CLR_6\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z",
         "1\t10.5\t20.125\t255\t0.333333\t5\t6\t50.5\t-1.25\t3\t18.4\t19.1235\t20"},
        {4, "NUMBER_OF_FIELDS 11",
         "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z",
         "  1\t10.50\t20.12\t255.00\t0.33\t50.5000\t-1.2500\t3.0000\t18.4000\t19.1235\t20.0000"},
        {0, "NUMBER_OF_FIELDS 11", nullptr, nullptr},
        {5, "NUMBER_OF_FIELDS 11", nullptr, nullptr},
    };
    TempDir dir;
    for (const Case& c : cases) {
        // The second record's kind is never looked at.
        const std::vector<PatchRecord> records = {
            Record(c.kind, 1, {10.5, 20.125, 255, 1.0 / 3, 5, 6, 7}, {50.5, -1.25, 3}, {18.4, 19.1234567, 20}),
            Record(3, 2, {}, {0, 0, 0}, {0, 0, 0})};
        const std::string path = dir.File("k.it8");
        ASSERT_EQ(WriteCgats(path, records.data(), 2, 2, 0, 0, 0, MeasurementNumberLocale('.')), 0);
        const std::vector<std::string> lines = Lines(ReadFile(path));
        ASSERT_EQ(lines.size(), 10u) << c.kind;
        EXPECT_EQ(lines[1], c.countLine);
        if (c.fieldLine) {
            EXPECT_EQ(lines[3], c.fieldLine);
        }
        if (c.row) {
            EXPECT_EQ(lines[7], c.row) << c.kind;
        }
        EXPECT_EQ(std::count(lines[8].begin(), lines[8].end(), '\t'), std::count(lines[3].begin(), lines[3].end(), '\t'));
    }
}

TEST(CgatsWriter, KeywordLinesOnlyWhenAsked) {
    TempDir dir;
    const std::vector<PatchRecord> records(3, Record(4, 1, {}, {0, 0, 0}, {0, 0, 0}));
    const std::string path = dir.File("kw.it8");
    ASSERT_EQ(WriteCgats(path, records.data(), 3, 3, 0, 0, 0, MeasurementNumberLocale('.')), 0);
    std::vector<std::string> lines = Lines(ReadFile(path));
    EXPECT_EQ(lines[5], "NUMBER_OF_SETS 3");
    EXPECT_EQ(lines[6], "BEGIN_DATA");

    ASSERT_EQ(WriteCgats(path, records.data(), 3, 3, 4, 28, -2, MeasurementNumberLocale('.')), 0);
    lines = Lines(ReadFile(path));
    EXPECT_EQ(lines[4], "END_DATA_FORMAT");
    EXPECT_EQ(lines[5], "BORDER_PATCHES 1");
    EXPECT_EQ(lines[6], "NUMBER_OF_COLS 28");
    EXPECT_EQ(lines[7], "NUMBER_OF_STRIPS 4");
    EXPECT_EQ(lines[8], "NUMBER_OF_SETS 3");
    EXPECT_EQ(lines[9], "BEGIN_DATA");

    Measured_IT8 back;
    ASSERT_EQ(back.ReadIt8(path), 0);
    EXPECT_EQ(back.Header().borderPatches, 1);
    EXPECT_EQ(back.Header().numberOfCols, 28);
    EXPECT_EQ(back.Header().numberOfStrips, 4);
}

TEST(CgatsWriter, NegativeBorderFlagWritesRgbPercentagesInverted) {
    TempDir dir;
    const std::vector<PatchRecord> records = {Record(3, 1, {0, 50, 100}, {1, 2, 3}, {4, 5, 6}),
                                              Record(3, 2, {39.2, 10, 0.2}, {1, 2, 3}, {4, 5, 6})};
    const std::string path = dir.File("rgb.it8");
    ASSERT_EQ(WriteCgats(path, records.data(), 2, 2, 0, 0, -1, MeasurementNumberLocale('.')), 0);
    const std::vector<std::string> lines = Lines(ReadFile(path));
    // 255 - trunc(p x 2.55) in double arithmetic: 50 % is 127.49999999999999 and 100 % is 254.99999999999997.
    EXPECT_EQ(lines[5], "BORDER_PATCHES 1");
    EXPECT_EQ(lines[8], "1\t255\t128\t1\t1\t2\t3\t4\t5\t6");
    EXPECT_EQ(lines[9], "2\t156\t230\t255\t1\t2\t3\t4\t5\t6");
    // A positive flag only adds the keyword.
    ASSERT_EQ(WriteCgats(path, records.data(), 2, 2, 0, 0, 1, MeasurementNumberLocale('.')), 0);
    EXPECT_EQ(Lines(ReadFile(path))[8], "1\t0\t50\t100\t1\t2\t3\t4\t5\t6");
}

TEST(CgatsWriter, ResultsForMissingRecordsUncreatableFilesAndShortArrays) {
    TempDir dir;
    const std::vector<PatchRecord> records(2, Record(4, 1, {}, {0, 0, 0}, {0, 0, 0}));
    const Measured_IT8& it8 = EmptyObject();
    EXPECT_EQ(it8.WriteIt8(dir.File("a.it8"), nullptr, 0, 2, 0, 0, 0), kIt8WriteNoRecords);
    EXPECT_FALSE(std::filesystem::exists(dir.File("a.it8")));
    EXPECT_EQ(it8.WriteIt8(dir.File("no/such/dir/a.it8"), records, 2, 0, 0, 0), kIt8WriteCannotCreate);
    EXPECT_EQ(it8.WriteIt8(dir.Path(), records, 2, 0, 0, 0), kIt8WriteCannotCreate);
    // More sets than records: refused before the file is touched.
    WriteFile(dir, "keep.it8", "precious");
    EXPECT_EQ(it8.WriteIt8(dir.File("keep.it8"), records, 3, 0, 0, 0), -1);
    EXPECT_EQ(ReadFile(dir.File("keep.it8")), "precious");
    // An empty object has no set count to lend: set count 0 writes an empty data block.
    ASSERT_EQ(it8.WriteIt8(dir.File("b.it8"), records, 0, 0, 0, 0), 0);
    EXPECT_EQ(ReadFile(dir.File("b.it8")).find("NUMBER_OF_SETS"), std::string::npos);
    EXPECT_EQ(it8.WriteIt8(dir.File("c.it8"), records, -4, 0, 0, 0), 0);
    if (std::filesystem::exists("/dev/full")) {
        EXPECT_EQ(it8.WriteIt8("/dev/full", records, 2, 0, 0, 0), -1);
    }
}

TEST(CgatsWriter, SetCountZeroTakesTheObjectsCount) {
    const std::string source = SystemIccDir() + "TR002.ti3";
    if (!std::filesystem::exists(source)) GTEST_SKIP() << source << " missing";
    Measured_IT8 it8;
    ASSERT_EQ(it8.ReadIt8(source), 0);
    ASSERT_EQ(it8.PatchCount(), 928);
    std::vector<PatchRecord> records(928);
    for (int i = 0; i < 928; ++i) {
        records[static_cast<std::size_t>(i)] = Record(
            4, static_cast<uint32_t>(i + 1), {it8.GetCmyk(i, 0), it8.GetCmyk(i, 1), it8.GetCmyk(i, 2), it8.GetCmyk(i, 3)},
            {it8.GetLab(i, 0), it8.GetLab(i, 1), it8.GetLab(i, 2)}, {it8.GetXyz(i, 0), it8.GetXyz(i, 1), it8.GetXyz(i, 2)});
    }
    TempDir dir;
    const std::string path = dir.File("tr002.it8");
    ASSERT_EQ(it8.WriteIt8(path, records, 0, 0, 0, 0), 0);
    const std::vector<std::string> lines = Lines(ReadFile(path));
    ASSERT_EQ(lines.size(), 7u + 928u + 1u);
    EXPECT_EQ(lines[5], "NUMBER_OF_SETS 928");

    // Round trip: every value back to the written precision.
    Measured_IT8 back;
    ASSERT_EQ(back.ReadIt8(path), 0);
    ASSERT_EQ(back.PatchCount(), 928);
    EXPECT_EQ(back.FieldMap().at("SAMPLE_NAME"), 0);
    for (int i = 0; i < 928; ++i) {
        for (int c = 0; c < 4; ++c) EXPECT_NEAR(back.GetCmyk(i, c), it8.GetCmyk(i, c), 0.005 + 1e-12);
        for (int c = 0; c < 3; ++c) {
            EXPECT_NEAR(back.GetLab(i, c), it8.GetLab(i, c), 0.00005 + 1e-12);
            EXPECT_NEAR(back.GetXyz(i, c), it8.GetXyz(i, c), 0.00005 + 1e-12);
        }
    }
}

TEST(CgatsWriter, DecimalCommaFilesReadBackByUsAndByLcms2) {
    TempDir dir;
    std::vector<PatchRecord> records;
    for (uint32_t kind : {4u, 3u, 6u, 7u}) {
        records.clear();
        for (uint32_t i = 0; i < 1200; ++i)
            records.push_back(Record(kind, i + 1, {i * 0.0625, 100 - i * 0.03125, 1.0 / (i + 1), 7.5, 8.25, 9.125, 10},
                                     {i * 0.05, -0.1 * i, 3.14159}, {i * 0.01, 50.5, 82.49}));
        for (char point : {'.', ','}) {
            const std::string path = dir.File("rt.it8");
            ASSERT_EQ(WriteCgats(path, records.data(), records.size(), 1200, 0, 0, 0, MeasurementNumberLocale(point)), 0);
            const std::string text = ReadFile(path);
            // No digit grouping, whatever the locale: the count and the sample numbers stay whole.
            EXPECT_NE(text.find("NUMBER_OF_SETS 1200\n"), std::string::npos);
            EXPECT_NE(text.find("\n1200\t"), std::string::npos);
            EXPECT_EQ(text.find(point == ',' ? '.' : ',', text.find("BEGIN_DATA\n")), std::string::npos);

            Measured_IT8 back;
            ASSERT_EQ(back.ReadIt8(path), 0) << kind << point;
            ASSERT_EQ(back.PatchCount(), 1200);
            const double tolerance = kind == 4 ? 0.005 + 1e-9 : 5e-6 * 100;
            for (int i = 0; i < 1200; i += 37) {
                const PatchRecord& r = records[static_cast<std::size_t>(i)];
                const double device = kind == 3   ? back.GetRgb(i, 1)
                                      : kind == 4 ? back.GetCmyk(i, 1)
                                                  : back.GetChannel(i, static_cast<int>(kind) - 1);
                EXPECT_NEAR(device, kind >= 6 ? r.device[kind - 1] : r.device[1], tolerance);
                EXPECT_NEAR(back.GetLab(i, 1), std::max(r.lab[1], -128.0), tolerance);
                EXPECT_NEAR(back.GetXyz(i, 0), r.xyz[0], tolerance);
            }
            if (point == '.') {
                // lcms2 reads what we write, as an outside reader of the same format.
                cmsHANDLE it8 = cmsIT8LoadFromFile(nullptr, path.c_str());
                ASSERT_NE(it8, nullptr) << kind;
                EXPECT_EQ(cmsIT8GetPropertyDbl(it8, "NUMBER_OF_SETS"), 1200.0);
                EXPECT_NEAR(cmsIT8GetDataRowColDbl(it8, 999, static_cast<int>(kind) + 2),
                            -99.9, tolerance);
                cmsIT8Free(it8);
            }
        }
    }
}

TEST(CgatsWriter, ABrokenLocaleSettingFallsBackToThePoint) {
    auto point = [](const std::locale& l) { return std::use_facet<std::numpunct<char>>(l).decimal_point(); };
    {
        ScopedEnv broken("LC_ALL", "xx_NOWHERE.broken");
        EXPECT_EQ(point(MeasurementNumberLocale()), '.');
        TempDir dir;
        const std::vector<PatchRecord> records = {Record(4, 1, {12.5}, {1, 2, 3}, {4, 5, 6})};
        EXPECT_EQ(EmptyObject().WriteIt8(dir.File("b.it8"), records, 1, 0, 0, 0), 0);
        EXPECT_NE(ReadFile(dir.File("b.it8")).find("\t12.50\t"), std::string::npos);
    }
    {
        ScopedEnv c("LC_ALL", "C");
        EXPECT_EQ(point(MeasurementNumberLocale()), '.');
    }
    EXPECT_EQ(point(MeasurementNumberLocale(',')), ',');
    EXPECT_EQ(point(MeasurementNumberLocale(' ')), '.');
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
    const std::locale numbers = MeasurementNumberLocale();
    EXPECT_EQ(std::use_facet<std::numpunct<char>>(numbers).decimal_point(), ',');
    EXPECT_EQ(std::use_facet<std::numpunct<char>>(numbers).grouping(), "");

    TempDir dir;
    std::vector<PatchRecord> records(1500, Record(4, 1, {12.5, 0, 100, 0}, {50, 0, 0}, {18.42, 18.42, 18.42}));
    records[1499].sampleNumber = 1500;
    const std::string file = dir.File("de.it8");
    ASSERT_EQ(EmptyObject().WriteIt8(file, records, 1500, 0, 0, 0), 0);
    const std::string text = ReadFile(file);
    EXPECT_NE(text.find("\n  1\t12,50\t0,00\t100,00\t0,00\t50,0000\t0,0000\t0,0000\t18,4200\t18,4200\t18,4200\n"),
              std::string::npos);
    EXPECT_NE(text.find("NUMBER_OF_SETS 1500\n"), std::string::npos);
    EXPECT_NE(text.find("\n1500\t12,50"), std::string::npos);
    Measured_IT8 back;
    ASSERT_EQ(back.ReadIt8(file), 0);
    EXPECT_EQ(back.PatchCount(), 1500);
    EXPECT_EQ(back.GetCmyk(1499, 0), 12.5);
    EXPECT_EQ(back.GetXyz(3, 2), 18.42);
}
