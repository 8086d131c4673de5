// Node reads and writes, and the grid geometry the optimisation works with: what a node stands
// for and where a colour falls.
#include <gtest/gtest.h>

#include <random>

#include "eval/grid_coordinate.h"
#include "eval/grid_location.h"
#include "eval/interpolation.h"
#include "eval/table_nodes.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

TEST(TableNodes, LabWritesClampAStarTouchOneChannelAndHoldIndicesToTheGrid) {
    TempDir dir;
    CProfil p;
    WriteAndLoad(p, dir, "CMYK",
                 {{"A2B1", Mft2Tag(DeviceToLabLut(4, 3, [](const std::vector<double>& f) {
                       return Lab{100 * f[0], 10, 10};
                   }))}});
    // a* = -128 is stored as -127.5, the lowest a 16-bit table holds.
    double record[17] = {60 * 2.55, -128.0, 127.0, 0, 1, 2, 0, 1};
    WriteNodeLab(p, record, 0);
    const int32_t node = p.m_ClutStride[0][0] + 2 * p.m_ClutStride[0][1] + p.m_ClutStride[0][3];
    EXPECT_EQ(p.m_Clut[0][node + 1], 0);
    EXPECT_EQ(p.m_Clut[0][node + 2], 65407);  // b* 127 encodes to 65406.5: rounded, not truncated
    ReadNodeLab(p, record, 0, true);
    EXPECT_NEAR(record[1], -127.5, 1e-9);

    // One channel: a* of the node only; L* and b* stay; the record comes back as it went.
    double channel[17] = {20 * 2.55, 33.0, -50.0, 1, 1.9, 2.2, 0.4, 1.7};  // indices truncate to 1, 2, 0, 1
    const std::vector<double> copy(channel, channel + 17);
    WriteNodeChannelLab(p, channel, 0);
    EXPECT_EQ(std::vector<double>(channel, channel + 17), copy);
    EXPECT_EQ(p.m_Clut[0][node + 1], static_cast<uint16_t>((33.0 + 127.5) * 257.0));  // 4 inputs: no + 0.5
    ReadNodeLab(p, record, 0, true);
    EXPECT_NEAR(record[0], 60 * 2.55, 1.0 / 257);
    EXPECT_NEAR(record[2], 127.0, 1.0 / 257);

    // Indices past the grid, negative or not numbers are held to it, not followed out of the table.
    double wild[17] = {0, 0, 0, 0, 2.7, -7, 1e12, std::nan("")};
    ReadNodeLab(p, wild, 0, true);
    EXPECT_NEAR(wild[0] / 2.55, 100.0, 0.01);  // index 2.7 rounds past the grid: held at 2, the last node
    WriteNodeLab(p, wild, 0);
    WriteNodeChannelLab(p, wild, 0);
}

// A PCS-to-device table with straight input curves, 9 grid points and 4 outputs whose output
// curves are `curve` (1024 entries).
void LoadDeviceTable(CProfil& p, const TempDir& dir, const std::vector<uint16_t>& curve) {
    LutSpec lut = DeviceLut(3, 4, 9, [](const std::vector<double>& f, int out) { return 255.0 * f[out % 3]; });
    lut.outputCurves.assign(4, curve);
    WriteAndLoad(p, dir, "CMYK", {{"B2A1", Mft2Tag(lut)}});
}

