// The simulated proof loop on a small chart: the model profiles Argyll builds, the measurement
// files the library reads, and each corrector over a few passes.
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>
#include <string>

#include "argyll_tools.h"
#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "it8/measured_it8.h"
#include "proof_loop.h"
#include "proofer_model.h"

using namespace vantrel::proofloop;
using vantrel::test::FixtureDir;
using vantrel::test::TempDir;

namespace {

const char* const kPressData = "/usr/share/color/icc/FOGRA39L.ti3";

// Argyll's tools, the press profile and the model profiles (colprof -ql, cached beside the
// fixtures); the reason when something is missing.
struct LoopFixture {
    ArgyllTools tools = FindArgyllTools();
    std::string reference = vantrel::test::FixtureProfile("FOGRA39L");
    ModelProfiles model;
    std::string skip;

    LoopFixture() {
        if (!tools.Complete()) {
            skip = "Argyll's " + tools.Missing() + " not on PATH; the proof loop needs xicclu, colprof and refine";
        } else if (reference.empty()) {
            skip = "no FOGRA39L.icc fixture (tools/make_fixtures.sh builds it)";
        } else {
            model = BuildModelProfiles(tools, kPressData, ProoferModel{}, 'l', FixtureDir() + "proof_loop");
        }
    }

    LoopSettings Settings(Corrector corrector, int passes, const std::string& workDir) const {
        LoopSettings settings;
        settings.pressTi3 = kPressData;
        settings.referenceProfile = reference;
        settings.prooferProfile = model.proofer;
        settings.todayProfile = model.today;
        settings.workDir = workDir;
        settings.chartStep = 8;
        settings.passes = passes;
        settings.noise = 0.2;
        settings.seed = 14;
        settings.corrector = corrector;
        return settings;
    }
};

// Byte range [first, end) of a tag's data (whole = false: of the CLUT of an mft2 tag).
std::pair<size_t, size_t> TagBytes(const vantrel::test::Bytes& b, const char* tag, bool whole) {
    using namespace vantrel::test;
    for (size_t i = 0; i < GetU32(b, 128); ++i) {
        if (!std::equal(tag, tag + 4, b.begin() + static_cast<long>(TagRecord(i)))) continue;
        const size_t at = TagOffset(b, i);
        if (whole) return {at, at + GetU32(b, TagRecord(i) + 8)};
        const size_t inputs = b[at + 8], grid = b[at + 10];
        const size_t first = at + 52 + 2 * inputs * (size_t{b[at + 48]} << 8 | b[at + 49]);
        return {first, first + 2 * b[at + 9] * static_cast<size_t>(std::pow(grid, inputs))};
    }
    return {0, 0};
}

// True when the two files differ only inside the B2A1 CLUT (and the media white tag, if asked).
bool OnlyTableBytesDiffer(const std::string& before, const std::string& after, bool white) {
    const vantrel::test::Bytes a = vantrel::test::ReadFile(before), b = vantrel::test::ReadFile(after);
    if (a.size() != b.size() || a.empty()) return false;
    const auto clut = TagBytes(a, "B2A1", false), wtpt = TagBytes(a, "wtpt", true);
    bool changed = false;
    for (size_t i = 0; i < a.size(); ++i) {
        if (a[i] == b[i]) continue;
        const bool inClut = i >= clut.first && i < clut.second;
        if (!inClut && !(white && i >= wtpt.first && i < wtpt.second)) return false;
        changed = changed || inClut;
    }
    return changed;
}

double DeltaE(const Triple& a, const Triple& b) {
    return std::sqrt((a[0] - b[0]) * (a[0] - b[0]) + (a[1] - b[1]) * (a[1] - b[1]) + (a[2] - b[2]) * (a[2] - b[2]));
}

}  // namespace

