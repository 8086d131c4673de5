// analyse2 through the C interface, with the embedded neutral ISD profile that dllInit writes.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "helpers/test_paths.h"
#include "interface/tool_object.h"
#include "it8/it8_test_files.h"
#include "it8/measured_it8.h"
#include "vantrel.h"

namespace fs = std::filesystem;
using namespace vantrel;
using vantrel::test::TempDir;
using vantrel::test::it8::Lines;
using vantrel::test::it8::ReadFile;
using vantrel::test::it8::WriteFile;

namespace {

int Silent(const char*, int, int) { return 0; }

struct Host {
    TempDir dir;
    void* h = nullptr;
    Host() { EXPECT_EQ(dllInit(Silent, &h, dir.Slash().c_str()), 0); }
    ~Host() { dllFree(h); }
    CIterativtoolDlg& Tool() { return *static_cast<CIterativtoolDlg*>(h); }
    std::string Neutral() const { return dir.File("neutral.3cc"); }
};

// The header illuminant of an ICC profile, read from its bytes.
cmsCIEXYZ HeaderIlluminant(const std::string& path) {
    const std::string bytes = ReadFile(path);
    auto fixed = [&](std::size_t at) {
        const auto b = [&](std::size_t k) { return static_cast<uint32_t>(static_cast<unsigned char>(bytes[at + k])); };
        return static_cast<int32_t>(b(0) << 24 | b(1) << 16 | b(2) << 8 | b(3)) / 65536.0;
    };
    return cmsCIEXYZ{fixed(68), fixed(72), fixed(76)};
}

// Lab to XYZ (0..100) against a white, from lcms2.
cmsCIEXYZ Lcms2Xyz(const cmsCIEXYZ& white, double L, double a, double b) {
    const cmsCIELab lab{L, a, b};
    cmsCIEXYZ xyz;
    cmsLab2XYZ(&white, &xyz, &lab);
    return cmsCIEXYZ{xyz.X * 100, xyz.Y * 100, xyz.Z * 100};
}

// The neutral profile is an identity, but colours pass through it relative to its media white:
// Lab to XYZ and back through the single-precision cube-root table, whose straight pieces are
// coarsest for dark colours. A few hundredths is the precision of that path.
constexpr double kTablePrecision = 0.05;
// The writer keeps four decimals of Lab and XYZ.
constexpr double kWritten = 0.00005 + 1e-9;

}  // namespace

