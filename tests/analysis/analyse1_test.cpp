// analyse1 through the C interface on an Argyll-built FOGRA39 profile.
#include <gtest/gtest.h>

#include <cmath>
#include <random>

#include "analysis/analyse1_search.h"
#include "helpers/test_paths.h"
#include "interface/tool_object.h"
#include "vantrel.h"

using namespace vantrel::test;

namespace {

int Quiet(const char*, int, int) { return 0; }

class Analyse1 : public ::testing::Test {
protected:
    void SetUp() override {
        profile = FixtureProfile("FOGRA39L");
        if (profile.empty()) GTEST_SKIP() << "no Argyll fixture";
        dllInit(Quiet, &handle, nullptr);
    }
    void TearDown() override { dllFree(handle); }

    // Lab x 1000 of CMYK percentages, through the same profile.
    std::array<int, 3> LabOf(std::array<int, 4> cmyk) {
        std::array<int, 3> lab{}, xyz{};
        Cmyk2Lab_Double(handle, profile.c_str(), 1, cmyk.data(), 0, lab.data(), 0, xyz.data());
        return lab;
    }
    double ErrorOf(const int* values, const std::array<int, 3>& target) {
        std::array<int, 4> percent;
        for (int c = 0; c < 4; ++c) percent[c] = static_cast<int>(std::lround(values[c] / 2550.0));
        const auto lab = LabOf(percent);
        double sum = 0;
        for (int k = 0; k < 3; ++k) sum += std::pow((lab[k] - target[k]) / 1000.0, 2);
        return std::sqrt(sum);
    }

    std::string profile;
    void* handle = nullptr;
};

}  // namespace

TEST_F(Analyse1, AOneInkColourIsFoundWithThatInkAlone) {
    auto target = LabOf({0, 60, 0, 0});
    int values[7] = {25500, 25500, 25500, 25500, 0, 0, 0};
    ASSERT_EQ(analyse1(handle, profile.c_str(), target.data(), values), 0);
    EXPECT_EQ(values[0], 0);
    EXPECT_EQ(values[2], 0);
    EXPECT_EQ(values[3], 0);
    EXPECT_NEAR(values[1] / 1000.0, 0.60 * 255, 2.0);
    EXPECT_EQ(values[4] + values[5] + values[6], 0);  // a four-colour profile never moves 4..6
}

TEST_F(Analyse1, TheAnswerIsNeverFartherFromTheTargetThanTheStart) {
    std::mt19937 random(3);
    std::uniform_int_distribution<int> percent(0, 100);
    for (int n = 0; n < 4; ++n) {
        auto target = LabOf({percent(random), percent(random), percent(random), percent(random) / 2});
        int start[7] = {};
        for (int c = 0; c < 4; ++c) start[c] = percent(random) * 2550;
        int values[7];
        std::copy(start, start + 7, values);
        ASSERT_EQ(analyse1(handle, profile.c_str(), target.data(), values), 0);
        // Compared through whole percentages, so allow their rounding.
        EXPECT_LE(ErrorOf(values, target), ErrorOf(start, target) + 1.5);
    }
}

TEST_F(Analyse1, AnAllZeroStartComesBackAsZeros) {
    auto target = LabOf({20, 30, 40, 10});
    int values[7] = {0, 0, 0, 0, 0, 0, 0};
    ASSERT_EQ(analyse1(handle, profile.c_str(), target.data(), values), 0);
    for (int v : values) EXPECT_EQ(v, 0);
    // Values below one device step count as zero too.
    int small[7] = {900, 500, 999, 0, 0, 0, 0};
    ASSERT_EQ(analyse1(handle, profile.c_str(), target.data(), small), 0);
    for (int v : small) EXPECT_EQ(v, 0);
}

TEST_F(Analyse1, ValuesComeBackTruncatedNotRounded) {
    auto target = LabOf({33, 47, 12, 5});
    int values[7] = {50000, 50000, 50000, 20000, 0, 0, 0};
    int copy[7];
    std::copy(values, values + 7, copy);
    ASSERT_EQ(analyse1(handle, profile.c_str(), target.data(), values), 0);
    // The same search inside: the export writes trunc(v x 1000).
    auto& tool = *static_cast<vantrel::CIterativtoolDlg*>(handle);
    tool.m_PaperName = profile;
    tool.LoadPaperProfile(false);
    const double t[3] = {target[0] / 1000.0, target[1] / 1000.0, target[2] / 1000.0};
    double start[7], found[7], err = 1000;
    for (int c = 0; c < 7; ++c) start[c] = copy[c] / 1000.0;
    vantrel::Analyse1Search(*tool.m_Paperprof, t, start, err, true, found);
    tool.m_Paperprof->Release();
    for (int c = 0; c < 7; ++c) EXPECT_EQ(values[c], static_cast<int>(found[c] * 1000)) << c;
}

TEST(Analyse1Handle, NullHandleLeavesValuesUntouched) {
    int lab[3] = {50000, 0, 0};
    int values[7] = {1, 2, 3, 4, 5, 6, 7};
    EXPECT_EQ(analyse1(nullptr, "p.icc", lab, values), 1);
    EXPECT_EQ(values[6], 7);
}