TEST(ProofLoop, TodaysProoferDriftsFromTheProfiledOneAsModelled) {
    LoopFixture fixture;
    if (!fixture.skip.empty()) GTEST_SKIP() << fixture.skip;
    ASSERT_EQ(fixture.model.error, "");
    TempDir dir;
    // Paper, a magenta mid-tone and a neutral mid-tone, through xicclu on the two profiles.
    std::vector<Quad> patches{{0, 0, 0, 0}, {0, 50, 0, 0}, {40, 30, 30, 10}};
    auto proofer = LookUpLab(fixture.tools.xicclu, fixture.model.proofer, {"-ff", "-ia"}, patches, dir.Path());
    auto today = LookUpLab(fixture.tools.xicclu, fixture.model.today, {"-ff", "-ia"}, patches, dir.Path());
    auto press = LookUpLab(fixture.tools.xicclu, fixture.reference, {"-ff", "-ia"}, patches, dir.Path());
    ASSERT_EQ(proofer.size(), 3u);
    ASSERT_EQ(today.size(), 3u);
    ASSERT_EQ(press.size(), 3u);
    EXPECT_GT(DeltaE(proofer[0], press[0]), 1.0) << "another paper than the press";
    EXPECT_GT(DeltaE(today[0], proofer[0]), 0.2) << "the paper white moved";
    EXPECT_LT(DeltaE(today[0], proofer[0]), 1.0) << "by under 1 dE";
    EXPECT_LT(today[1][0], proofer[1][0] - 1.0) << "more magenta dot gain: darker";
    EXPECT_GT(DeltaE(today[2], proofer[2]), 1.0) << "a cast in the mid-tones";
    EXPECT_LT(DeltaE(today[2], proofer[2]), 3.0);
}

TEST(ProofLoop, ItsMeasurementFilesAreReadByTheLibrary) {
    LoopFixture fixture;
    if (!fixture.skip.empty()) GTEST_SKIP() << fixture.skip;
    ASSERT_EQ(fixture.model.error, "");
    TempDir dir;
    LoopResult result = RunProofLoop(fixture.Settings(Corrector::None, 1, dir.Path()), fixture.tools);
    ASSERT_EQ(result.error, "");
    Chart proof = ReadChart(dir.File("proof-pass1.ti3"));
    vantrel::Measured_IT8 it8;
    ASSERT_EQ(it8.ReadIt8(dir.File("proof-pass1.ti3")), 0);
    ASSERT_EQ(it8.PatchCount(), static_cast<int>(proof.size()));
    EXPECT_GT(proof.size(), 190u);
    EXPECT_LT(proof.size(), 220u);
    for (int i : {0, static_cast<int>(proof.size()) / 2, static_cast<int>(proof.size()) - 1})
        for (int k = 0; k < 3; ++k) {
            EXPECT_NEAR(it8.GetCmyk(i, k), proof.cmyk[i][k], 1e-3);
            EXPECT_NEAR(it8.GetLab(i, k), proof.lab[i][k], 1e-3);
        }
    // The reference is R's prediction: close to the press data it was profiled from.
    Chart reference = ReadChart(dir.File("reference.ti3"));
    Chart press = ThinChart(ReadChart(kPressData), 8);
    ASSERT_EQ(reference.size(), press.size());
    double sum = 0;
    for (size_t i = 0; i < press.size(); ++i) sum += DeltaE(reference.lab[i], press.lab[i]);
    EXPECT_LT(sum / press.size(), 1.0);
}

// Each corrector lowers the proof's mean dE76 after the first pass and does not raise it after
// the second; the library's correctors change only the table (and the media white) of their file.
class ProofLoopCorrector : public testing::TestWithParam<Corrector> {};

