// The slot loaders: which tables they load, what they report, and when they do nothing.
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "interface/tool_object.h"
#include "vantrel.h"

using namespace vantrel::test;
using vantrel::CIterativtoolDlg;

namespace {

struct Report {
    std::string text;
    int step, steps;
    bool operator==(const Report& o) const { return text == o.text && step == o.step && steps == o.steps; }
};

// Progress reports arrive through a plain function: the test's record is reached through a
// pointer the test sets for the duration of one case.
std::vector<Report>* g_reports = nullptr;
int Record(const char* text, int step, int steps) {
    if (g_reports) g_reports->push_back({text, step, steps});
    return 0;
}

class SlotLoaders : public ::testing::Test {
protected:
    void SetUp() override {
        g_reports = &reports;
        dllInit(Record, &handle, nullptr);
        // Every table tag a loader may ask for, each telling by its first CLUT value which it is.
        IccBuilder profile("CMYK", "Lab ");
        const char* tags[] = {"A2B0", "A2B1", "B2A0", "B2A1"};
        for (int t = 0; t < 4; ++t) {
            const bool forward = t < 2;
            const uint16_t mark = static_cast<uint16_t>(1000 * (t + 1));
            auto lut = MakeLut(forward ? 4 : 3, forward ? 3 : 4, 2,
                               [mark](const std::vector<int>&, int) -> uint16_t { return mark; });
            profile.AddTag(tags[t], Mft2Tag(lut));
        }
        profile.AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249));
        path = WriteFile(dir.File("marked.icc"), profile.Build());
    }
    void TearDown() override {
        dllFree(handle);
        g_reports = nullptr;
    }
    CIterativtoolDlg& Tool() { return *static_cast<CIterativtoolDlg*>(handle); }
    // Which tag a slot's table came from, by its mark.
    static std::string Loaded(const vantrel::CProfil& p, int slot) {
        if (p.m_Clut[slot].empty()) return "none";
        const char* tags[] = {"A2B0", "A2B1", "B2A0", "B2A1"};
        const int mark = p.m_Clut[slot][0] / 1000;
        return mark >= 1 && mark <= 4 ? tags[mark - 1] : "?";
    }

    TempDir dir;
    std::string path;
    void* handle = nullptr;
    std::vector<Report> reports;
};

}  // namespace

TEST_F(SlotLoaders, DefaultLabelsAndEmptyNamesLoadNothingAndReportNothing) {
    Tool().LoadOutprof();
    Tool().LoadISDProfile();
    Tool().LoadRefProfile();
    Tool().LoadPaperProfile(true);
    Tool().LoadPaperProfilePerceptual();
    Tool().m_OutprofName = Tool().m_ISDName = Tool().m_RefName = Tool().m_PaperName = "";
    Tool().LoadOutprof();
    Tool().LoadISDProfile();
    Tool().LoadRefProfile();
    Tool().LoadPaperProfile(false);
    Tool().LoadPaperProfilePerceptual();
    EXPECT_TRUE(reports.empty());
    EXPECT_FALSE(Tool().m_Paperprof->HoldsTables());
}

TEST_F(SlotLoaders, EachLoaderTakesItsTagsAndReportsItsSteps) {
    auto& t = Tool();
    t.m_PaperName = t.m_RefName = t.m_ISDName = t.m_OutprofName = path;

    t.LoadPaperProfile(false);
    EXPECT_EQ(Loaded(*t.m_Paperprof, 0), "A2B1");
    EXPECT_EQ(Loaded(*t.m_Paperprof, 1), "B2A1");
    EXPECT_EQ(reports, (std::vector<Report>{{"load paper profile", 0, 4},
                                            {"load paper profile", 1, 4},
                                            {"load paper profile", 2, 4},
                                            {"Finished ...", 4, 4}}));
    EXPECT_EQ(t.m_Paperprof->m_UseMediaWhite[0], 1);
    EXPECT_EQ(t.m_Paperprof->m_UseMediaWhite[1], 1);
    EXPECT_EQ(t.m_Gamut.valid, 1);

    reports.clear();
    t.LoadPaperProfilePerceptual();
    EXPECT_EQ(Loaded(*t.m_PaperprofPerceptual, 0), "A2B0");
    EXPECT_EQ(Loaded(*t.m_PaperprofPerceptual, 1), "B2A0");
    EXPECT_EQ(reports, (std::vector<Report>{{"load copies of paper profile", 0, 5},
                                            {"load copies of paper profile", 3, 5},
                                            {"load copies of paper profile", 4, 5},
                                            {"Finished ...", 5, 5}}));

    reports.clear();
    t.LoadRefProfile();
    t.LoadISDProfile();
    t.LoadOutprof();
    EXPECT_EQ(Loaded(*t.m_Refprof, 0), "A2B1");
    EXPECT_EQ(Loaded(*t.m_ISDprof, 1), "B2A1");
    EXPECT_EQ(Loaded(*t.m_Outprof, 1), "B2A1");
    EXPECT_EQ(reports, (std::vector<Report>{{"load Ref", 0, 4},
                                            {"Finished ...", 1, 1},
                                            {"load ISD", 0, 4},
                                            {"Finished ...", 1, 1},
                                            {"m_Outprof", 0, 4},
                                            {"Finished ...", 1, 1}}));
}

TEST_F(SlotLoaders, IntentZeroAndAbstractSwitchesChooseTheirTags) {
    auto& t = Tool();
    t.m_PaperName = t.m_RefName = t.m_ISDName = t.m_OutprofName = path;
    t.m_UseIntent0 = 1;
    t.LoadPaperProfile(false);
    t.LoadRefProfile();
    t.LoadISDProfile();
    EXPECT_EQ(Loaded(*t.m_Paperprof, 0), "A2B0");
    EXPECT_EQ(Loaded(*t.m_Paperprof, 1), "B2A0");
    EXPECT_EQ(Loaded(*t.m_ISDprof, 1), "B2A0");
    EXPECT_EQ(Loaded(*t.m_Refprof, 0), "A2B1");
    EXPECT_EQ(Loaded(*t.m_Refprof, 1), "B2A1");

    for (auto* p : {t.m_Paperprof.get(), t.m_Outprof.get()}) p->Release();
    t.m_AbstractOutprof = 1;
    t.m_UseIntent0 = 0;
    t.LoadPaperProfile(false);
    t.LoadOutprof();
    for (auto* p : {t.m_Paperprof.get(), t.m_Outprof.get()}) {
        EXPECT_EQ(Loaded(*p, 0), "A2B0");
        EXPECT_EQ(Loaded(*p, 1), "A2B0");
    }
}

TEST_F(SlotLoaders, PaperWhiteOfAProfileWhoseWhiteIsItsIlluminant) {
    auto& t = Tool();
    t.m_PaperName = path;
    t.LoadPaperProfile(false);
    EXPECT_NEAR(t.m_PaperWhite.L, 100, 1e-3);
    EXPECT_NEAR(t.m_PaperWhite.a, 0, 1e-3);
    EXPECT_NEAR(t.m_PaperWhite.b, 0, 1e-3);
}

TEST_F(SlotLoaders, AMissingFileStillRunsEveryStep) {
    auto& t = Tool();
    t.m_PaperName = dir.File("missing.icc");
    t.LoadPaperProfile(true);
    EXPECT_EQ(reports.size(), 5u);
    EXPECT_EQ(t.m_Gamut.valid, 1);
}