TEST(Analyse2, NeutralIsdRewritesTheMeasurementWithWholePercent) {
    Host host;
    const std::string meas = WriteFile(host.dir, "run1.it8",
                                       "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
                                       "END_DATA_FORMAT\nNUMBER_OF_SETS 4\nBEGIN_DATA\n"
                                       "1 0 0 0 0.4 95,5 -0,5 2\n"
                                       "2 39.5 39.49 0.5 0.49 60.25 -20.5 -30.75\n"
                                       "3 100 99.5 12.34 100 10 5 -5\n"
                                       "4 0 0 0 0 93.5 0.5 -1\n"
                                       "END_DATA\n");
    const std::string out = host.dir.File("result.it8");
    int out1 = 0, out2 = 0;
    ASSERT_EQ(analyse2(host.h, host.Neutral().c_str(), out.c_str(), meas.c_str(), &out1, &out2), 0);
    EXPECT_EQ(out1, 255000);
    EXPECT_EQ(out2, 300000);

    const std::string written = meas + "isd.it8";
    ASSERT_TRUE(fs::exists(written));
    EXPECT_EQ(ReadFile(out), ReadFile(written));
    const std::vector<std::string> lines = Lines(ReadFile(written));
    ASSERT_EQ(lines.size(), 12u);
    EXPECT_EQ(lines[0], "IT8");
    EXPECT_EQ(lines[1], "NUMBER_OF_FIELDS 11");
    EXPECT_EQ(lines[3], "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z");
    EXPECT_EQ(lines[5], "NUMBER_OF_SETS 4");
    EXPECT_EQ(lines[6], "BEGIN_DATA");
    // Whole percent: 39.5 and 0.5 round up, 39.49 and 0.49 down.
    EXPECT_EQ(lines[8].rfind("  2\t40.00\t39.00\t1.00\t0.00\t", 0), 0u) << lines[8];
    EXPECT_EQ(lines[9].rfind("  3\t100.00\t100.00\t12.00\t100.00\t", 0), 0u) << lines[9];
    EXPECT_EQ(lines[11], "END_DATA");

    Measured_IT8 source, result;
    ASSERT_EQ(source.ReadIt8(meas), 0);
    ASSERT_EQ(result.ReadIt8(written), 0);
    // XYZ is relative to the illuminant of the only loaded profile, the ISD profile.
    const cmsCIEXYZ white = HeaderIlluminant(host.Neutral());
    for (int i = 0; i < 4; ++i) {
        for (int c = 0; c < 3; ++c) EXPECT_NEAR(result.GetLab(i, c), source.GetLab(i, c), kTablePrecision) << i;
        const cmsCIEXYZ xyz = Lcms2Xyz(white, result.GetLab(i, 0), result.GetLab(i, 1), result.GetLab(i, 2));
        // Lab comes back rounded to four decimals too, hence the wider margin.
        EXPECT_NEAR(result.GetXyz(i, 0), xyz.X, 3 * kWritten);
        EXPECT_NEAR(result.GetXyz(i, 1), xyz.Y, 3 * kWritten);
        EXPECT_NEAR(result.GetXyz(i, 2), xyz.Z, 3 * kWritten);
    }

    // The tool now works on the written file.
    CIterativtoolDlg& tool = host.Tool();
    EXPECT_EQ(tool.m_MeasIT8Name, written);
    EXPECT_EQ(tool.m_ReferenceIT8Name, out);
    EXPECT_EQ(tool.m_ISDName, host.Neutral());
    EXPECT_EQ(tool.m_ISDMode, 1);
    EXPECT_EQ(tool.m_MeasIT8->PatchCount(), 4);
    EXPECT_TRUE(tool.m_ISDprof->HoldsTables());
    // Paper: patches 1 (K 0.4 rounds to 0) and 4.
    EXPECT_NEAR(tool.m_MeasWhite.L, (95.5 + 93.5) / 2, kTablePrecision);
    EXPECT_NEAR(tool.m_MeasWhite.a, 0.0, kTablePrecision);
    EXPECT_NEAR(tool.m_MeasWhite.b, 0.5, kTablePrecision);
}

TEST(Analyse2, RealCharacterisationDataThroughTheNeutralProfile) {
    const std::string data = test::SystemIccDir() + "TR003.ti3";
    if (!fs::exists(data)) GTEST_SKIP() << data << " missing";
    Host host;
    const std::string meas = host.dir.File("TR003.ti3");
    fs::copy_file(data, meas);
    const std::string out = host.dir.File("out.it8");
    int out1 = 0, out2 = 0;
    ASSERT_EQ(analyse2(host.h, host.Neutral().c_str(), out.c_str(), meas.c_str(), &out1, &out2), 0);
    Measured_IT8 source, result;
    ASSERT_EQ(source.ReadIt8(meas), 0);
    ASSERT_EQ(result.ReadIt8(out), 0);
    ASSERT_EQ(result.PatchCount(), 1617);
    double worst = 0;
    for (int i = 0; i < 1617; ++i) {
        for (int c = 0; c < 4; ++c) EXPECT_EQ(result.GetCmyk(i, c), std::trunc(source.GetCmyk(i, c) + 0.5)) << i;
        for (int c = 0; c < 3; ++c) worst = std::max(worst, std::fabs(result.GetLab(i, c) - source.GetLab(i, c)));
    }
    EXPECT_LT(worst, kTablePrecision);
}

