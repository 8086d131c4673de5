// The inverse search (the direction-1 tables of real profiles against lcms2: real_profiles_test.cpp).
#include <gtest/gtest.h>

#include <random>

#include "eval/inverse.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

TEST(InverseSearch, KeepsOnlyStrictImprovements) {
    // L* = 60 - 24 c, a* = 40 m; yellow changes nothing, so no step of it is ever an improvement.
    TempDir dir;
    CProfil p;
    auto lab = [](const std::vector<double>& f) { return Lab{60 - 24 * f[0], 40 * f[1], 0}; };
    WriteAndLoad(p, dir, "CMYK", {{"A2B1", Mft2Tag(DeviceToLabLut(4, 2, lab))}});
    const double start[4] = {0, 0, 100, 0};
    const double wanted[4] = {127.5, 63.75, 100, 0};
    const Lab target = CmykLab(p, wanted);
    double result[4], delta = -1;
    InverseSearch(p, target.L, target.a, target.b, start, result, delta);
    EXPECT_LT(delta, 0.1);
    EXPECT_NEAR(result[0], 127.5, 0.3);
    EXPECT_NEAR(result[1], 63.75, 0.3);
    EXPECT_EQ(result[2], 100.0);
    EXPECT_EQ(result[3], 0.0);
}

class InverseSearchTest : public ::testing::Test {
protected:
    void SetUp() override {
        const std::string path = CorpusProfile("FOGRA39L").path;
        if (path.empty()) GTEST_SKIP() << "FOGRA39L.icc not built";
        ASSERT_TRUE(LoadProfile(p_, path));
    }
    CProfil p_;
};

TEST_F(InverseSearchTest, LandsOnReachableTargetsFromTheTableAnswer) {
    std::mt19937 rng(11);
    std::uniform_real_distribution<double> value(5, 250);
    DeltaStats table, searched;
    int stuck = 0;
    for (int i = 0; i < 300; ++i) {
        const double cmyk[4] = {value(rng), value(rng), value(rng), value(rng) * 0.6};
        const Lab target = CmykLab(p_, cmyk);
        double start[4] = {target.L * 2.55, target.a, target.b, 0};
        LabToCmyk(p_, start);
        start[3] = cmyk[3];  // the search keeps black: start from the black that reaches the target
        double result[4];
        double delta = -1;
        EXPECT_EQ(InverseSearch(p_, target.L, target.a, target.b, start, result, delta), result);
        EXPECT_NEAR(delta, Difference(CmykLab(p_, result), target), 1e-9);
        EXPECT_EQ(result[3], start[3]);
        table.Add(Difference(CmykLab(p_, start), target));
        searched.Add(delta);
        stuck += delta > 0.5;
    }
    table.Report("FOGRA39L table answer (black fixed)");
    searched.Report("FOGRA39L after InverseSearch");
    EXPECT_LT(searched.Mean(), 0.15);
    EXPECT_LE(stuck, 6);  // a few targets sit where the three free channels saturate
}

// A start that is already exact comes back unchanged.
TEST_F(InverseSearchTest, ReturnsTheStartWhenItCannotImprove) {
    const double start[4] = {40.0, 90.5, 12.25, 70.0};
    const Lab exact = CmykLab(p_, start);
    double result[4];
    double delta = -1;
    InverseSearch(p_, exact.L, exact.a, exact.b, start, result, delta);
    for (int c = 0; c < 4; ++c) EXPECT_EQ(result[c], start[c]);
    EXPECT_NEAR(delta, 0.0, 1e-12);
}

// A target far outside any press pushes the free channels to their limits, never past them.
TEST_F(InverseSearchTest, StaysInRangeWhenItCannotReach) {
    const double grey[4] = {128, 128, 128, 20};
    double result[4], delta = -1;
    InverseSearch(p_, 50, 120, -120, grey, result, delta);
    for (int c = 0; c < 3; ++c) {
        EXPECT_GE(result[c], 0.0);
        EXPECT_LE(result[c], 255.0);
    }
    EXPECT_EQ(result[3], 20.0);
    EXPECT_NEAR(delta, Difference(CmykLab(p_, result), Lab{50, 120, -120}), 1e-9);
}

}  // namespace
}  // namespace vantrel
