// The proof report's own sums: dE2000 against the published test pairs of Sharma, Wu and Dalal
// (Color Res. Appl. 30, 2005), dH*ab, the patch sets by device values, and the checks' verdicts.
#include <gtest/gtest.h>

#include <cmath>

#include "proof_report.h"

using namespace vantrel::cli;

TEST(ProofReportSums, DeltaE2000MatchesThePublishedPairs) {
    struct Pair { Lab3 x, y; double expected; };
    const Pair pairs[] = {
        {{50, 2.6772, -79.7751}, {50, 0, -82.7485}, 2.0425},
        {{50, -1.3802, -84.2814}, {50, 0, -82.7485}, 1.0000},
        {{50, 0, 0}, {50, -1, 2}, 2.3669},
        {{50, 2.49, -0.001}, {50, -2.49, 0.0011}, 7.2195},
        {{60.2574, -34.0099, 36.2677}, {60.4626, -34.1751, 39.4387}, 1.2644},
        {{22.7233, 20.0904, -46.694}, {23.0331, 14.973, -42.5619}, 2.0373},
        {{90.9257, -0.5406, -0.9208}, {88.6381, -0.8985, -0.7239}, 1.5381},
        {{2.0776, 0.0795, -1.135}, {0.9033, -0.0636, -0.5514}, 0.9082},
    };
    for (const Pair& p : pairs) {
        EXPECT_NEAR(DeltaE2000(p.x, p.y), p.expected, 1e-4);
        EXPECT_NEAR(DeltaE2000(p.y, p.x), p.expected, 1e-4);
    }
}

TEST(ProofReportSums, HueDifferenceIsWhatLightnessAndChromaLeave) {
    // Same lightness and chroma, a quarter turn apart: all of dE*ab is hue.
    EXPECT_NEAR(DeltaHue({50, 20, 0}, {50, 0, 20}), std::sqrt(800.0), 1e-9);
    // Only lightness and chroma differ: no hue difference.
    EXPECT_NEAR(DeltaHue({50, 20, 0}, {60, 30, 0}), 0.0, 1e-6);
}

TEST(ProofReportSums, PatchSetsByDeviceValues) {
    struct Case { PatchSet set; std::vector<double> cmyk; bool in; };
    const Case cases[] = {
        {PatchSet::Paper, {0, 0, 0, 0}, true},        {PatchSet::Paper, {0, 0, 0, 3}, false},
        {PatchSet::PrimarySolids, {100, 0, 0, 0}, true}, {PatchSet::PrimarySolids, {0, 0, 0, 100}, true},
        {PatchSet::PrimarySolids, {100, 100, 0, 0}, false}, {PatchSet::PrimarySolids, {70, 0, 0, 0}, false},
        {PatchSet::GreyBalance, {50, 40, 40, 0}, true}, {PatchSet::GreyBalance, {75, 66, 66, 0}, true},
        {PatchSet::GreyBalance, {50, 40, 40, 10}, false}, {PatchSet::GreyBalance, {50, 30, 40, 0}, false},
        {PatchSet::GreyBalance, {100, 100, 100, 0}, false}, {PatchSet::All, {}, true},
        {PatchSet::Paper, {0, 0, 0}, false},  // RGB charts have no CMYK sets
    };
    for (const Case& c : cases) EXPECT_EQ(InSet(c.set, c.cmyk), c.in) << static_cast<int>(c.set);
}

TEST(ProofReportSums, ChecksPassAtTheirLimitAndSayWhenAChartHasNoSuchPatches) {
    auto patch = [](std::vector<double> cmyk, Lab3 ref, Lab3 proof) {
        ReportPatch p;
        p.device = std::move(cmyk);
        p.reference = ref;
        p.proof = proof;
        p.dE76 = DeltaE76(ref, proof);
        p.dH = DeltaHue(ref, proof);
        p.dE2000 = DeltaE2000(ref, proof);
        return p;
    };
    // Paper off by exactly 3 (the limit), cyan solid off by 6 in lightness only.
    const std::vector<ReportPatch> patches = {
        patch({0, 0, 0, 0}, {95, 0, -2}, {92, 0, -2}),
        patch({100, 0, 0, 0}, {55, -37, -50}, {49, -37, -50}),
    };
    const auto results = RunChecks(patches);
    ASSERT_EQ(results.size(), ProofTolerances().size());
    auto find = [&](const std::string& name) {
        for (const auto& r : results) if (name == r.tolerance->check) return r;
        ADD_FAILURE() << name;
        return results[0];
    };
    EXPECT_TRUE(find("Paper white").pass);
    EXPECT_NEAR(find("All patches, mean").value, 4.5, 1e-9);
    EXPECT_FALSE(find("All patches, mean").pass);
    EXPECT_FALSE(find("Primary solids, dE").pass);
    EXPECT_TRUE(find("Primary solids, dH").pass);
    EXPECT_EQ(find("Grey balance, mean dH").count, 0);
    EXPECT_FALSE(find("Grey balance, mean dH").pass);
}
