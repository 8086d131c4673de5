// analyse2 through the C interface, with the embedded neutral ISD profile that dllInit writes.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "helpers/cgats_files.h"
#include "helpers/icc_builder.h"
#include "helpers/tool_handle.h"
#include "it8/measured_it8.h"

namespace fs = std::filesystem;
using namespace vantrel;
using namespace vantrel::test;

namespace {

// A tool whose directory holds the embedded neutral profile.
struct Host {
    TempDir dir;
    ToolHandle tool{dir.Slash().c_str()};
    int out1 = 0, out2 = 0;
    CIterativtoolDlg& Tool() { return tool.Tool(); }
    std::string Neutral() const { return dir.File("neutral.3cc"); }
    int Run(const std::string& isd, const std::string& out, const std::string& meas) {
        return analyse2(tool.h, isd.c_str(), out.c_str(), meas.c_str(), &out1, &out2);
    }
};

// The neutral profile is an identity, but colours pass through it relative to its media white:
// Lab to XYZ and back through the single-precision cube-root table, whose straight pieces are
// coarsest for dark colours. A few hundredths is the precision of that path.
constexpr double kTablePrecision = 0.05;

}  // namespace

TEST(Analyse2, NeutralIsdRewritesTheMeasurementWithWholePercent) {
    const std::string small = Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B",
                                    {"1 0 0 0 0.4 95,5 -0,5 2", "2 39.5 39.49 0.5 0.49 60.25 -20.5 -30.75",
                                     "3 100 99.5 12.34 100 10 5 -5", "4 0 0 0 0 93.5 0.5 -1"});
    const std::string xyzOnly = Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z",
                                      {"1 0 0 0 0 84.48 87.62 74.57", "2 100 0 0 0 15.04 22.91 52.9",
                                       "3 0 100 0 0 33.03 16.79 15.01"});
    const std::string data = SystemIccDir() + "TR003.ti3";
    for (const std::string& text : {small, xyzOnly, fs::exists(data) ? ReadText(data) : std::string()}) {
        if (text.empty()) continue;
        Host host;
        const std::string meas = WriteText(host.dir, "run1.it8", text), out = host.dir.File("result.it8");
        ASSERT_EQ(host.Run(host.Neutral(), out, meas), 0);
        EXPECT_EQ(host.out1, 255000);
        EXPECT_EQ(host.out2, 300000);
        const std::string written = meas + "isd.it8";
        EXPECT_EQ(host.Tool().m_MeasIT8Name, written);  // the tool now works on the written file
        EXPECT_EQ(ReadText(out), ReadText(written));

        Measured_IT8 source, result;
        ASSERT_EQ(source.ReadIt8(meas), 0);
        ASSERT_EQ(result.ReadIt8(written), 0);
        ASSERT_EQ(result.PatchCount(), source.PatchCount());
        // XYZ is relative to the header illuminant of the only loaded profile, the ISD profile.
        const Bytes profile = ReadFile(host.Neutral());
        cmsCIEXYZ white;
        for (int k = 0; k < 3; ++k) (&white.X)[k] = static_cast<int32_t>(GetU32(profile, 68 + 4 * k)) / 65536.0;
        for (int i = 0; i < source.PatchCount(); ++i) {
            for (int c = 0; c < 4; ++c) EXPECT_EQ(result.GetCmyk(i, c), std::trunc(source.GetCmyk(i, c) + 0.5)) << i;
            cmsCIELab want{source.GetLab(i, 0), source.GetLab(i, 1), source.GetLab(i, 2)};
            if (text == xyzOnly) {  // no Lab columns: from XYZ against D50, as lcms2 has it
                const cmsCIEXYZ xyz{source.GetXyz(i, 0) / 100, source.GetXyz(i, 1) / 100, source.GetXyz(i, 2) / 100};
                cmsXYZ2Lab(cmsD50_XYZ(), &want, &xyz);
            }
            const cmsCIELab got{result.GetLab(i, 0), result.GetLab(i, 1), result.GetLab(i, 2)};
            cmsCIEXYZ xyz;
            cmsLab2XYZ(&white, &xyz, &got);
            for (int c = 0; c < 3; ++c) {
                EXPECT_NEAR((&got.L)[c], (&want.L)[c], kTablePrecision) << i;
                // Lab and XYZ are both written to four decimals (a margin for the small file's colours).
                if (text == small) {
                    EXPECT_NEAR(result.GetXyz(i, c), (&xyz.X)[c] * 100, 3 * 0.00005 + 1e-9) << i;
                }
            }
        }
        if (text != small) continue;
        // Whole percent: 39.5 and 0.5 round up, 39.49 and 0.49 down.
        const std::vector<std::string> lines = Lines(ReadText(written));
        ASSERT_EQ(lines.size(), 12u);
        EXPECT_EQ(lines[3], "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z");
        EXPECT_EQ(lines[8].rfind("  2\t40.00\t39.00\t1.00\t0.00\t", 0), 0u) << lines[8];
        EXPECT_EQ(lines[9].rfind("  3\t100.00\t100.00\t12.00\t100.00\t", 0), 0u) << lines[9];
        // Paper: patches 1 (K 0.4 rounds to 0) and 4.
        EXPECT_NEAR(host.Tool().m_MeasWhite.L, (95.5 + 93.5) / 2, kTablePrecision);
        EXPECT_NEAR(host.Tool().m_MeasWhite.b, 0.5, kTablePrecision);
    }
}

