// analyse1 through the C interface on an Argyll-built FOGRA39 profile.
#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <random>

#include "analysis/analyse1_search.h"
#include "helpers/test_paths.h"
#include "helpers/tool_handle.h"

using namespace vantrel::test;

namespace {

class Analyse1 : public ::testing::Test {
protected:
    void SetUp() override {
        profile = FixtureProfile("FOGRA39L");
        if (profile.empty()) GTEST_SKIP() << "no Argyll fixture";
    }

    // Lab x 1000 of CMYK percentages, through the same profile.
    std::array<int, 3> LabOf(std::array<int, 4> cmyk) {
        std::array<int, 3> lab{}, xyz{};
        Cmyk2Lab_Double(handle, profile.c_str(), 1, cmyk.data(), 0, lab.data(), 0, xyz.data());
        return lab;
    }
    // The colour difference to target of device values x 1000, through whole percentages.
    double ErrorOf(const std::array<int, 7>& values, const std::array<int, 3>& target) {
        std::array<int, 4> percent;
        for (int c = 0; c < 4; ++c) percent[c] = static_cast<int>(std::lround(values[c] / 2550.0));
        const auto lab = LabOf(percent);
        return std::hypot((lab[0] - target[0]) / 1000.0, (lab[1] - target[1]) / 1000.0, (lab[2] - target[2]) / 1000.0);
    }
    std::array<int, 7> Run(std::array<int, 3> target, std::array<int, 7> values) {
        EXPECT_EQ(analyse1(handle, profile.c_str(), target.data(), values.data()), 0);
        return values;
    }

    std::string profile;
    ToolHandle tool;
    void* handle = tool.h;
};

}  // namespace

TEST_F(Analyse1, AOneInkColourIsFoundWithThatInkAlone) {
    const auto values = Run(LabOf({0, 60, 0, 0}), {25500, 25500, 25500, 25500, 0, 0, 0});
    EXPECT_EQ(values[0] + values[2] + values[3], 0);
    EXPECT_NEAR(values[1] / 1000.0, 0.60 * 255, 2.0);
    EXPECT_EQ(values[4] + values[5] + values[6], 0);  // a four-colour profile never moves 4..6
}

TEST_F(Analyse1, TheAnswerIsNeverFartherFromTheTargetThanTheStart) {
    std::mt19937 random(3);
    std::uniform_int_distribution<int> percent(0, 100);
    for (int n = 0; n < 4; ++n) {
        const auto target = LabOf({percent(random), percent(random), percent(random), percent(random) / 2});
        std::array<int, 7> start{};
        for (int c = 0; c < 4; ++c) start[c] = percent(random) * 2550;
        // Compared through whole percentages, so allow their rounding.
        EXPECT_LE(ErrorOf(Run(target, start), target), ErrorOf(start, target) + 1.5);
    }
}

TEST_F(Analyse1, AStartBelowOneDeviceStepComesBackAsZeros) {
    const auto target = LabOf({20, 30, 40, 10});
    EXPECT_EQ(Run(target, {}), (std::array<int, 7>{}));
    EXPECT_EQ(Run(target, {900, 500, 999, 0, 0, 0, 0}), (std::array<int, 7>{}));
}

TEST_F(Analyse1, ValuesComeBackTruncatedNotRounded) {
    const auto target = LabOf({33, 47, 12, 5});
    const std::array<int, 7> start = {50000, 50000, 50000, 20000, 0, 0, 0};
    const auto values = Run(target, start);
    // The same search inside: the export writes trunc(v x 1000).
    tool.Tool().LoadPaperProfile(false);
    const double t[3] = {target[0] / 1000.0, target[1] / 1000.0, target[2] / 1000.0};
    double from[7], found[7], err = 1000;
    for (int c = 0; c < 7; ++c) from[c] = start[c] / 1000.0;
    vantrel::Analyse1Search(*tool.Tool().m_Paperprof, t, from, err, true, found);
    tool.Tool().m_Paperprof->Release();
    for (int c = 0; c < 7; ++c) EXPECT_EQ(values[c], static_cast<int>(found[c] * 1000)) << c;
}
