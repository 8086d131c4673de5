// The slot loaders: which tables they load, what they report, and when they do nothing.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "eval/gamut_record.h"
#include "helpers/tool_handle.h"

using namespace vantrel::test;
using vantrel::CProfil;

namespace {

const char* const kTags[] = {"A2B0", "A2B1", "B2A0", "B2A1"};

// The tags a profile's two slots were loaded from, told by the marks in their tables.
std::string Loaded(const CProfil& p) {
    std::string tags;
    for (int slot = 0; slot < 2; ++slot) {
        const int mark = p.m_Clut[slot].empty() ? 0 : p.m_Clut[slot][0] / 1000;
        tags += (slot ? " " : "") + std::string(mark >= 1 && mark <= 4 ? kTags[mark - 1] : "none");
    }
    return tags;
}

class SlotLoaders : public ::testing::Test {
protected:
    SlotLoaders() {
        // Every table tag a loader may ask for, each marked in its CLUT.
        IccBuilder profile("CMYK", "Lab ");
        for (int t = 0; t < 4; ++t) {
            const auto mark = static_cast<uint16_t>(1000 * (t + 1));
            profile.AddTag(kTags[t], Mft2Tag(MakeLut(t < 2 ? 4 : 3, t < 2 ? 3 : 4, 2,
                                                     [mark](const std::vector<int>&, int) { return mark; })));
        }
        path = WriteFile(dir.File("marked.icc"), profile.AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249)).Build());
    }

    TempDir dir;
    std::string path;
    ProgressLog log;
    ToolHandle handle;
    vantrel::CIterativtoolDlg& t = handle.Tool();
    std::vector<std::string>& reports = log.calls;
};

}  // namespace

TEST_F(SlotLoaders, DefaultLabelsAndEmptyNamesLoadNothingAndReportNothing) {
    for (int round = 0; round < 2; ++round) {
        t.LoadOutprof();
        t.LoadISDProfile();
        t.LoadRefProfile();
        t.LoadPaperProfile(true);
        t.LoadPaperProfilePerceptual();
        t.m_OutprofName = t.m_ISDName = t.m_RefName = t.m_PaperName = "";
    }
    EXPECT_TRUE(reports.empty());
    EXPECT_FALSE(t.m_Paperprof->HoldsTables());
}

TEST_F(SlotLoaders, EachLoaderTakesItsTagsAndReportsItsSteps) {
    t.m_PaperName = t.m_RefName = t.m_ISDName = t.m_OutprofName = path;
    t.LoadPaperProfile(false);
    t.LoadPaperProfilePerceptual();
    t.LoadRefProfile();
    t.LoadISDProfile();
    t.LoadOutprof();
    EXPECT_EQ(Loaded(*t.m_Paperprof), "A2B1 B2A1");
    EXPECT_EQ(Loaded(*t.m_PaperprofPerceptual), "A2B0 B2A0");
    EXPECT_EQ(Loaded(*t.m_Refprof), "A2B1 B2A1");
    EXPECT_EQ(Loaded(*t.m_ISDprof), "A2B1 B2A1");
    EXPECT_EQ(Loaded(*t.m_Outprof), "A2B1 B2A1");
    EXPECT_EQ(reports, (std::vector<std::string>{
                           "load paper profile 0/4", "load paper profile 1/4", "load paper profile 2/4",
                           "Finished ... 4/4", "load copies of paper profile 0/5", "load copies of paper profile 3/5",
                           "load copies of paper profile 4/5", "Finished ... 5/5", "load Ref 0/4", "Finished ... 1/1",
                           "load ISD 0/4", "Finished ... 1/1", "m_Outprof 0/4", "Finished ... 1/1"}));
    // Both directions use the media white; the gamut record counts as valid.
    EXPECT_EQ(t.m_Paperprof->m_UseMediaWhite[0] + t.m_Paperprof->m_UseMediaWhite[1], 2);
    EXPECT_EQ(t.m_Gamut.valid, 1);
    // A white point that is the illuminant is Lab 100, 0, 0.
    EXPECT_NEAR(t.m_PaperWhite.L, 100, 1e-3);
    EXPECT_NEAR(t.m_PaperWhite.a, 0, 1e-3);
    EXPECT_NEAR(t.m_PaperWhite.b, 0, 1e-3);
}