TEST(Analyse2, XyzOnlyMeasurementGoesThroughXyzToLab) {
    Host host;
    const std::string meas = WriteFile(host.dir, "xyz.ti3",
                                       "CTI3\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z\n"
                                       "END_DATA_FORMAT\nNUMBER_OF_SETS 3\nBEGIN_DATA\n"
                                       "1 0 0 0 0 84.48 87.62 74.57\n"
                                       "2 100 0 0 0 15.04 22.91 52.9\n"
                                       "3 0 100 0 0 33.03 16.79 15.01\n"
                                       "END_DATA\n");
    const std::string out = host.dir.File("o.it8");
    int out1 = 0, out2 = 0;
    ASSERT_EQ(analyse2(host.h, host.Neutral().c_str(), out.c_str(), meas.c_str(), &out1, &out2), 0);
    Measured_IT8 source, result;
    ASSERT_EQ(source.ReadIt8(meas), 0);
    ASSERT_EQ(result.ReadIt8(out), 0);
    for (int i = 0; i < 3; ++i) {
        const cmsCIEXYZ xyz{source.GetXyz(i, 0) / 100, source.GetXyz(i, 1) / 100, source.GetXyz(i, 2) / 100};
        cmsCIELab lab;
        cmsXYZ2Lab(cmsD50_XYZ(), &lab, &xyz);
        EXPECT_NEAR(result.GetLab(i, 0), lab.L, 0.05) << i;
        EXPECT_NEAR(result.GetLab(i, 1), lab.a, 0.05) << i;
        EXPECT_NEAR(result.GetLab(i, 2), lab.b, 0.05) << i;
    }
}

TEST(Analyse2, NoIsdProfileCopiesTheMeasurementByteForByte) {
    Host host;
    // CR line ends and a decimal comma: the copy keeps every byte.
    const std::string meas =
        WriteFile(host.dir, "m.it8",
                  "CGATS.17\rBEGIN_DATA_FORMAT\rID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\rEND_DATA_FORMAT\r"
                  "NUMBER_OF_SETS 2\rBEGIN_DATA\r1 0 0 0 0 95,5 0 0\r2 39.5 0 0 0 50 0 0\rEND_DATA\r");
    for (const char* isd : {"", "-no ISD selected-"}) {
        const std::string out = host.dir.File("copy.it8");
        fs::remove(out);
        int out1 = 0, out2 = 0;
        ASSERT_EQ(analyse2(host.h, isd, out.c_str(), meas.c_str(), &out1, &out2), 0);
        EXPECT_EQ(ReadFile(out), ReadFile(meas)) << isd;
        EXPECT_FALSE(fs::exists(meas + "isd.it8"));
        EXPECT_EQ(host.Tool().m_MeasIT8Name, meas);
        EXPECT_EQ(host.Tool().m_MeasIT8->PatchCount(), 2);
        EXPECT_EQ(out1, 255000);
        EXPECT_EQ(out2, 300000);
    }
}

TEST(Analyse2, MissingOrBrokenInputsLeaveFilesAlone) {
    Host host;
    int out1 = 0, out2 = 0;
    EXPECT_EQ(analyse2(nullptr, "a", "b", "c", &out1, &out2), 1);
    EXPECT_EQ(out1, 0);

    // No measurement file: nothing to write and nothing to copy.
    const std::string out = host.dir.File("out.it8");
    ASSERT_EQ(analyse2(host.h, host.Neutral().c_str(), out.c_str(), host.dir.File("absent.it8").c_str(), &out1, &out2), 0);
    EXPECT_FALSE(fs::exists(out));
    EXPECT_EQ(host.Tool().m_MeasIT8->PatchCount(), 0);

    // A malformed measurement is an empty one: copied as it is, no ISD file.
    const std::string broken = WriteFile(host.dir, "broken.it8", "CGATS.17\nNUMBER_OF_SETS 2000000000\nBEGIN_DATA\n");
    ASSERT_EQ(analyse2(host.h, host.Neutral().c_str(), out.c_str(), broken.c_str(), &out1, &out2), 0);
    EXPECT_EQ(ReadFile(out), ReadFile(broken));
    EXPECT_FALSE(fs::exists(broken + "isd.it8"));

    // An ISD profile that does not load leaves the measurement untouched.
    const std::string meas = WriteFile(host.dir, "m.it8", test::it8::SmallCmykLabFile());
    for (const std::string& isd : {host.dir.File("absent.3cc"), meas, host.dir.Path()}) {
        void* fresh = nullptr;
        ASSERT_EQ(dllInit(Silent, &fresh, nullptr), 0);
        ASSERT_EQ(analyse2(fresh, isd.c_str(), out.c_str(), meas.c_str(), nullptr, nullptr), 0) << isd;
        EXPECT_EQ(ReadFile(out), ReadFile(meas)) << isd;
        EXPECT_FALSE(fs::exists(meas + "isd.it8")) << isd;
        dllFree(fresh);
    }
    // Null names are empty names.
    EXPECT_EQ(analyse2(host.h, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
}
