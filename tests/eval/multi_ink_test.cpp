// Tables of five to seven colourants and the node operations the optimisations use on them:
// lcms2-written ink profiles and the embedded device links, against lcms2 and the tables' own
// layout.
#include <gtest/gtest.h>

#include <random>

#include "eval/grid_location.h"
#include "eval/inverse.h"
#include "eval/table_nodes.h"
#include "eval_helpers.h"
#include "helpers/multi_ink_profiles.h"
#include "resources/identity_profiles.h"

namespace vantrel {
namespace {

using namespace test;

cmsUInt32Number InkFormat(int channels) {
    return COLORSPACE_SH(PT_MCH5 + channels - 5) | CHANNELS_SH(channels) | BYTES_SH(0) | FLOAT_SH(1);
}

TEST(MultiInkTables, SeparationAndForwardTablesAgreeWithLcmsAndInverseSearchUsesEveryChannel) {
    for (InkSet set : {InkSet::kCmykO, InkSet::kCmykOG, InkSet::kCmykRGB}) {
        const std::string& path = MultiInkProfile(set);
        ASSERT_FALSE(path.empty());
        const int n = InkChannels(set);
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path));
        ASSERT_EQ(p.m_Lut[1].outputChannels, n);
        const auto toDevice = MakeLcmsTransform(path, InkFormat(n), false);
        const auto toLab = MakeLcmsTransform(path, InkFormat(n), true);
        ASSERT_TRUE(toDevice && toLab);

        // Lab through the separation and back through the forward table. lcms2 interpolates by
        // tetrahedra (and linearly across the channels past the third), this library
        // multilinearly: they part inside the cells. The colour printed is then in gamut: the
        // tables must bring it back.
        DeltaStats device, forward, roundTrip;
        std::mt19937 rng(5);
        std::uniform_real_distribution<double> L(25, 95), ab(-60, 60);
        for (int t = 0; t < 200; ++t) {
            const cmsCIELab in{L(rng), ab(rng), ab(rng)};
            double v[20] = {in.L * 2.55, in.a, in.b};
            EXPECT_EQ(LabToMulti(p, v), 1);
            double oracle[7] = {}, percent[7] = {};
            cmsDoTransform(toDevice.get(), &in, oracle, 1);
            for (int c = 0; c < n; ++c) device.Add(std::fabs(v[c] - oracle[c] * 2.55));
            for (int c = n; c < 20; ++c) EXPECT_EQ(v[c], 0.0);
            for (int c = 0; c < n; ++c) percent[c] = v[c] / 2.55;
            cmsCIELab back;
            cmsDoTransform(toLab.get(), percent, &back, 1);
            EXPECT_EQ(MultiToLab(p, v), 1);
            const Lab printed{v[0] / 2.55, v[1], v[2]};
            forward.Add(Difference(printed, Lab{back.L, AsReadFromSixteenBits(back.a), AsReadFromSixteenBits(back.b)}));
            LabToMulti(p, v);
            MultiToLab(p, v);
            roundTrip.Add(Difference(Lab{v[0] / 2.55, v[1], v[2]}, printed));
        }
        const std::string space = InkColourSpace(set);
        device.Report(space + " LabToMulti vs lcms2 (device 0..255)");
        forward.Report(space + " MultiToLab vs lcms2");
        roundTrip.Report(space + " printed Lab -> device -> Lab");
        EXPECT_LT(device.Mean(), 0.3) << space;
        EXPECT_LT(device.max, 3.0) << space;
        EXPECT_LT(forward.Mean(), 0.8) << space;
        EXPECT_LT(roundTrip.Mean(), 2.0) << space;

        // A colour of the process inks alone: the search moves C, M and Y, keeps black and
        // judges every candidate with the extra channels at 0.
        double printed[20] = {40, 150, 90, 30};
        MultiToLab(p, printed);
        const Lab target{printed[0] / 2.55, printed[1], printed[2]};
        const double start[4] = {90, 100, 140, 30};
        double result[4], delta = -1;
        InverseSearch(p, target.L, target.a, target.b, start, result, delta);
        double check[20] = {result[0], result[1], result[2], result[3]};
        MultiToLab(p, check);
        EXPECT_NEAR(Difference(Lab{check[0] / 2.55, check[1], check[2]}, target), delta, 1e-9);
        EXPECT_LT(delta, 0.3) << space;
        EXPECT_EQ(result[3], 30.0);
    }
}

// A 16-bit Lab-to-Lab table of 9 points and straight curves in slot 0 (A2B1) and slot 1 (B2A1).
void LoadLabTable(CProfil& p, const TempDir& dir) {
    const Bytes table = Mft2Tag(DeviceToLabLut(3, 9, [](const std::vector<double>& f) {
        return Lab{100 * f[0], 255 * f[1] - 127.5, 255 * f[2] - 127.5};
    }));
    WriteAndLoad(p, dir, "Lab ", {{"A2B1", table}, {"B2A1", table}});
}