TEST_F(SlotLoaders, IntentZeroAndAbstractSwitchesChooseTheirTags) {
    t.m_PaperName = t.m_RefName = t.m_ISDName = t.m_OutprofName = path;
    t.m_UseIntent0 = 1;
    t.LoadPaperProfile(false);
    t.LoadRefProfile();
    t.LoadISDProfile();
    EXPECT_EQ(Loaded(*t.m_Paperprof), "A2B0 B2A0");
    EXPECT_EQ(Loaded(*t.m_ISDprof), "A2B0 B2A0");
    EXPECT_EQ(Loaded(*t.m_Refprof), "A2B1 B2A1");  // the reference ignores the switch

    for (auto* p : {t.m_Paperprof.get(), t.m_Outprof.get(), t.m_PaperprofPerceptual.get()}) p->Release();
    t.m_AbstractOutprof = 1;
    t.m_UseIntent0 = 0;
    t.LoadPaperProfile(false);
    t.LoadOutprof();
    t.LoadPaperProfilePerceptual();
    EXPECT_EQ(Loaded(*t.m_Paperprof), "A2B0 A2B0");
    EXPECT_EQ(Loaded(*t.m_Outprof), "A2B0 A2B0");
    EXPECT_EQ(Loaded(*t.m_PaperprofPerceptual), "A2B0 A2B0");
}

TEST_F(SlotLoaders, AMissingFileStillRunsEveryStep) {
    t.m_PaperName = dir.File("missing.icc");
    t.LoadPaperProfile(true);
    EXPECT_EQ(reports.size(), 5u);
    EXPECT_EQ(t.m_Gamut.valid, 1);
    EXPECT_EQ(Loaded(*t.m_Paperprof), "none none");
}

// A released profile keeps nothing a later failed load could take for a table: the gamut built
// then describes nothing and the reproduced colour is the requested one.
TEST(SlotLoadersAfterRelease, AFailedLoadBuildsNoGamutFromStaleDescriptors) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    TempDir dir;
    ToolHandle handle;
    vantrel::CIterativtoolDlg& t = handle.Tool();
    t.m_PaperName = fogra;
    t.LoadPaperProfile(true);
    ASSERT_TRUE(t.m_GamutComputed);
    t.m_Paperprof->Release();
    EXPECT_TRUE(t.m_Paperprof->m_Lut[1].colourSpace.empty());

    t.m_PaperName = dir.File("absent.icc");
    t.LoadPaperProfile(true);
    EXPECT_FALSE(t.m_GamutComputed);
    EXPECT_EQ(t.m_Gamut.valid, 1);  // the loader marks the record all the same
    int filled = 0;
    for (const auto& row : t.m_Gamut.chroma)
        for (uint8_t cell : row) filled += cell != 255;
    EXPECT_EQ(filled, 0);
    const vantrel::Lab same = vantrel::ReproducedLab(*t.m_Paperprof, 50, 20, 20);
    EXPECT_DOUBLE_EQ(same.L, 50);
    EXPECT_DOUBLE_EQ(same.a, 20);
    EXPECT_DOUBLE_EQ(same.b, 20);
}

// The abstract switch wins: the paper profile serves both ways from its forward table, and its
// gamut is built over a four-input slot 1.
TEST_F(SlotLoaders, PaperLoaderWithAbstractAndIntentZeroTakesA2B0BothWays) {
    t.m_PaperName = path;
    t.m_AbstractOutprof = 1;
    t.m_UseIntent0 = 1;
    t.LoadPaperProfile(true);
    EXPECT_EQ(Loaded(*t.m_Paperprof), "A2B0 A2B0");
    EXPECT_EQ(t.m_Paperprof->m_Lut[1].inputChannels, 4);
}