TEST(Analyse2, WithoutAUsableIsdProfileTheMeasurementIsCopiedByteForByte) {
    // CR line ends and a decimal comma: the copy keeps every byte.
    const std::string text = Cgats("ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B",
                                   {"1 0 0 0 0 95,5 0 0", "2 39.5 0 0 0 50 0 0"}, "\r");
    // None named, the default label, a missing file, a measurement file, a directory.
    for (const std::string isd : {"", "-no ISD selected-", "absent.3cc", "m.it8", "."}) {
        Host host;
        const std::string meas = WriteText(host.dir, "m.it8", text), out = host.dir.File("copy.it8");
        ASSERT_EQ(host.Run(isd.empty() || isd[0] == '-' ? isd : host.dir.File(isd), out, meas), 0);
        EXPECT_EQ(ReadText(out), text) << isd;
        EXPECT_FALSE(fs::exists(meas + "isd.it8")) << isd;
        EXPECT_EQ(host.Tool().m_MeasIT8Name, meas);
        EXPECT_EQ(host.Tool().m_MeasIT8->PatchCount(), 2);
        EXPECT_EQ(host.out1, 255000);
    }
}

TEST(Analyse2, MissingOrBrokenMeasurementsWriteNothing) {
    Host host;
    // No measurement file: nothing to write and nothing to copy.
    const std::string out = host.dir.File("out.it8");
    ASSERT_EQ(host.Run(host.Neutral(), out, host.dir.File("absent.it8")), 0);
    EXPECT_FALSE(fs::exists(out));
    EXPECT_EQ(host.Tool().m_MeasIT8->PatchCount(), 0);
    // A malformed measurement is an empty one: copied as it is, no ISD file.
    const std::string broken = WriteText(host.dir, "broken.it8", "CGATS.17\nNUMBER_OF_SETS 2000000000\nBEGIN_DATA\n");
    ASSERT_EQ(host.Run(host.Neutral(), out, broken), 0);
    EXPECT_EQ(ReadText(out), ReadText(broken));
    EXPECT_FALSE(fs::exists(broken + "isd.it8"));
    // Null names are empty names.
    EXPECT_EQ(analyse2(host.tool.h, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
}

// An ISD profile that cannot be used on the second call must not leave the first call's table in
// use: the measurement is then copied as it is, not sent through the earlier profile.
TEST(Analyse2, ANewIsdWithoutItsTableNeverReusesThePreviousOne) {
    Host host;
    // Lab to Lab, halving L* (a 16-bit Lab table holds L* 100 at 65535, a* and b* 0 at 32896).
    const LutSpec half = MakeLut(3, 3, 3, [](const std::vector<int>& node, int out) {
        return static_cast<uint16_t>(out == 0 ? node[0] * 65535 / 4 : 32896);
    });
    const Bytes wtpt = XyzTag(0.9642, 1.0, 0.8249);
    const std::string halving = WriteFile(host.dir.File("half.icc"),
        IccBuilder("Lab ", "Lab ", "abst").AddTag("A2B1", Mft2Tag(half)).AddTag("B2A1", Mft2Tag(half)).AddTag("wtpt", wtpt).Build());
    const std::string noB2A = WriteFile(host.dir.File("nob2a.icc"),
        IccBuilder("Lab ", "Lab ", "abst").AddTag("A2B1", Mft2Tag(half)).AddTag("wtpt", wtpt).Build());
    const std::string text = Cgats("ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B", {"1 0 0 0 0 95 0 0", "2 0 0 0 0 95 0 0"});
    const std::string out = host.dir.File("out.it8");

    ASSERT_EQ(host.Run(halving, out, WriteText(host.dir, "first.it8", text)), 0);
    Measured_IT8 first;
    ASSERT_EQ(first.ReadIt8(out), 0);
    EXPECT_NEAR(first.GetLab(0, 0), 47.5, 0.5);  // the first profile did apply

    const std::string second = WriteText(host.dir, "second.it8", text);
    ASSERT_EQ(host.Run(noB2A, out, second), 0);
    EXPECT_EQ(ReadText(out), text);
    EXPECT_FALSE(fs::exists(second + "isd.it8"));
    EXPECT_FALSE(host.Tool().m_ISDprof->SlotHolds(1));
}
