// The constrained device searches: one case per rule on tables of known colours, and the ranged
// search on a real press profile.
#include <gtest/gtest.h>

#include <random>

#include "eval/device_search.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

// The grid search with its request written out in the order of its fields.
void GridSearch(CProfil& p, const double* target, const double* start, double blackLow, double blackHigh,
                double& delta, double step, int limit, const int* flags, bool lightnessRule, double* best) {
    GridSearchRequest r;
    r.target = target;
    r.start = start;
    r.blackLow = blackLow;
    r.blackHigh = blackHigh;
    r.step = step;
    r.limit = limit;
    r.flags = flags;
    r.lightnessRule = lightnessRule;
    ConstrainedGridSearch(p, r, delta, best);
}

// L* = 60 - 24 c, a* = 40 m, b* = 40 y (fractions of the device values); black does nothing.
// On the 12.75 lattice: L* = 60 - 1.2 i, a* = 2 j, b* = 2 k.
class SearchOnRamps : public ::testing::Test {
protected:
    void SetUp() override {
        auto ramps = [](const std::vector<double>& f) { return Lab{60 - 24 * f[0], 40 * f[1], 40 * f[2]}; };
        WriteAndLoad(p_, dir_, "CMYK", {{"A2B1", Mft2Tag(DeviceToLabLut(4, 2, ramps))}});
    }
    // The difference from the target to the colour of a device vector.
    double To(const double* target, const double* device) {
        return Difference(CmykLab(p_, device), Lab{target[0], target[1], target[2]});
    }
    TempDir dir_;
    CProfil p_;
    const int allChroma_[7] = {1, 1, 1, 0, 0, 0, 0};
    const double start_[7] = {106.25, 0, 0, 0, 0, 0, 0};  // L* 50, a* = b* = 0
    // Lattice colours near it: L* 40.8 (i = 16) and 39.6 (i = 17, closer but darker).
    const double target_[3] = {40.1, 21.0, 20.0};
};

TEST_F(SearchOnRamps, LightnessRuleRefusesACloserColourDarkerThanTargetAndStart) {
    for (bool rule : {false, true}) {
        double best[7];
        double delta = To(target_, start_);
        GridSearch(p_, target_, start_, 0, 0, delta, 12.75, 3, allChroma_, rule, best);
        EXPECT_DOUBLE_EQ(best[0], 12.75 * (rule ? 16 : 17)) << rule;
        EXPECT_DOUBLE_EQ(best[1], 12.75 * 10) << rule;
        EXPECT_DOUBLE_EQ(best[2], 12.75 * 10) << rule;
        EXPECT_NEAR(delta, To(target_, best), 1e-9);
    }
}

TEST_F(SearchOnRamps, ACandidateOnlyAsGoodAsTheBestIsNotTaken) {
    // On the lattice of step 255 every point is a node and black changes nothing: both black
    // values of the answer give the same colour to the last bit, and the first one found stays.
    const int withBlack[7] = {1, 1, 1, 1, 0, 0, 0};
    double best[7];
    double delta = To(target_, start_);
    GridSearch(p_, target_, start_, 0, 255, delta, 255, 4, withBlack, false, best);
    EXPECT_EQ(std::vector<double>(best, best + 4), (std::vector<double>{255, 0, 0, 0}));
}

TEST_F(SearchOnRamps, AnswersStayCloserToTheStartColourThanTheIncomingError) {
    double best[7];
    double delta = 5.0;  // nothing within 5 of the start improves on it
    GridSearch(p_, target_, start_, 0, 0, delta, 12.75, 3, allChroma_, false, best);
    EXPECT_EQ(std::vector<double>(best, best + 7), std::vector<double>(start_, start_ + 7));
    EXPECT_NEAR(delta, To(target_, start_), 1e-9);
}

TEST_F(SearchOnRamps, BlackAloneWithOneValueGivesThatVector) {
    const int blackOnly[7] = {0, 0, 0, 1, 0, 0, 0};
    const double from[7] = {10, 10, 10, 0, 0, 0, 0};
    const double target[3] = {60.1, -0.1, -0.1};  // just past (60, 0, 0) seen from the start
    double best[7];
    double delta = To(target, from);
    GridSearch(p_, target, from, 51, 51, delta, 12.25, 3, blackOnly, false, best);
    EXPECT_EQ(std::vector<double>(best, best + 7), (std::vector<double>{0, 0, 0, 51, 0, 0, 0}));
    EXPECT_NEAR(delta, std::sqrt(0.03), 0.01);  // a* = 0 is stored as 32768 / 257 - 127.5
}