TEST(TableNodes, DeviceValuesWrittenThroughTheOutputCurvesReadBack) {
    // A curve that is flat at 0 over its first 40 entries and at 65535 over its last 40.
    std::vector<uint16_t> curve(1024);
    for (int k = 0; k < 1024; ++k)
        curve[k] = static_cast<uint16_t>(std::clamp((k - 40) * 65535.0 / 943.0, 0.0, 65535.0));
    TempDir dir;
    CProfil p;
    LoadDeviceTable(p, dir, curve);
    ASSERT_EQ(p.m_Lut[1].outputEntries, 1024);
    std::mt19937 rng(3);
    std::uniform_real_distribution<double> value(0, 255);
    double largest = 0;
    for (int t = 0; t < 300; ++t) {
        double record[17] = {value(rng), value(rng), value(rng), value(rng), 3, 5, 8};
        const std::vector<double> wanted(record, record + 4);
        WriteNodeDevice(p, record, true);
        ReadNodeDevice(p, record, true);
        for (int j = 0; j < 4; ++j) largest = std::max(largest, std::fabs(record[j] - wanted[j]));
    }
    EXPECT_LT(largest, 2.0 / 257.0);

    // In the flat regions the stored value ends where the flat part meets the slope.
    auto stored = [&](double device, bool curves) {
        double record[17] = {device, device, device, device, 0, 0, 0};
        WriteNodeDevice(p, record, curves);
        return static_cast<int>(p.m_Clut[1][0]);
    };
    const double perEntry = 65535.0 / 1023.0;
    EXPECT_NEAR(stored(0.0, true), 40 * perEntry, perEntry);     // upper end of the zero region
    EXPECT_NEAR(stored(255.0, true), 983 * perEntry, perEntry);  // lower end of the top region
    EXPECT_EQ(stored(100.0, false), 25700);                       // without the curves: as it is
}

TEST(TableNodes, NodePcsValueInvertsTheInputCurves) {
    TempDir dir;
    CProfil p;
    LoadDeviceTable(p, dir, LinearCurve(1024));
    // Straight input curves: node k stands for a multiple of 0.1 (up to 254.9) nearest to
    // k x 255 / 8; 63.75 lies half-way between two.
    auto nearest = [](double x, int k) {
        const double want = std::min(k * 255.0 / 8, 254.9);
        return std::fabs(x - want) <= 0.05 + 1e-9 && std::fabs(x * 10 - std::round(x * 10)) < 1e-6;
    };
    for (int k = 0; k < 9; ++k) {
        double record[17] = {double(k), double(8 - k), 4.0};
        NodePcsValue(p, record);
        EXPECT_TRUE(nearest(record[0], k)) << k << ": " << record[0];
        EXPECT_TRUE(nearest(record[1] + 127.5, 8 - k)) << k << ": " << record[1];
        EXPECT_NEAR(record[2], 0.0, 1e-9);
    }
    // Curved input curves (a real B2A table): the answer is the candidate of a full scan whose
    // grid coordinate lies closest to the node.
    const std::string path = CorpusProfile("FOGRA39L").path;
    if (path.empty()) return;
    CProfil real;
    ASSERT_TRUE(LoadProfile(real, path));
    const LutView view = SlotView(real, 1);
    for (int k = 0; k < view.grid; ++k) {
        double record[17] = {double(k), double(k), double(k)};
        NodePcsValue(real, record);
        const double x[3] = {record[0], record[1] + 127.5, record[2] + 127.5};
        for (int c = 0; c < 3; ++c) {
            double best = 1e9, bestX = -1;
            for (int candidate = 0; candidate < 2550; ++candidate) {
                const double g = GridCoordinate(view, c, candidate / 10.0, true);
                if (static_cast<int>(g + 0.5) == k && (g - k) * (g - k) < best) {
                    best = (g - k) * (g - k);
                    bestX = candidate / 10.0;
                }
            }
            EXPECT_NEAR(x[c], bestX, 1e-6) << "channel " << c << " node " << k;
        }
    }
}

