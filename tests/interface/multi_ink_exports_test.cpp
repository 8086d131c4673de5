// Five- to seven-colourant profiles through the seven-value conversion export, against lcms2.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <random>

#include "helpers/multi_ink_profiles.h"
#include "helpers/tool_handle.h"

using namespace vantrel::test;

namespace {

// Records of seven percentages on the edges of the profile's grid: every channel on a node but
// one, where multilinear and tetrahedral interpolation both reduce to the straight line along
// the edge. Channels past the profile's count hold values the export must not read.
std::vector<int> EdgeRecords(InkSet set, int count) {
    const int n = InkChannels(set), grid = n == 5 ? 7 : n == 6 ? 6 : 5;
    std::mt19937 rng(n);
    std::vector<int> nodes;  // whole percentages that are nodes
    for (int k = 0; k < grid; ++k)
        if (100 * k % (grid - 1) == 0) nodes.push_back(100 * k / (grid - 1));
    std::uniform_int_distribution<size_t> node(0, nodes.size() - 1);
    std::uniform_int_distribution<int> percent(0, 100), channel(0, n - 1);
    std::vector<int> records;
    for (int r = 0; r < count; ++r) {
        const int free = channel(rng);
        for (int c = 0; c < 7; ++c) records.push_back(c >= n ? 77 : c == free ? percent(rng) : nodes[node(rng)]);
    }
    return records;
}

}  // namespace

TEST(MultiInkConversion, SevenValueRecordsAgreeWithLcmsOnTheSameTables) {
    for (InkSet set : {InkSet::kCmykO, InkSet::kCmykOG, InkSet::kCmykRGB}) {
        const std::string& path = MultiInkProfile(set);
        ASSERT_FALSE(path.empty());
        const int n = InkChannels(set);
        cmsHPROFILE device = cmsOpenProfileFromFile(path.c_str(), "r"), labProfile = cmsCreateLab4Profile(nullptr);
        const cmsUInt32Number format = COLORSPACE_SH(PT_MCH5 + n - 5) | CHANNELS_SH(n) | BYTES_SH(0) | FLOAT_SH(1);
        cmsHTRANSFORM oracle = cmsCreateTransform(device, format, labProfile, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC,
                                                  cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
        ASSERT_NE(oracle, nullptr);
        const std::vector<int> records = EdgeRecords(set, 150);
        const size_t count = records.size() / 7;
        std::vector<int> lab(3 * count, -7), xyz(3 * count, -7);
        ToolHandle tool;
        ASSERT_EQ(Cmykrgb2Lab_Double(tool.h, path.c_str(), static_cast<int>(count), records.data(), 0, lab.data(), 0,
                                     xyz.data()),
                  0);
        double worst = 0, worstXyz = 0;
        for (size_t i = 0; i < count; ++i) {
            double in[7];
            for (int c = 0; c < n; ++c) in[c] = records[7 * i + c];
            cmsCIELab want;
            cmsDoTransform(oracle, in, &want, 1);
            want.a = AsReadFromSixteenBits(want.a);
            want.b = AsReadFromSixteenBits(want.b);
            cmsCIEXYZ wantXyz;
            cmsLab2XYZ(cmsD50_XYZ(), &wantXyz, &want);
            worst = std::max(worst, std::hypot(lab[3 * i] / 1000.0 - want.L, lab[3 * i + 1] / 1000.0 - want.a,
                                               lab[3 * i + 2] / 1000.0 - want.b));
            worstXyz = std::max({worstXyz, std::fabs(xyz[3 * i] / 1000.0 - 100 * wantXyz.X),
                                 std::fabs(xyz[3 * i + 1] / 1000.0 - 100 * wantXyz.Y),
                                 std::fabs(xyz[3 * i + 2] / 1000.0 - 100 * wantXyz.Z)});
        }
        std::printf("[ lcms2    ] %s: largest dE76 %.3f, largest XYZ difference %.3f\n", InkColourSpace(set), worst,
                    worstXyz);
        EXPECT_LT(worst, 0.05) << InkColourSpace(set);
        EXPECT_LT(worstXyz, 0.02) << InkColourSpace(set);
        cmsDeleteTransform(oracle);
        cmsCloseProfile(labProfile);
        cmsCloseProfile(device);
    }
}
