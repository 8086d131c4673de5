#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>

#include "helpers/test_paths.h"
#include "interface/tool_object.h"
#include "vantrel.h"

namespace fs = std::filesystem;
using vantrel::test::TempDir;

namespace {

const char* const kEmbeddedNames[] = {"neutral.3cc", "cmyk2cmyk5neutral.mcc", "cmykog2cmykog5neutral.mcc",
                                      "cmykrgb2cmykrgb5neutral.mcc"};

int Silent(const char*, int, int) { return 0; }

struct Handle {
    void* h = nullptr;
    int result = 0;
    explicit Handle(const char* dir, ProgressCallback progress = Silent) { result = dllInit(progress, &h, dir); }
    ~Handle() { dllFree(h); }
    vantrel::CIterativtoolDlg& Tool() { return *static_cast<vantrel::CIterativtoolDlg*>(h); }
};

}  // namespace

TEST(DllInit, NullOrEmptyDirCreatesAToolAndWritesNothing) {
    for (const char* dir : {static_cast<const char*>(nullptr), ""}) {
        Handle tool(dir);
        EXPECT_EQ(tool.result, 0);
        ASSERT_NE(tool.h, nullptr);
        EXPECT_EQ(tool.Tool().m_WorkDir, "");
    }
}

TEST(DllInit, DirWithSeparatorReceivesTheFourProfiles) {
    TempDir dir;
    Handle tool(dir.Slash().c_str());
    ASSERT_EQ(tool.result, 0);
    for (const char* name : kEmbeddedNames) EXPECT_TRUE(fs::exists(dir.File(name))) << name;
    EXPECT_EQ(fs::file_size(dir.File("neutral.3cc")), 714612u);
}

TEST(DllInit, DirWithoutSeparatorIsAPrefixOfTheFileNames) {
    TempDir dir;
    const std::string prefix = dir.File("work");
    Handle tool(prefix.c_str());
    for (const char* name : kEmbeddedNames) EXPECT_TRUE(fs::exists(prefix + name)) << name;
    EXPECT_FALSE(fs::exists(dir.File("neutral.3cc")));
}

TEST(DllInit, ExistingFilesAreOverwritten) {
    TempDir dir;
    std::ofstream(dir.File("neutral.3cc")) << "stale";
    Handle tool(dir.Slash().c_str());
    EXPECT_EQ(fs::file_size(dir.File("neutral.3cc")), 714612u);
}

TEST(DllInit, UnwritableOrImpossibleDirStillGivesATool) {
    const std::string longDir = "/tmp/" + std::string(10000, 'x') + "/";
    for (const std::string& dir : {std::string("/nonexistent/vantrel/"), longDir}) {
        Handle tool(dir.c_str());
        EXPECT_EQ(tool.result, 0);
        EXPECT_NE(tool.h, nullptr);
    }
}

TEST(DllInit, NullHandleOutIsRefused) { EXPECT_EQ(dllInit(Silent, nullptr, nullptr), -1); }

TEST(DllInit, NewToolHasItsDefaultLabelsAndSwitches) {
    Handle tool(nullptr);
    auto& t = tool.Tool();
    EXPECT_EQ(t.m_OutprofName, "-no 3CC selected-");
    EXPECT_EQ(t.m_RefName, "-no profile selected-");
    EXPECT_EQ(t.m_PaperName, "-no profile selected-");
    EXPECT_EQ(t.m_ISDName, "-no ISD selected-");
    EXPECT_EQ(t.m_ReferenceIT8Name, "-no file selected-");
    EXPECT_EQ(t.m_MeasIT8Name, "-no file selected-");
    EXPECT_EQ(t.m_OptFlagA, 1);
    EXPECT_EQ(t.m_OptFlagB, 1);
    EXPECT_EQ(t.m_CalRun, -1);
    EXPECT_EQ(t.m_AbstractOutprof + t.m_UseIntent0 + t.m_ISDMode + t.m_WriteExtra + t.m_CorrectOutprof, 0);
    EXPECT_EQ(t.m_Progress, &Silent);
    for (auto* p : {t.m_Outprof.get(), t.m_Refprof.get(), t.m_Paperprof.get(), t.m_ISDprof.get(),
                    t.m_PaperprofPerceptual.get()}) {
        ASSERT_NE(p, nullptr);
        EXPECT_FALSE(p->HoldsTables());
    }
    EXPECT_NE(t.m_ReferenceIT8, nullptr);
    EXPECT_NE(t.m_MeasIT8, nullptr);
    EXPECT_EQ(t.m_PrevMeasIT8, nullptr);
}

TEST(DllFree, NullHandleReturnsZero) { EXPECT_EQ(dllFree(nullptr), 0); }

TEST(Exports, NullHandleReturnsOneWhereTheHandleIsChecked) {
    int a = 0, b = 0, c = 0, d = 0;
    int lab[3] = {}, values[7] = {};
    unsigned short table[16] = {};
    EXPECT_EQ(analyse1(nullptr, "p.icc", lab, values), 1);
    EXPECT_EQ(analyse2(nullptr, "i.icc", "o.it8", "m.it8", &a, &b), 1);
    EXPECT_EQ(analyse3(nullptr, "p.icc", "o.3cc", "r.it8", "m.it8", &a, &b), 1);
    EXPECT_EQ(analyse4(nullptr, "p.icc", "r.icc", "r.it8", "m.it8", &a, &b, &c, &d), 1);
    EXPECT_EQ(optimize1(nullptr, "p.icc", &a, &b), 1);
    EXPECT_EQ(optimize2(nullptr, "o.icc", &a, &b, 0), 1);
    EXPECT_EQ(optimize3(nullptr, "o.3cc", &a, &b, 0), 1);
    EXPECT_EQ(optimize4(nullptr, "o.3cc", &a, &b, table, "", 0), 1);
    EXPECT_EQ(mergeMCHintoCMYK(nullptr, "r.icc", "p.icc", "o.icc"), 1);
    EXPECT_EQ(a + b + c + d, 0);
}

TEST(Exports, ConversionsRefuseANullHandleOrAMissingProfileName) {
    Handle tool(nullptr);
    int in[4] = {0, 0, 0, 0};
    int lab[3] = {7, 7, 7}, xyz[3] = {7, 7, 7};
    EXPECT_EQ(Cmyk2Lab_Double(nullptr, "p.icc", 1, in, 0, lab, 0, xyz), -1);
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, nullptr, 1, in, 0, lab, 0, xyz), -1);
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, "", 1, in, 0, lab, 0, xyz), -1);
    EXPECT_EQ(RGB2Lab_Double(tool.h, "", 1, in, 0, lab, 0, xyz), -1);
    EXPECT_EQ(Cmykrgb2Lab_Double(tool.h, "", 1, in, 0, lab, 0, xyz), -1);
    EXPECT_EQ(lab[0] + lab[1] + lab[2] + xyz[0] + xyz[1] + xyz[2], 42);
}
