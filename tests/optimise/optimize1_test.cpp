// optimize1 on copies of real and synthetic profiles: what changes in the file, what an
// independent tool measures, and what bad input gives.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "eval/eval_helpers.h"
#include "eval/inverse.h"
#include "helpers/tool_handle.h"
#include "helpers/xicclu.h"
#include "interface/host_number.h"
#include "it8/measured_it8.h"
#include "optimise/optimize1.h"
#include "vantrel.h"

namespace vantrel::test {
namespace {

constexpr int kUntouched = -777;

std::string CopyOf(const std::string& from, const TempDir& dir, const std::string& name) {
    const std::string to = dir.File(name);
    std::filesystem::copy_file(from, to, std::filesystem::copy_options::overwrite_existing);
    return to;
}

// Byte range [first, end) of the CLUT of an mft2 tag.
std::pair<size_t, size_t> Mft2ClutBytes(const Bytes& b, const char* tag) {
    for (size_t i = 0; i < GetU32(b, 128); ++i) {
        if (!std::equal(tag, tag + 4, b.begin() + static_cast<long>(TagRecord(i)))) continue;
        const size_t at = TagOffset(b, i);
        const size_t inputs = b[at + 8], outputs = b[at + 9], grid = b[at + 10];
        const size_t entries = size_t{b[at + 48]} << 8 | b[at + 49];
        size_t nodes = 1;
        for (size_t k = 0; k < inputs; ++k) nodes *= grid;
        const size_t first = at + 52 + 2 * inputs * entries;
        return {first, first + 2 * nodes * outputs};
    }
    return {0, 0};
}

// The round trip the export measures, computed here through the evaluation calls: 21^4 CMYK
// values (0, 12, .. 240) through A2B1, B2A1 and A2B1 again, relative colorimetric.
void OwnRoundTrip(const std::string& path, double& mean, double& max) {
    CProfil p;
    ASSERT_TRUE(LoadProfile(p, path));
    double sum = 0.0;
    max = 0.0;
    for (int n = 0; n < 194481; ++n) {
        const double cmyk[4] = {12.0 * (n / 9261), 12.0 * (n / 441 % 21), 12.0 * (n / 21 % 21), 12.0 * (n % 21)};
        const Lab first = CmykLab(p, cmyk);
        double v[CProfil::kEvalSize] = {first.L * 2.55, first.a, first.b};
        LabToCmyk(p, v);
        const double e = Difference(first, CmykLab(p, v));
        sum += e;
        max = std::max(max, e);
    }
    mean = sum / 194481.0;
}

TEST(Optimize1, RealProfilesImproveAsArgyllMeasuresAndOnlyTheB2ATableChanges) {
    if (!HaveXicclu()) GTEST_SKIP() << "xicclu not installed";
    for (const char* name : {"FOGRA39L", "TR003"}) {
        const std::string fixture = FixtureProfile(name);
        if (fixture.empty()) GTEST_SKIP() << name << " fixture not built";
        SCOPED_TRACE(name);
        TempDir dir;
        const std::string path = CopyOf(fixture, dir, "paper.icc");
        const Bytes before = ReadFile(path);
        const double argyllBefore = XiccluRoundTripMean(path, 7);
        ASSERT_GT(argyllBefore, 0.0);

        int mean = kUntouched, max = kUntouched;
        {
            ToolHandle tool;
            ASSERT_EQ(optimize1(tool.h, path.c_str(), &mean, &max), 0);
        }
        const Bytes after = ReadFile(path);
        ASSERT_EQ(after.size(), before.size());
        const auto clut = Mft2ClutBytes(before, "B2A1");
        size_t changed = 0;
        for (size_t k = 0; k < after.size(); ++k) {
            if (after[k] == before[k]) continue;
            ++changed;
            ASSERT_TRUE(k >= clut.first && k < clut.second) << "byte " << k << " outside the B2A table";
        }
        EXPECT_GT(changed, 0u);

        double ownMean = 0.0, ownMax = 0.0;
        OwnRoundTrip(path, ownMean, ownMax);
        EXPECT_NEAR(mean, ToHostInt(ownMean), 1);
        EXPECT_NEAR(max, ToHostInt(ownMax), 1);

        const double argyllAfter = XiccluRoundTripMean(path, 7);
        std::printf("[ dE       ] %s xicclu round trip mean %.4f -> %.4f; ours %.3f max %.3f\n", name, argyllBefore,
                    argyllAfter, mean / 1000.0, max / 1000.0);
        EXPECT_LT(argyllAfter, argyllBefore);

        if (std::string(name) == "FOGRA39L") {
            int again = kUntouched, againMax = kUntouched;
            ToolHandle tool;
            ASSERT_EQ(optimize1(tool.h, path.c_str(), &again, &againMax), 0);
            EXPECT_LE(again, mean) << "a second run never reports a higher mean";
        }
    }
}

// A CMYK profile whose lightness follows cyan alone (a* = b* = 0): its B2A table, cyan
// 255 x (1 - L*/100), inverts the A2B table exactly, on a grid of `b2aGrid` points.
Bytes NeutralProfile(int b2aGrid, bool withB2A = true) {
    const LutSpec a2b = DeviceToLabLut(4, 2, [](const std::vector<double>& f) { return Lab{100 * (1 - f[0]), 0, 0}; });
    const LutSpec b2a = DeviceLut(3, 4, b2aGrid, [](const std::vector<double>& f, int out) {
        return out == 0 ? 255.0 * (1.0 - f[0]) : 0.0;
    });
    IccBuilder builder("CMYK", "Lab ");
    builder.AddTag("A2B0", Mft2Tag(a2b)).AddTag("A2B1", Mft2Tag(a2b));
    if (withB2A) builder.AddTag("B2A1", Mft2Tag(b2a));
    return builder.AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249)).Build();
}