TEST_P(ProofLoopCorrector, LowersTheMeanAndKeepsItDown) {
    LoopFixture fixture;
    if (!fixture.skip.empty()) GTEST_SKIP() << fixture.skip;
    ASSERT_EQ(fixture.model.error, "");
    TempDir dir;
    LoopResult result = RunProofLoop(fixture.Settings(GetParam(), 3, dir.Path()), fixture.tools);
    if (result.error.find("returned -1") != std::string::npos) GTEST_SKIP() << result.error;
    ASSERT_EQ(result.error, "");
    ASSERT_EQ(result.passes.size(), 3u);
    const auto& p = result.passes;
    EXPECT_GT(p[0].mean, 1.5) << "the drift shows before any correction";
    if (GetParam() == Corrector::Refine) {
        EXPECT_LT(p[1].mean, p[0].mean - 0.5);
        EXPECT_LT(p[2].mean, p[1].mean + 0.1);
    } else {
        EXPECT_LT(p[1].mean, p[0].mean - 0.1);
        EXPECT_LE(p[2].mean, p[1].mean);
    }
    if (GetParam() == Corrector::Optimize2)
        EXPECT_TRUE(OnlyTableBytesDiffer(fixture.model.proofer, dir.File("proofer-pass1.icc"), true));
    if (GetParam() == Corrector::Optimize3)
        EXPECT_TRUE(OnlyTableBytesDiffer(dir.File("correction-start.3cc"), dir.File("correction-pass1.3cc"), false));
    EXPECT_GE(p[0].correctionSeconds, 0.0);
    EXPECT_LT(p[2].correctionSeconds, 0.0) << "no correction after the last pass";
}

INSTANTIATE_TEST_SUITE_P(Correctors, ProofLoopCorrector,
                         testing::Values(Corrector::Refine, Corrector::Optimize2, Corrector::Optimize3),
                         [](const testing::TestParamInfo<Corrector>& info) {
                             return std::string(CorrectorName(info.param));
                         });

// What an operator gets wrong: each stops the loop with a message naming the problem, no pass
// is reported and nothing crashes.
TEST(ProofLoop, BadSetUpsStopWithAMessage) {
    LoopFixture fixture;
    if (!fixture.skip.empty()) GTEST_SKIP() << fixture.skip;
    ASSERT_EQ(fixture.model.error, "");
    TempDir dir;
    std::ofstream(dir.File("xyz-only.ti3")) << "CTI3\nNUMBER_OF_FIELDS 4\nBEGIN_DATA_FORMAT\nSAMPLE_ID XYZ_X XYZ_Y XYZ_Z\n"
                                               "END_DATA_FORMAT\nNUMBER_OF_SETS 1\nBEGIN_DATA\n1 96 100 82\nEND_DATA\n";
    std::ofstream(dir.File("broken.icc")) << "not a profile";
    struct Variant {
        const char* name;
        void (*change)(LoopSettings&, ArgyllTools&, const TempDir&);
        const char* message;
    } const variants[] = {
        {"no xicclu", [](LoopSettings&, ArgyllTools& t, const TempDir&) { t.xicclu.clear(); }, "xicclu is not on PATH"},
        {"no chart file", [](LoopSettings& s, ArgyllTools&, const TempDir& d) { s.pressTi3 = d.File("none.ti3"); },
         "no CMYK chart"},
        {"XYZ-only chart", [](LoopSettings& s, ArgyllTools&, const TempDir& d) { s.pressTi3 = d.File("xyz-only.ti3"); },
         "no CMYK chart"},
        {"broken reference", [](LoopSettings& s, ArgyllTools&, const TempDir& d) { s.referenceProfile = d.File("broken.icc"); },
         "could not evaluate"},
        {"missing proofer", [](LoopSettings& s, ArgyllTools&, const TempDir& d) { s.prooferProfile = d.File("none.icc"); },
         "pass 1: xicclu failed"},
        {"no refine", [](LoopSettings&, ArgyllTools& t, const TempDir&) { t.refine.clear(); }, "refine is not on PATH"},
    };
    for (const Variant& v : variants) {
        SCOPED_TRACE(v.name);
        LoopSettings settings = fixture.Settings(Corrector::Refine, 2, dir.File("work"));
        ArgyllTools tools = fixture.tools;
        v.change(settings, tools, dir);
        LoopResult result = RunProofLoop(settings, tools);
        EXPECT_NE(result.error.find(v.message), std::string::npos) << result.error;
        // Only a failed correction leaves the pass it measured.
        EXPECT_EQ(result.passes.size(), std::string(v.name) == "no refine" ? 1u : 0u);
    }
}
