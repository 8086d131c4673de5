// The steps the optimisation workers share, by the cases that would show a fault.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "eval/eval_helpers.h"
#include "eval/table_nodes.h"
#include "helpers/tool_handle.h"
#include "icc/profil.h"
#include "optimise/add_to_node.h"
#include "optimise/correction_targets.h"
#include "optimise/node_accumulator.h"
#include "optimise/sample_weight.h"
#include "optimise/sparse_smoothing.h"
#include "optimise/white_correction.h"

namespace vantrel::test {
namespace {

TEST(SampleWeight, PaperSolidsTintsMixturesAndTintsBelowTheMinimumTone) {
    struct Case {
        std::vector<double> percent;
        int firstMinimum;  // minimum tone of cyan, the others 0
        int weight;
    };
    const Case cases[] = {
        {{0, 0, 0, 0, 0, 0, 0}, 0, 100},  {{5, 0, 0, 0, 0, 0, 0}, 0, 25},   {{100, 0, 0, 0, 0, 0, 0}, 0, 75},
        {{0, 0, 0, 100, 0, 0, 0}, 0, 75}, {{0, 0, 0, 0, 0, 0, 40}, 0, 25},  {{5, 5, 0, 0, 0, 0, 0}, 0, 1},
        {{0, 0, 0, 0, 0, 0, 0}, 10, 100}, {{5, 0, 0, 0, 0, 0, 0}, 10, 0},   {{5, 50, 0, 0, 0, 0, 0}, 10, 0},
        {{0, 50, 0, 0, 0, 0, 0}, 10, 25}, {{10, 0, 0, 0, 0, 0, 0}, 10, 25}, {{0, 5, 5, 5, 0, 0, 0}, 10, 1},
    };
    for (const Case& c : cases) {
        const int minimum[7] = {c.firstMinimum, 0, 0, 0, 0, 0, 0};
        EXPECT_EQ(SampleWeight(c.percent.data(), minimum), c.weight)
            << "cyan " << c.percent[0] << " magenta " << c.percent[1] << " minimum " << c.firstMinimum;
    }
}

// A three-input table of `outputs` channels, every entry at `fill`, loaded into slot 1.
void LoadFilledTable(CProfil& p, const TempDir& dir, bool sixteenBit, int outputs, uint16_t fill) {
    const LutSpec lut = MakeLut(3, outputs, 3, [fill](const std::vector<int>&, int) { return fill; }, 256, 256,
                                sixteenBit ? 65535 : 255);
    const Bytes tag = sixteenBit ? Mft2Tag(lut) : Mft1Tag(lut);
    WriteAndLoad(p, dir, "CMYK", {{"B2A1", tag}});
    ASSERT_TRUE(p.SlotHolds(1));
}

TEST(AddToNode, RoundsHalfAwayFromZeroScalesSixteenBitTablesAndStaysInRange) {
    struct Case {
        bool sixteenBit;
        uint16_t start;
        double correction;
        uint16_t expected;
    };
    const Case cases[] = {
        {true, 1000, 1.0, 1257},   {true, 1000, -0.3, 923},  {true, 65500, 1.0, 65535},
        {true, 100, -1.0, 0},      {false, 100, -0.3, 100},  {false, 100, -0.6, 99},
        {false, 100, 0.5, 101},    {false, 250, 10.0, 255},  {false, 3, -10.0, 0},
    };
    TempDir dir;
    for (const Case& c : cases) {
        CProfil p;
        LoadFilledTable(p, dir, c.sixteenBit, 4, 0);
        const int32_t entry = (1 * 9 + 2 * 3 + 0) * 4 + 2;  // node (1, 2, 0), channel 2
        p.m_Clut[1][entry] = c.start;
        const std::vector<uint16_t> before = p.m_Clut[1];
        double record[CProfil::kEvalSize] = {1, 2, 0, 0, 0, 0, 0, 2};
        record[3 + 2] = c.correction;
        EXPECT_EQ(AddToNode(p, record), 1);
        EXPECT_EQ(p.m_Clut[1][entry], c.expected) << (c.sixteenBit ? "16" : "8") << "-bit " << c.start << " + "
                                                  << c.correction;
        p.m_Clut[1][entry] = before[entry];
        EXPECT_EQ(p.m_Clut[1], before) << "only the one entry changes";
    }
}

TEST(AddToNode, ChannelsTheTableLacksAndIndicesOffTheGridChangeNothing) {
    TempDir dir;
    CProfil p;
    LoadFilledTable(p, dir, true, 3, 500);
    const std::vector<uint16_t> before = p.m_Clut[1];
    const double records[][CProfil::kEvalSize] = {
        {1, 1, 1, 9, 9, 9, 9, 3},   // a fourth channel on a three-output table
        {3, 0, 0, 9, 9, 9, 9, 0},   // an index past the last node
        {-1, 0, 0, 9, 9, 9, 9, 0},  // a negative index
    };
    for (const auto& record : records) AddToNode(p, record);
    EXPECT_EQ(p.m_Clut[1], before);
}

TEST(WhiteCorrection, SameWhitesLeaveTheColourAndTheMeasuredWhiteMovesToTheWanted) {
    const std::string path = FixtureProfile("FOGRA39L");
    if (path.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    for (int absolute = 0; absolute <= 1; ++absolute) {
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path, "A2B1", "B2A1", absolute != 0));
        const Lab white{95.0, 1.0, -3.0};
        const Lab wanted{93.0, 0.0, 2.0};
        // Within the precision of the tabulated cube root of the library's Lab conversion.
        for (const Lab v : {Lab{50, 20, -30}, Lab{90, -5, 60}, Lab{20, 0, 0}})
            EXPECT_LT(Difference(WhiteCorrection(p, v, white, white, 0), v), 0.05);
        EXPECT_LT(Difference(WhiteCorrection(p, white, white, wanted, 0), wanted), 0.05);
    }
}

TEST(CorrectionTargets, ReflectionsAndShiftsAreHeldToTheLabRange) {
    const Lab reflected = ReflectLab({50, 0, 0}, {90, 100, 0});
    EXPECT_EQ(reflected.L, 100.0);
    EXPECT_EQ(reflected.a, 127.0);
    EXPECT_EQ(reflected.b, 0.0);
    const Lab shifted = ShiftLab({50, 10, -10}, {52, 12, -20}, {60, -127, 0});
    EXPECT_DOUBLE_EQ(shifted.L, 58.0);
    EXPECT_DOUBLE_EQ(shifted.a, -128.0);
    EXPECT_DOUBLE_EQ(shifted.b, 10.0);
}

TEST(ChooseTargetWhite, OptionsOneAndTwoSetTheTargetAndAskTheCallerToStop) {
    ToolHandle handle;
    CIterativtoolDlg& tool = handle.Tool();
    tool.m_MeasWhite = {94, 0.5, -2};
    struct Case {
        int option;
        double paperL;
        Lab expected;
    };
    for (const Case& c : {Case{1, 98, {100, 1, -3}}, Case{1, 90, {93, 1, -3}}, Case{2, 90, {94, 0.5, -2}}}) {
        tool.m_OptimizeOption = c.option;
        tool.m_PaperWhite = {c.paperL, 1, -3};
        EXPECT_EQ(tool.ChooseTargetWhite(), 1);
        EXPECT_DOUBLE_EQ(tool.m_RefWhite.L, c.expected.L);
        EXPECT_DOUBLE_EQ(tool.m_RefWhite.a, c.expected.a);
        EXPECT_DOUBLE_EQ(tool.m_RefWhite.b, c.expected.b);
    }
}

// The smoothing's progress function: stops at the step `stopAt` (negative: never).
int g_stopAt = -1;
int StopAt(const char*, int step, int) { return g_stopAt >= 0 && step >= g_stopAt ? 1 : 0; }

TEST(SparseSmoothing, LeavesTheOuterLayerAndWeightedNodesAndAveragesTheRest) {
    TempDir dir;
    // A Lab-to-Lab table of 5 points with uneven node values.
    const LutSpec lut = MakeLut(
        3, 3, 5,
        [](const std::vector<int>& n, int out) {
            return static_cast<uint16_t>(20000 + 997 * ((n[0] * 7 + n[1] * 3 + n[2] * 5 + out * 11) % 13));
        },
        256, 256);
    for (const int stopAt : {-1, 1}) {
        CProfil p;
        WriteAndLoad(p, dir, "Lab ", {{"A2B1", Mft2Tag(lut)}, {"B2A1", Mft2Tag(lut)}});
        ASSERT_TRUE(p.SlotHolds(1));
        NodeAccumulators acc;
        ASSERT_TRUE(acc.Allocate(5, 3));
        acc.At(2, 2, 2).weight = 1.0;  // reached by a sample
        acc.At(1, 1, 1).weight = 0.5;  // touched, but not enough
        const std::vector<uint16_t> before = p.m_Clut[1];
        auto node = [](int i, int j, int k) { return ((i * 5 + j) * 5 + k) * 3; };
        // What the first replaced node must become: (25 V + its 27 neighbours) / 52, as they stood.
        double expected[3] = {0, 0, 0};
        for (int di = 0; di <= 2; ++di)
            for (int dj = 0; dj <= 2; ++dj)
                for (int dk = 0; dk <= 2; ++dk) {
                    double r[CProfil::kEvalSize] = {0, 0, 0, 0, double(di), double(dj), double(dk)};
                    ReadNodeLab(p, r, 1, false);
                    const double weight = di == 1 && dj == 1 && dk == 1 ? 26.0 : 1.0;
                    for (int c = 0; c < 3; ++c) expected[c] += weight * r[c] / 52.0;
                }

        g_stopAt = stopAt;
        EXPECT_EQ(SmoothSparseNodes(p, acc, StopAt), stopAt < 0 ? 1 : 0);
        g_stopAt = -1;
        for (int i = 0; i < 5; ++i)
            for (int j = 0; j < 5; ++j)
                for (int k = 0; k < 5; ++k) {
                    const bool outer = i % 4 == 0 || j % 4 == 0 || k % 4 == 0;
                    if (!outer && !(i == 2 && j == 2 && k == 2)) continue;
                    for (int c = 0; c < 3; ++c) EXPECT_EQ(p.m_Clut[1][node(i, j, k) + c], before[node(i, j, k) + c]);
                }
        EXPECT_NE(p.m_Clut[1][node(1, 1, 1)], before[node(1, 1, 1)]);
        if (stopAt == 1) {
            // Stopped after the first plane of the first sweep: node (1, 1, 1) was replaced once,
            // from the original values; the planes after it are as they were.
            double r[CProfil::kEvalSize] = {0, 0, 0, 0, 1, 1, 1};
            ReadNodeLab(p, r, 1, false);
            for (int c = 0; c < 3; ++c) EXPECT_NEAR(r[c], expected[c], 0.01);
            EXPECT_EQ(p.m_Clut[1][node(2, 1, 1)], before[node(2, 1, 1)]);
        }
    }
}

}  // namespace
}  // namespace vantrel::test