TEST(MultiInkTables, ChannelWritesOnThreeInputTablesRoundHalfUp) {
    TempDir dir;
    CProfil p;
    LoadLabTable(p, dir);
    // a* 0.3 encodes to 32844.6 and b* -0.7 to 32587.6: rounded, not truncated. Indices truncate.
    const int32_t node = p.m_ClutStride[0][0] + 2 * p.m_ClutStride[0][1] + 7 * p.m_ClutStride[0][2];
    const std::vector<uint16_t> before = p.m_Clut[0];
    for (int channel : {1, 2}) {
        double record[17] = {40 * 2.55, 0.3, -0.7, double(channel), 1.9, 2.2, 7.7};
        const std::vector<double> copy(record, record + 17);
        WriteNodeChannelLab(p, record, 0);
        EXPECT_EQ(std::vector<double>(record, record + 17), copy);
    }
    EXPECT_EQ(p.m_Clut[0][node + 1], 32845);
    EXPECT_EQ(p.m_Clut[0][node + 2], 32588);
    std::vector<uint16_t> others = p.m_Clut[0];
    others[size_t(node + 1)] = before[size_t(node + 1)];
    others[size_t(node + 2)] = before[size_t(node + 2)];
    EXPECT_TRUE(others == before);
}

TEST(MultiInkTables, CellWeightsOfThreeInputsInCountingOrder) {
    TempDir dir;
    CProfil p;
    LoadLabTable(p, dir);
    // Grid coordinates 2.25, 3.5 and 5.75 on the PCS side of slot 1.
    double record[CProfil::kEvalSize] = {2.25 * 255 / 8, 3.5 * 255 / 8 - 127.5, 5.75 * 255 / 8 - 127.5};
    CornerWeights weights{};
    EXPECT_NEAR(LocateCell(p, record, 1, weights), std::sqrt(0.25 * 0.25 + 0.5 * 0.5 + 0.75 * 0.75), 1e-9);
    EXPECT_EQ(std::vector<double>(record, record + 6), (std::vector<double>{2, 3, 5, 2, 3, 5}));
    const double f[3] = {0.25, 0.5, 0.75};
    for (int k = 0; k < 8; ++k) {
        double w = 1;
        for (int i = 0; i < 3; ++i) w *= (k >> (2 - i) & 1) ? f[i] : 1 - f[i];
        EXPECT_NEAR(weights[k], 1.25 * std::cbrt(w), 1e-12) << k;
    }
    for (int k = 8; k < CProfil::kMaxCorners; ++k) EXPECT_EQ(weights[k], 0.0) << k;
}

TEST(MultiInkTables, LocatedNodesOfDeviceLinksAreReadAndWrittenByTheirIndices) {
    struct Link {
        int id, channels;
    };
    TempDir dir;
    for (const Link link : {Link{103, 4}, Link{104, 6}, Link{105, 7}}) {
        const std::string path = WriteFile(dir.File(std::to_string(link.id) + ".mcc"), BuildIdentityProfile(link.id));
        CProfil p;
        p.ReadTagTable(1, path);
        ASSERT_EQ(p.LoadLut(1, "A2B0", path), 1);
        const int n = link.channels, grid = p.m_Lut[1].gridPoints;
        ASSERT_EQ(grid, 5);
        std::mt19937 rng(link.id);
        std::uniform_int_distribution<int> index(0, grid - 1);
        std::uniform_real_distribution<double> off(-0.3, 0.3), value(0, 255);
        for (int t = 0; t < 20; ++t) {
            // A colour near a random node, located and placed where the device accessors read.
            std::vector<int> node(n);
            double record[CProfil::kEvalSize] = {};
            for (int i = 0; i < n; ++i) {
                node[i] = index(rng);
                record[i] = std::clamp((node[i] + off(rng)) * 255.0 / (grid - 1), 0.0, 255.0);
            }
            LocateNearestNode(p, record, 1);
            PlaceLocatedNode(p, record, 1, NodeFields::kDevice);
            ReadNodeDevice(p, record, false);
            // The link evaluated at that node gives what the node holds.
            double at[20] = {};
            for (int i = 0; i < n; ++i) at[i] = node[i] * 255.0 / (grid - 1);
            EvaluateDirection1(p, at);
            for (int j = 0; j < n; ++j) EXPECT_NEAR(record[j], at[j], 1e-9) << n << " " << j;

            // New values: outputs 0..3 from fields 0..3, 4..6 from fields 14..16.
            double wanted[7];
            for (int j = 0; j < n; ++j) record[j < 4 ? j : j + 10] = wanted[j] = value(rng);
            WriteNodeDevice(p, record, false);
            int32_t offset = 0;
            for (int i = 0; i < n; ++i) offset = offset * grid + node[i];
            for (int j = 0; j < n; ++j)
                EXPECT_EQ(p.m_Clut[1][offset * n + j], static_cast<uint16_t>(wanted[j] * 257.0)) << n << " " << j;
            for (int i = 0; i < n; ++i) at[i] = node[i] * 255.0 / (grid - 1);
            EvaluateDirection1(p, at);
            for (int j = 0; j < n; ++j) EXPECT_NEAR(at[j], wanted[j], 1.0 / 257) << n << " " << j;
        }
    }
}

}  // namespace
}  // namespace vantrel
