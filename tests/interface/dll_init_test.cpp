// Creating and destroying the tool object, and the exports' answers to null handles.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>

#include "helpers/test_paths.h"
#include "helpers/tool_handle.h"

namespace fs = std::filesystem;
using namespace vantrel::test;

namespace {

const char* const kEmbeddedNames[] = {"neutral.3cc", "cmyk2cmyk5neutral.mcc", "cmykog2cmykog5neutral.mcc",
                                      "cmykrgb2cmykrgb5neutral.mcc"};

}  // namespace

TEST(DllInit, AnyDirGivesAToolWithEmptySlots) {
    // None, empty (nothing written), unwritable, impossibly long.
    const std::string longDir = "/tmp/" + std::string(10000, 'x') + "/";
    for (const char* dir : {static_cast<const char*>(nullptr), "", "/nonexistent/vantrel/", longDir.c_str()}) {
        ToolHandle tool(dir);
        EXPECT_EQ(tool.result, 0);
        ASSERT_NE(tool.h, nullptr);
        auto& t = tool.Tool();
        EXPECT_EQ(t.m_WorkDir, dir ? dir : "");
        for (auto* p : {t.m_Outprof.get(), t.m_Refprof.get(), t.m_Paperprof.get(), t.m_ISDprof.get(),
                        t.m_PaperprofPerceptual.get()})
            EXPECT_FALSE(p->HoldsTables());
    }
}

TEST(DllInit, TheDirIsAPrefixOfTheFourProfilesWhichOverwriteOldOnes) {
    TempDir dir;
    std::ofstream(dir.File("neutral.3cc")) << "stale";
    {
        ToolHandle tool(dir.Slash().c_str());
        ASSERT_EQ(tool.result, 0);
    }
    for (const char* name : kEmbeddedNames) EXPECT_TRUE(fs::exists(dir.File(name))) << name;
    EXPECT_EQ(fs::file_size(dir.File("neutral.3cc")), 714612u);

    // Without a separator the names are appended to the last part of the path.
    ToolHandle prefixed(dir.File("work").c_str());
    for (const char* name : kEmbeddedNames) EXPECT_TRUE(fs::exists(dir.File("work") + name)) << name;
}

TEST(Exports, NullHandlesAndNullOutPointers) {
    EXPECT_EQ(dllInit(ProgressLog::Report, nullptr, nullptr), -1);
    EXPECT_EQ(dllFree(nullptr), 0);
    // Exports that check the handle answer 1 and touch nothing.
    int a = 0, b = 0, c = 0, d = 0;
    int lab[3] = {50000, 0, 0}, values[7] = {1, 2, 3, 4, 5, 6, 7};
    unsigned short table[16] = {};
    EXPECT_EQ(analyse1(nullptr, "p.icc", lab, values), 1);
    EXPECT_EQ(values[6], 7);
    EXPECT_EQ(analyse2(nullptr, "i.icc", "o.it8", "m.it8", &a, &b), 1);
    EXPECT_EQ(analyse3(nullptr, "p.icc", "o.3cc", "r.it8", "m.it8", &a, &b), 1);
    EXPECT_EQ(analyse4(nullptr, "p.icc", "r.icc", "r.it8", "m.it8", &a, &b, &c, &d), 1);
    EXPECT_EQ(optimize1(nullptr, "p.icc", &a, &b), 1);
    EXPECT_EQ(optimize2(nullptr, "o.icc", &a, &b, 0), 1);
    EXPECT_EQ(optimize3(nullptr, "o.3cc", &a, &b, 0), 1);
    EXPECT_EQ(optimize4(nullptr, "o.3cc", &a, &b, table, "", 0), 1);
    EXPECT_EQ(mergeMCHintoCMYK(nullptr, "r.icc", "p.icc", "o.icc"), 1);
    EXPECT_EQ(a + b + c + d, 0);

    // Conversions answer -1 for a null handle or a missing profile name, before writing anything.
    ToolHandle tool(nullptr);
    int in[4] = {0, 0, 0, 0};
    int out[3] = {7, 7, 7}, xyz[3] = {7, 7, 7};
    EXPECT_EQ(Cmyk2Lab_Double(nullptr, "p.icc", 1, in, 0, out, 0, xyz), -1);
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, nullptr, 1, in, 0, out, 0, xyz), -1);
    EXPECT_EQ(Cmyk2Lab_Double(tool.h, "", 1, in, 0, out, 0, xyz), -1);
    EXPECT_EQ(RGB2Lab_Double(tool.h, "", 1, in, 0, out, 0, xyz), -1);
    EXPECT_EQ(Cmykrgb2Lab_Double(tool.h, "", 1, in, 0, out, 0, xyz), -1);
    EXPECT_EQ(out[0] + out[1] + out[2] + xyz[0] + xyz[1] + xyz[2], 42);
}