TEST(GridLocation, ColoursOnANodeAndHalfWayBetweenTwo) {
    TempDir dir;
    CProfil cmyk, device;
    WriteAndLoad(cmyk, dir, "CMYK",
                 {{"A2B1", Mft2Tag(DeviceToLabLut(4, 5, [](const std::vector<double>&) { return Lab{50, 0, 0}; }))}});
    LoadDeviceTable(device, dir, LinearCurve(1024));
    auto fields = [](const double* record, int n) { return std::vector<double>(record, record + n); };
    CornerWeights weights{};
    // Device side (slot 0, 5 points): on node (1, 2, 0, 4), then half-way along channel 0.
    const double step = 255.0 / 4;
    double on[17] = {step, 2 * step, 0, 4 * step}, onCell[17] = {step, 2 * step, 0, 4 * step};
    EXPECT_NEAR(LocateNearestNode(cmyk, on, 0), 0.0, 1e-9);
    EXPECT_EQ(fields(on, 4), (std::vector<double>{1, 2, 0, 4}));
    EXPECT_NEAR(LocateCell(cmyk, onCell, 0, weights), 0.0, 1e-9);
    for (int k = 0; k < 16; ++k) EXPECT_EQ(weights[k], k == 0 ? 1.25 : 0.0) << k;
    double half[17] = {1.5 * step, 2 * step, 0, 0}, halfCell[17] = {1.5 * step, 2 * step, 0, 0};
    EXPECT_NEAR(LocateNearestNode(cmyk, half, 0), 0.5, 1e-9);
    EXPECT_NEAR(LocateCell(cmyk, halfCell, 0, weights), 0.5, 1e-9);
    EXPECT_EQ(fields(halfCell, 8), (std::vector<double>{1, 2, 0, 0, 1, 2, 0, 0}));
    // Channel 0 is the most significant digit of the corner number: corners 0 and 8 share the weight.
    for (int k = 0; k < 16; ++k) EXPECT_NEAR(weights[k], k % 8 == 0 ? std::pow(0.5, 0.25) * 1.25 : 0.0, 1e-12) << k;
    double near[17] = {1.6 * step, 2 * step, 0, 0};
    LocateNearestNode(cmyk, near, 0);
    EXPECT_EQ(near[0], 2.0);
    EXPECT_NEAR(near[4], -0.4, 1e-9);

    // PCS side (slot 1, 9 points): L* x 2.55 = 3 x 255 / 8 and a* = b* = 0, which a 16-bit table
    // holds at 127.5, grid coordinate 4.
    double pcs[17] = {3 * 255.0 / 8, 0, 0, 7}, pcsCell[17] = {3.25 * 255.0 / 8, 0, 0};
    EXPECT_NEAR(LocateNearestNode(device, pcs, 1), 0.0, 1e-9);
    EXPECT_EQ(fields(pcs, 6), (std::vector<double>{3, 4, 4, 0, 0, 0}));
    EXPECT_NEAR(LocateCell(device, pcsCell, 1, weights), 0.25, 1e-9);
    EXPECT_EQ(fields(pcsCell, 6), (std::vector<double>{3, 4, 4, 3, 4, 4}));

    // A matrix/TRC profile has no grid.
    const std::string srgb = CorpusProfile("sRGB").path;
    if (srgb.empty()) return;
    CProfil rgb;
    ASSERT_TRUE(LoadProfile(rgb, srgb));
    double r[17] = {100, 10, 10};
    EXPECT_EQ(LocateNearestNode(rgb, r, 1), 0.0);
    EXPECT_EQ(fields(r + 3, 3), (std::vector<double>{0, 1, 2}));
}

TEST(GridLocation, WeightingPolynomialPassesItsFivePointsAndIsHeld) {
    const double points[5][2] = {{0.0, 0.0}, {0.25, 0.25}, {0.5, 1.0}, {0.75, 1.25}, {1.0, 1.0}};
    for (const auto& xy : points) EXPECT_NEAR(WeightingPolynomial(xy[0]), xy[1], 1e-12) << xy[0];
    EXPECT_EQ(WeightingPolynomial(-3.0), 0.0);
    EXPECT_NEAR(WeightingPolynomial(7.0), 1.0, 1e-12);
    for (double w = 0; w <= 1.0; w += 0.01) {
        EXPECT_GE(WeightingPolynomial(w), 0.0);
        EXPECT_LE(WeightingPolynomial(w), 1.25);
    }
}

}  // namespace
}  // namespace vantrel
