// The steps the optimisation workers share, by the cases that would show a fault.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "eval/eval_helpers.h"
#include "eval/table_nodes.h"
#include "optimise/add_to_node.h"
#include "optimise/node_accumulator.h"
#include "optimise/sample_weight.h"
#include "optimise/sparse_smoothing.h"
#include "optimise/white_correction.h"

namespace vantrel::test {
namespace {

TEST(SampleWeight, PaperSolidsTintsMixturesAndTintsBelowTheMinimumTone) {
    struct Case {
        double cyan, magenta, black;
        int cyanMinimum, weight;
    };
    for (const Case c : {Case{0, 0, 0, 0, 100}, {5, 0, 0, 0, 25}, {100, 0, 0, 0, 75}, {0, 0, 100, 0, 75},
                         {5, 5, 0, 0, 1}, {0, 0, 0, 10, 100}, {5, 0, 0, 10, 0}, {5, 50, 0, 10, 0},
                         {0, 50, 0, 10, 25}, {10, 0, 0, 10, 25}, {0, 5, 5, 10, 1}}) {
        const double percent[7] = {c.cyan, c.magenta, 0, c.black, 0, 0, 0};
        const int minimum[7] = {c.cyanMinimum, 0, 0, 0, 0, 0, 0};
        EXPECT_EQ(SampleWeight(percent, minimum), c.weight) << c.cyan << " " << c.magenta << " " << c.cyanMinimum;
    }
}

TEST(AddToNode, RoundsHalfAwayFromZeroScalesSixteenBitTablesAndStaysInRange) {
    struct Case {
        bool sixteenBit;
        uint16_t start;
        double correction;
        int channel, firstIndex;
        uint16_t expected;
    };
    const Case cases[] = {
        {true, 1000, 1.0, 2, 1, 1257}, {true, 1000, -0.3, 2, 1, 923}, {true, 65500, 1.0, 2, 1, 65535},
        {true, 100, -1.0, 2, 1, 0},    {false, 100, -0.3, 2, 1, 100}, {false, 100, -0.6, 2, 1, 99},
        {false, 100, 0.5, 2, 1, 101},  {false, 250, 10.0, 2, 1, 255}, {false, 3, -10.0, 2, 1, 0},
        // A channel the table does not have and an index off the grid change nothing.
        {true, 1000, 5.0, 3, 1, 1000}, {true, 1000, 5.0, 2, 3, 1000}, {true, 1000, 5.0, 2, -1, 1000},
    };
    TempDir dir;
    for (const Case& c : cases) {
        CProfil p;
        const LutSpec lut = MakeLut(3, 3, 3, [](const std::vector<int>&, int) { return 0; }, 256, 256,
                                    c.sixteenBit ? 65535 : 255);
        WriteAndLoad(p, dir, "CMYK", {{"B2A1", c.sixteenBit ? Mft2Tag(lut) : Mft1Tag(lut)}});
        ASSERT_TRUE(p.SlotHolds(1));
        const int32_t entry = (1 * 9 + 2 * 3 + 0) * 3 + 2;  // node (1, 2, 0), channel 2
        p.m_Clut[1][entry] = c.start;
        std::vector<uint16_t> expected = p.m_Clut[1];
        expected[entry] = c.expected;
        double record[CProfil::kEvalSize] = {double(c.firstIndex), 2, 0, 0, 0, 0, 0, double(c.channel)};
        record[3 + c.channel] = c.correction;
        EXPECT_EQ(AddToNode(p, record), 1);
        EXPECT_EQ(p.m_Clut[1], expected) << c.start << " + " << c.correction << " on channel " << c.channel;
    }
}

TEST(WhiteCorrection, SameWhitesLeaveTheColourAndTheMeasuredWhiteMovesToTheWanted) {
    const std::string path = FixtureProfile("FOGRA39L");
    if (path.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    for (const bool absolute : {false, true}) {
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path, "A2B1", "B2A1", absolute));
        const Lab white{95.0, 1.0, -3.0}, wanted{93.0, 0.0, 2.0};
        // Within the precision of the tabulated cube root of the library's Lab conversion.
        for (const Lab v : {Lab{50, 20, -30}, Lab{90, -5, 60}, Lab{20, 0, 0}})
            EXPECT_LT(Difference(WhiteCorrection(p, v, white, white, 0), v), 0.05);
        EXPECT_LT(Difference(WhiteCorrection(p, white, white, wanted, 0), wanted), 0.05);
    }
}

int g_stopAt = -1;  // the smoothing's progress answers non-zero from this step on (negative: never)
int StopAt(const char*, int step, int) { return g_stopAt >= 0 && step >= g_stopAt ? 1 : 0; }

TEST(SparseSmoothing, LeavesTheOuterLayerAndWeightedNodesAndAveragesTheRest) {
    TempDir dir;
    const LutSpec lut = MakeLut(3, 3, 5, [](const std::vector<int>& n, int out) {
        return static_cast<uint16_t>(20000 + 997 * ((n[0] * 7 + n[1] * 3 + n[2] * 5 + out * 11) % 13));
    }, 256, 256);
    auto node = [](int i, int j, int k) { return ((i * 5 + j) * 5 + k) * 3; };
    for (const int stopAt : {-1, 1}) {
        CProfil p;
        WriteAndLoad(p, dir, "Lab ", {{"A2B1", Mft2Tag(lut)}, {"B2A1", Mft2Tag(lut)}});
        NodeAccumulators acc;
        ASSERT_TRUE(acc.Allocate(5, 3));
        acc.At(2, 2, 2).weight = 1.0;  // reached by a sample
        acc.At(1, 1, 1).weight = 0.5;  // touched, not enough
        const std::vector<uint16_t> before = p.m_Clut[1];
        // The first node replaced: (25 V + its 27 neighbours) / 52, as they stood.
        double expected[3] = {0, 0, 0};
        for (int n = 0; n < 27; ++n) {
            double r[CProfil::kEvalSize] = {0, 0, 0, 0, double(n / 9), double(n / 3 % 3), double(n % 3)};
            ReadNodeLab(p, r, 1, false);
            for (int c = 0; c < 3; ++c) expected[c] += (n == 13 ? 26.0 : 1.0) * r[c] / 52.0;
        }
        g_stopAt = stopAt;
        EXPECT_EQ(SmoothSparseNodes(p, acc, StopAt), stopAt < 0 ? 1 : 0);
        for (int n = 0; n < 125; ++n) {
            const int i = n / 25, j = n / 5 % 5, k = n % 5;
            if (i % 4 && j % 4 && k % 4 && !(i == 2 && j == 2 && k == 2)) continue;
            for (int c = 0; c < 3; ++c) EXPECT_EQ(p.m_Clut[1][node(i, j, k) + c], before[node(i, j, k) + c]);
        }
        EXPECT_NE(p.m_Clut[1][node(1, 1, 1)], before[node(1, 1, 1)]);
        if (stopAt < 0) continue;
        // Stopped after the first plane of the first sweep: the next plane is as it was.
        double r[CProfil::kEvalSize] = {0, 0, 0, 0, 1, 1, 1};
        ReadNodeLab(p, r, 1, false);
        for (int c = 0; c < 3; ++c) EXPECT_NEAR(r[c], expected[c], 0.01);
        EXPECT_EQ(p.m_Clut[1][node(2, 1, 1)], before[node(2, 1, 1)]);
    }
    g_stopAt = -1;
}

}  // namespace
}  // namespace vantrel::test