TEST_F(SearchOnRamps, DescentMovesOnlyFlaggedChannelsWithinTheChannelLimit) {
    const double target[3] = {45.0, 20.0, 0.0};  // c = 159.375, m = 127.5
    const int cyanMagenta[7] = {1, 1, 0, 0, 0, 0, 0};
    double best[7];
    double delta = -1;
    ConstrainedDescent(p_, target, start_, delta, 3, cyanMagenta, false, best);
    EXPECT_LT(delta, 0.1);
    EXPECT_NEAR(best[0], 159.375, 0.2);
    EXPECT_NEAR(best[1], 127.5, 0.2);
    EXPECT_EQ(best[2], 0.0);
    EXPECT_EQ(best[3], 0.0);
    EXPECT_NEAR(delta, To(target, best), 1e-9);
    // With one channel allowed, magenta may not join cyan.
    ConstrainedDescent(p_, target, start_, delta, 1, cyanMagenta, false, best);
    EXPECT_EQ(best[1], 0.0);
    EXPECT_NEAR(best[0], 159.375, 0.2);
}

TEST_F(SearchOnRamps, ScansKeepTheLastOfEqualValuesAndRangedDescentRespectsItsBounds) {
    const double target[3] = {50.0, 0.0, 0.0};
    const double v[4] = {106.25, 30, 40, 50};
    // Black changes nothing: every value is as good, the last one wins.
    EXPECT_EQ(ScanChannel(p_, target, v, 3, 10, 100), 100.0);
    EXPECT_EQ(ScanChannel(p_, target, v, 1, 0, 0), 0.0);  // magenta: a* = 0 only at 0
    // A channel at the lower bound never moves, however much it would help.
    const double from[4] = {0, 30, 40, 50};
    const int flags[4] = {1, 1, 1, 1};
    double best[4];
    double delta = -1;
    RangedDescent(p_, target, from, 0, 255, delta, flags, best);
    EXPECT_EQ(best[0], 0.0);
    EXPECT_LT(best[1], 30.0);
}

// L* = 80 - 30 c0 - 30 c-partner on seven colourants: reaching L* 20 needs both together.
TEST(ConstrainedSearch, RefusedColourantPairsAreNeverAnswered) {
    TempDir dir;
    for (int partner : {4, 1}) {
        CProfil p;
        auto lab = [partner](const std::vector<double>& f) { return Lab{80 - 30 * f[0] - 30 * f[partner], 0, 0}; };
        WriteAndLoad(p, dir, "MCH7", {{"A2B1", Mft2Tag(DeviceToLabLut(7, 2, lab))}});
        ASSERT_EQ(p.m_Lut[0].inputChannels, 7);
        const double start[7] = {0, 0, 0, 0, 0, 0, 0};
        const int flags[7] = {1, 1, 1, 1, 1, 1, 1};
        const double target[3] = {20, 0, 0};
        double best[7];
        double delta = 60.5;  // the ball around the start must reach the target
        GridSearch(p, target, start, 0, 255, delta, 85, 3, flags, false, best);
        if (partner == 4) {
            // Colourants 0 and 4 (bit sum 17) never print together, with or without black.
            EXPECT_FALSE(best[0] > 0 && best[4] > 0);
            EXPECT_NEAR(delta, 30.0, 0.05);
        } else {
            EXPECT_EQ(best[0], 255.0);  // 0 and 1 may: the exact answer
            EXPECT_EQ(best[1], 255.0);
            EXPECT_NEAR(delta, 0.0, 0.05);
        }
    }
}

TEST(RangedSearch, ReachesPressColoursAndReportsTheErrorOfItsAnswer) {
    const std::string path = CorpusProfile("FOGRA39L").path;
    if (path.empty()) GTEST_SKIP() << "FOGRA39L.icc not built";
    CProfil p;
    ASSERT_TRUE(LoadProfile(p, path));
    std::mt19937 rng(5);
    std::uniform_real_distribution<double> value(20, 235);
    DeltaStats stats;
    for (int t = 0; t < 40; ++t) {
        const double cmyk[4] = {value(rng), value(rng), value(rng), value(rng)};
        const Lab target = CmykLab(p, cmyk);
        const double wanted[3] = {target.L, target.a, target.b};
        const double start[4] = {128, 128, 128, 128};
        double best[4];
        double delta = -1;
        RangedSearch(p, wanted, start, 0, 255, delta, best);
        EXPECT_NEAR(delta, Difference(CmykLab(p, best), target), 1e-9);
        stats.Add(delta);
    }
    stats.Report("FOGRA39L RangedSearch from mid grey");
    EXPECT_LT(stats.Mean(), 0.3);
}

}  // namespace
}  // namespace vantrel