TEST(Optimize1, ATableThatAlreadyInvertsItsForwardTableStaysByteIdentical) {
    TempDir dir;
    const std::string path = WriteFile(dir.File("neutral.icc"), NeutralProfile(2));
    const Bytes before = ReadFile(path);
    ProgressLog log;
    int mean = kUntouched, max = kUntouched;
    {
        ToolHandle tool;
        EXPECT_EQ(optimize1(tool.h, path.c_str(), &mean, &max), 0);
    }
    EXPECT_EQ(ReadFile(path), before);
    EXPECT_EQ(mean, 0);
    EXPECT_EQ(max, 0);
    // Three analyses, the node step over the 2-point grid and the sample step.
    auto count = [&](const std::string& call) { return std::count(log.calls.begin(), log.calls.end(), call); };
    EXPECT_EQ(count("Analyzing Output Profile 441/441"), 3);
    EXPECT_EQ(count("Optimizing Step 1... 0/2"), 1);
    EXPECT_EQ(count("Optimizing  Step 1... 3/2"), 1);
    EXPECT_EQ(count("Finishing ... 2/2"), 1);
    EXPECT_EQ(count("Optimizing  Step 2... 446/445"), 1);
    EXPECT_EQ(count("Finished ... 445/445"), 1);
}

// Removes the profile while the run is going, before the table is written back.
std::string g_vanishing;
int RemoveWhenFinishing(const char* text, int, int) {
    if (!g_vanishing.empty() && std::string(text) == "Finishing ...") std::filesystem::remove(g_vanishing);
    return 0;
}

