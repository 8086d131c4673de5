// Folding a multi-colourant separation into a CMYK profile, through the export.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <filesystem>

#include "colour/colour_math.h"
#include "eval/forward.h"
#include "eval/inverse.h"
#include "helpers/icc_builder.h"
#include "helpers/multi_ink_profiles.h"
#include "helpers/test_paths.h"
#include "helpers/tool_handle.h"
#include "optimise/merge_extra_channels.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// Lab to seven channels giving the same separation for every colour.
std::string ConstantSeparation(const TempDir& dir, const std::array<uint16_t, 7>& inks) {
    const LutSpec lut = MakeLut(3, 7, 2, [inks](const std::vector<int>&, int out) { return inks[out]; });
    return WriteFile(dir.File("constant.icc"), IccBuilder("7CLR", "Lab ").AddTag("B2A1", Mft2Tag(lut)).Build());
}

// Mean colour difference of Lab -> device -> Lab over a lattice through a profile's two tables.
double RoundTrip(const std::string& path, const char* a2b, const char* b2a) {
    CProfil p;
    p.ReadTagTable(0, path);
    p.LoadLut(0, a2b, path);
    p.ReadTagTable(1, path);
    p.LoadLut(1, b2a, path);
    double sum = 0;
    int count = 0;
    for (int L = 30; L <= 90; L += 15)
        for (int a = -30; a <= 30; a += 15)
            for (int b = -30; b <= 30; b += 15) {
                double v[CProfil::kEvalSize] = {L * kLightnessScale, double(a), double(b)};
                LabToCmyk(p, v);
                CmykToLab(p, v);
                sum += DeltaE(v[0] / kLightnessScale, v[1], v[2], L, a, b);
                ++count;
            }
    return sum / count;
}

}  // namespace

TEST(MergeExtraChannels, TheSharedPartGoesToBlackAndTheRestToTheProcessInks) {
    struct Case {
        const char* what;
        std::array<double, 7> in, out;
    } cases[] = {
        {"red alone", {0, 0, 0, 0, 255, 0, 0}, {0, 255, 255, 0}},
        {"no extras", {10, 20, 30, 40, 0, 0, 0}, {10, 20, 30, 40}},
        {"orange and green", {0, 0, 0, 0, 50, 60, 0}, {60, 50, 110, 0}},
        {"equal red, green, blue", {0, 0, 0, 10, 102, 102, 102}, {0, 0, 0, 112}},
        {"black with little room", {0, 0, 0, 240, 40, 40, 40}, {50, 50, 50, 255}},
        {"sums held at 255", {200, 0, 0, 0, 0, 100, 0}, {255, 0, 100, 0}},
    };
    for (const Case& c : cases) {
        double x[7];
        std::copy(c.in.begin(), c.in.end(), x);
        MergeExtraChannels(x);
        for (int k = 0; k < 4; ++k) EXPECT_DOUBLE_EQ(x[k], c.out[k]) << c.what << " channel " << k;
    }
}

// A reference that prints every colour with red alone turns every separation node into magenta
// plus yellow; only CLUT bytes change, and the result is a profile lcms2 opens.
TEST(MergeIntoCmyk, AReferenceOfRedAloneBecomesMagentaAndYellow) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    TempDir dir;
    ToolHandle tool;
    const std::string out = dir.File("merged.icc");
    ASSERT_EQ(mergeMCHintoCMYK(tool.h, ConstantSeparation(dir, {0, 0, 0, 0, 65535, 0, 0}).c_str(), fogra.c_str(),
                               out.c_str()),
              0);
    EXPECT_EQ(tool.Tool().m_UseIntent0, 1);
    CProfil merged;
    merged.ReadTagTable(1, out);
    for (const char* tag : {"B2A0", "B2A1"}) {
        ASSERT_EQ(merged.LoadLut(1, tag, out), 1);
        for (size_t k = 0; k < merged.m_Clut[1].size(); ++k)
            ASSERT_NEAR(merged.m_Clut[1][k], k % 4 == 1 || k % 4 == 2 ? 65535 : 0, 1) << tag << " value " << k;
    }
    // Every byte that changed lies in the CLUT of one of the four tables.
    std::vector<std::pair<int64_t, int64_t>> cluts;
    for (const auto& [direction, tag] : {std::pair{0, "A2B0"}, {0, "A2B1"}, {1, "B2A0"}, {1, "B2A1"}}) {
        CProfil p;
        p.ReadTagTable(direction, fogra);
        ASSERT_EQ(p.LoadLut(direction, tag, fogra), 1);
        const int64_t at = p.FindClutOffset(direction, fogra);
        cluts.emplace_back(at, at + 2 * static_cast<int64_t>(p.m_Clut[direction].size()));
    }
    const Bytes before = ReadFile(fogra), after = ReadFile(out);
    ASSERT_EQ(before.size(), after.size());
    for (size_t k = 0; k < before.size(); ++k) {
        if (before[k] == after[k]) continue;
        const bool inClut = std::any_of(cluts.begin(), cluts.end(), [k](auto r) { return int64_t(k) >= r.first && int64_t(k) < r.second; });
        ASSERT_TRUE(inClut) << "byte " << k;
    }
    cmsHPROFILE opened = cmsOpenProfileFromFile(out.c_str(), "r");
    EXPECT_NE(opened, nullptr);
    if (opened) cmsCloseProfile(opened);
}

// A seven-colourant separation folded into a CMYK profile of the same process inks: the merged
// separation table holds the folded separation, and the merged colour table what that prints, so
// their round trip applies the fold twice: it matches the fold applied twice to the input
// profile's own tables (the fold itself costs what red, green and blue ink differ from their
// two-ink overprints).
TEST(MergeIntoCmyk, TheMergedTablesApplyTheFoldedSeparation) {
    TempDir dir;
    ToolHandle tool;
    const std::string reference = MultiInkProfile(InkSet::kCmykRGB), cmyk = MultiInkProfile(InkSet::kCmyk);
    const std::string out = dir.File("merged.icc");
    ASSERT_EQ(mergeMCHintoCMYK(tool.h, reference.c_str(), cmyk.c_str(), out.c_str()), 0);
    CProfil ref, input;
    for (auto [p, path] : {std::pair{&ref, reference}, std::pair{&input, cmyk}}) {
        p->ReadTagTable(0, path);
        p->LoadLut(0, "A2B1", path);
        p->ReadTagTable(1, path);
        p->LoadLut(1, "B2A1", path);
    }
    // The colour the folded separation of `lab` (scaled) prints on the input profile.
    auto fold = [&](double* lab) {
        double s[CProfil::kEvalSize] = {lab[0], lab[1], lab[2]};
        LabToMulti(ref, s);
        MergeExtraChannels(s);
        for (int c = 4; c < CProfil::kEvalSize; ++c) s[c] = 0;
        CmykToLab(input, s);
        std::copy(s, s + 3, lab);
    };
    double twice = 0;
    int count = 0;
    for (int L = 30; L <= 90; L += 15)
        for (int a = -30; a <= 30; a += 15)
            for (int b = -30; b <= 30; b += 15, ++count) {
                double v[3] = {L * kLightnessScale, double(a), double(b)};
                fold(v);
                fold(v);
                twice += DeltaE(v[0] / kLightnessScale, v[1], v[2], L, a, b);
            }
    twice /= count;
    for (const auto& [a2b, b2a] : {std::pair{"A2B1", "B2A1"}, std::pair{"A2B0", "B2A0"}}) {
        const double merged = RoundTrip(out, a2b, b2a);
        std::printf("[ merge    ] round trip %s/%s %.2f dE76; input profile %.2f, fold applied twice %.2f\n", a2b, b2a,
                    merged, RoundTrip(cmyk, "A2B1", "B2A1"), twice);
        EXPECT_NEAR(merged, twice, 1.0) << a2b;
    }
}

TEST(MergeIntoCmyk, ProfilesThatCannotBeMergedWriteNothing) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    TempDir dir;
    const std::string noB2A = WriteFile(dir.File("nob2a.icc"),
        IccBuilder("7CLR", "Lab ").AddTag("A2B1", Mft2Tag(MakeLut(7, 3, 2, [](const std::vector<int>&, int) { return uint16_t{0}; }))).Build());
    const std::string out = dir.File("out.icc");
    const struct {
        const char* what;
        std::string ref, paper;
    } cases[] = {
        {"reference without B2A1", noB2A, fogra},
        {"missing reference", dir.File("absent.icc"), fogra},
        {"paper not CMYK", MultiInkProfile(InkSet::kCmykRGB), MultiInkProfile(InkSet::kCmykRGB)},
        {"missing paper", MultiInkProfile(InkSet::kCmykRGB), dir.File("absent.icc")},
    };
    for (const auto& c : cases) {
        ToolHandle tool;
        EXPECT_EQ(mergeMCHintoCMYK(tool.h, c.ref.c_str(), c.paper.c_str(), out.c_str()), -1) << c.what;
        EXPECT_FALSE(std::filesystem::exists(out)) << c.what;
    }
    EXPECT_EQ(mergeMCHintoCMYK(nullptr, "", "", ""), 1);
}