TEST(Optimize1, BadInputGivesItsResultAndLeavesTheFileAlone) {
    enum class File { Unchanged, Absent };
    struct Variant {
        const char* name;
        std::string path;  // what optimize1 is given
        int result;
        bool measured;  // the out-parameters are written
        File file;
        bool profiling = false;
        bool vanishes = false;
    };
    TempDir dir;
    const std::string rgb = SystemProfile("sRGB.icc");
    std::vector<Variant> variants = {
        {"no B2A table", WriteFile(dir.File("a2b-only.icc"), NeutralProfile(2, false)), kOptimize1NotLoaded, false,
         File::Unchanged},
        {"101-point B2A grid", WriteFile(dir.File("fine.icc"), NeutralProfile(101)), 0, true, File::Unchanged},
        {"missing file", dir.File("missing.icc"), kOptimize1NotLoaded, false, File::Absent},
        {"empty name", "", kOptimize1BadArgument, false, File::Absent},
        {"profiling mode, no reference profile", WriteFile(dir.File("link.icc"), NeutralProfile(2)),
         kOptimize1NotLoaded, false, File::Unchanged, true},
        {"vanishes during the run", WriteFile(dir.File("vanishing.icc"), NeutralProfile(2)), kOptimize1NotWritten,
         true, File::Absent, false, true},
    };
    if (!rgb.empty())
        variants.push_back({"RGB matrix profile", CopyOf(rgb, dir, "rgb.icc"), kOptimize1NotWritten, true,
                            File::Unchanged});
    for (const Variant& v : variants) {
        SCOPED_TRACE(v.name);
        const Bytes before = v.path.empty() ? Bytes() : ReadFile(v.path);
        g_vanishing = v.vanishes ? v.path : std::string();
        void* h = nullptr;
        ASSERT_EQ(dllInit(RemoveWhenFinishing, &h, nullptr), 0);
        static_cast<CIterativtoolDlg*>(h)->m_AbstractOutprof = v.profiling ? 1 : 0;
        int mean = kUntouched, max = kUntouched;
        EXPECT_EQ(optimize1(h, v.path.c_str(), &mean, &max), v.result);
        dllFree(h);
        g_vanishing.clear();
        EXPECT_EQ(mean != kUntouched && max != kUntouched, v.measured);
        if (v.file == File::Absent) {
            EXPECT_FALSE(!v.path.empty() && std::filesystem::exists(v.path));
        } else {
            EXPECT_EQ(ReadFile(v.path), before);
        }
        EXPECT_FALSE(std::filesystem::exists(v.path + "_inputvalues_big.it8"));
    }
    EXPECT_EQ(optimize1(nullptr, "p.icc", nullptr, nullptr), 1);
}

TEST(Optimize1, ProfilingModeMeasuresALinkThroughTheReferenceAndWritesBothSides) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    TempDir dir;
    ToolHandle tool(dir.Slash().c_str());
    CIterativtoolDlg& t = tool.Tool();
    // As after optimize4: the paper profile is a device link, the reference its printer.
    t.m_AbstractOutprof = 1;
    t.m_RefName = fogra;
    t.LoadRefProfile();
    const std::string link = dir.File("cmyk2cmyk5neutral.mcc");
    int mean = kUntouched, max = kUntouched;
    ASSERT_EQ(optimize1(tool.h, link.c_str(), &mean, &max), 0);
    // The identity link sends every colour back to itself.
    EXPECT_LE(mean, 20);
    EXPECT_LE(max, 200);

    Measured_IT8 in, out;
    ASSERT_EQ(in.ReadIt8(link + "_inputvalues_big.it8"), 0);
    ASSERT_EQ(out.ReadIt8(link + "_outputvalues_big.it8"), 0);
    ASSERT_EQ(in.PatchCount(), 194481);
    ASSERT_EQ(out.PatchCount(), 194481);
    // The last sample is 240 on every channel: 94 % after rounding, and the reference's colour.
    CProfil printer;
    ASSERT_TRUE(LoadProfile(printer, fogra));
    const double last[4] = {240, 240, 240, 240};
    const Lab expected = CmykLab(printer, last);
    for (int c = 0; c < 4; ++c) EXPECT_EQ(in.GetCmyk(194480, c), 94.0);
    EXPECT_NEAR(in.GetLab(194480, 0), expected.L, 0.01);
    EXPECT_NEAR(in.GetLab(194480, 1), expected.a, 0.01);
    EXPECT_NEAR(out.GetLab(194480, 0), expected.L, 0.05);
}

}  // namespace
}  // namespace vantrel::test
