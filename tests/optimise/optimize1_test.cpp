// optimize1 on copies of real and synthetic profiles: what changes in the file, what an
// independent tool measures, and what bad input gives.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "eval/eval_helpers.h"
#include "eval/inverse.h"
#include "helpers/tool_handle.h"
#include "helpers/xicclu.h"
#include "interface/host_number.h"
#include "optimise/optimize1.h"

namespace vantrel::test {
namespace {

constexpr int kUntouched = -777;

std::string CopyOf(const std::string& from, const TempDir& dir, const std::string& name) {
    std::filesystem::copy_file(from, dir.File(name), std::filesystem::copy_options::overwrite_existing);
    return dir.File(name);
}

// Byte range [first, end) of the CLUT of an mft2 tag.
std::pair<size_t, size_t> Mft2ClutBytes(const Bytes& b, const char* tag) {
    for (size_t i = 0; i < GetU32(b, 128); ++i) {
        if (!std::equal(tag, tag + 4, b.begin() + static_cast<long>(TagRecord(i)))) continue;
        const size_t at = TagOffset(b, i), inputs = b[at + 8], grid = b[at + 10];
        const size_t first = at + 52 + 2 * inputs * (size_t{b[at + 48]} << 8 | b[at + 49]);
        return {first, first + 2 * b[at + 9] * static_cast<size_t>(std::pow(grid, inputs))};
    }
    return {0, 0};
}

// The round trip the export reports, computed here through the evaluation calls: 21^4 CMYK
// values (0, 12, .. 240) through A2B1, B2A1 and A2B1 again, relative colorimetric.
DeltaStats OwnRoundTrip(const std::string& path) {
    CProfil p;
    DeltaStats stats;
    if (!LoadProfile(p, path)) return stats;
    for (int n = 0; n < 194481; ++n) {
        const double cmyk[4] = {12.0 * (n / 9261), 12.0 * (n / 441 % 21), 12.0 * (n / 21 % 21), 12.0 * (n % 21)};
        const Lab first = CmykLab(p, cmyk);
        double v[CProfil::kEvalSize] = {first.L * 2.55, first.a, first.b};
        LabToCmyk(p, v);
        stats.Add(Difference(first, CmykLab(p, v)));
    }
    return stats;
}

TEST(Optimize1, RealProfilesImproveAsArgyllMeasuresAndOnlyTheB2ATableChanges) {
    if (!HaveXicclu()) GTEST_SKIP() << "xicclu not installed";
    for (const std::string name : {"FOGRA39L", "TR003"}) {
        if (FixtureProfile(name).empty()) GTEST_SKIP() << name << " fixture not built";
        SCOPED_TRACE(name);
        TempDir dir;
        const std::string path = CopyOf(FixtureProfile(name), dir, "paper.icc");
        const Bytes before = ReadFile(path);
        const double argyllBefore = XiccluRoundTripMean(path, 7);
        int mean = kUntouched, max = kUntouched;
        ASSERT_EQ(optimize1(ToolHandle().h, path.c_str(), &mean, &max), 0);

        const Bytes after = ReadFile(path);
        ASSERT_EQ(after.size(), before.size());
        const auto clut = Mft2ClutBytes(before, "B2A1");  // Argyll's B2A0..2 share it
        size_t changed = 0;
        for (size_t k = 0; k < after.size(); ++k) {
            if (after[k] == before[k]) continue;
            ++changed;
            ASSERT_TRUE(k >= clut.first && k < clut.second) << "byte " << k << " outside the B2A table";
        }
        EXPECT_GT(changed, 0u);
        const DeltaStats own = OwnRoundTrip(path);
        EXPECT_NEAR(mean, ToHostInt(own.Mean()), 1);
        EXPECT_NEAR(max, ToHostInt(own.max), 1);
        const double argyllAfter = XiccluRoundTripMean(path, 7);
        std::printf("[ dE       ] %s: xicclu round trip %.4f -> %.4f\n", name.c_str(), argyllBefore, argyllAfter);
        EXPECT_LT(argyllAfter, argyllBefore);
        if (name != "FOGRA39L") continue;
        int again = kUntouched, againMax = kUntouched;
        ASSERT_EQ(optimize1(ToolHandle().h, path.c_str(), &again, &againMax), 0);
        EXPECT_LE(again, mean) << "a second run never reports a higher mean";
    }
}

// A CMYK profile whose lightness follows cyan alone: its B2A table, cyan 255 x (1 - L*/100) on a
// grid of `b2aGrid` points, inverts its A2B table exactly.
Bytes NeutralProfile(int b2aGrid, bool withB2A = true) {
    const LutSpec a2b = DeviceToLabLut(4, 2, [](const std::vector<double>& f) { return Lab{100 * (1 - f[0]), 0, 0}; });
    IccBuilder builder("CMYK", "Lab ");
    builder.AddTag("A2B0", Mft2Tag(a2b)).AddTag("A2B1", Mft2Tag(a2b));
    if (withB2A)
        builder.AddTag("B2A1", Mft2Tag(DeviceLut(3, 4, b2aGrid, [](const std::vector<double>& f, int out) {
            return out == 0 ? 255.0 * (1.0 - f[0]) : 0.0;
        })));
    return builder.AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249)).Build();
}

std::string g_vanishing;  // removed while the run is going, before the table is written back
int RemoveWhenFinishing(const char* text, int, int) {
    if (!g_vanishing.empty() && std::string(text) == "Finishing ...") std::filesystem::remove(g_vanishing);
    return 0;
}

// Tables that need no correction (the neutral profile: every error 0) or cannot take one, and
// input the export refuses: the result says which, and the file keeps its bytes.
TEST(Optimize1, ExactTablesAndBadInputGiveTheirResultAndLeaveTheFileAlone) {
    struct Variant {
        const char* name;
        std::string path;
        int result;
        bool measured;  // the out-parameters are written
        bool profiling = false, vanishes = false;
    };
    TempDir dir;
    std::vector<Variant> variants = {
        {"no B2A table", WriteFile(dir.File("a2b.icc"), NeutralProfile(2, false)), kOptimize1NotLoaded, false},
        {"exact inverse", WriteFile(dir.File("exact.icc"), NeutralProfile(2)), 0, true},
        {"101-point B2A grid", WriteFile(dir.File("fine.icc"), NeutralProfile(101)), 0, true},
        {"missing file", dir.File("missing.icc"), kOptimize1NotLoaded, false},
        {"empty name", "", kOptimize1BadArgument, false},
        {"profiling mode, empty reference slot", WriteFile(dir.File("link.icc"), NeutralProfile(2)),
         kOptimize1NotLoaded, false, true},
        {"vanishes during the run", WriteFile(dir.File("gone.icc"), NeutralProfile(2)), kOptimize1NotWritten, true,
         false, true},
    };
    if (std::filesystem::exists(SystemIccDir() + "sRGB.icc"))  // matrix/TRC: no table to write back
        variants.push_back(
            {"RGB profile", CopyOf(SystemIccDir() + "sRGB.icc", dir, "rgb.icc"), kOptimize1NotWritten, true});
    for (const Variant& v : variants) {
        SCOPED_TRACE(v.name);
        const bool existed = std::filesystem::exists(v.path);
        const Bytes before = existed ? ReadFile(v.path) : Bytes();
        g_vanishing = v.vanishes ? v.path : std::string();
        void* h = nullptr;
        ASSERT_EQ(dllInit(RemoveWhenFinishing, &h, nullptr), 0);
        static_cast<CIterativtoolDlg*>(h)->m_AbstractOutprof = v.profiling;
        int mean = kUntouched, max = kUntouched;
        EXPECT_EQ(optimize1(h, v.path.c_str(), &mean, &max), v.result);
        dllFree(h);
        EXPECT_EQ(mean != kUntouched && max != kUntouched, v.measured);
        if (v.measured && v.result == 0) {
            EXPECT_LE(mean + max, 2) << "the first analysis: the table's quantisation only";
        }
        EXPECT_EQ(std::filesystem::exists(v.path), existed && !v.vanishes);
        if (existed && !v.vanishes) {
            EXPECT_EQ(ReadFile(v.path), before);
        }
        EXPECT_FALSE(std::filesystem::exists(v.path + "_inputvalues_big.it8"));
    }
    g_vanishing.clear();
    EXPECT_EQ(optimize1(nullptr, "p.icc", nullptr, nullptr), 1);
}

TEST(Optimize1, ProfilingModeMeasuresALinkThroughTheReferenceAndWritesBothSides) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "FOGRA39L fixture not built";
    TempDir dir;
    ToolHandle tool(dir.Slash().c_str());
    tool.Tool().m_AbstractOutprof = 1;  // as after optimize4: the paper profile is a link
    tool.Tool().m_RefName = fogra;
    tool.Tool().LoadRefProfile();
    const std::string link = dir.File("cmyk2cmyk5neutral.mcc");
    int mean = kUntouched, max = kUntouched;
    ASSERT_EQ(optimize1(tool.h, link.c_str(), &mean, &max), 0);
    EXPECT_LE(mean, 20);  // the identity link sends every colour back to itself
    Measured_IT8 in, out;
    ASSERT_EQ(in.ReadIt8(link + "_inputvalues_big.it8"), 0);
    ASSERT_EQ(out.ReadIt8(link + "_outputvalues_big.it8"), 0);
    ASSERT_EQ(in.PatchCount(), 194481);
    ASSERT_EQ(out.PatchCount(), 194481);
    // The last sample, 240 on every channel: 94 % after rounding, with the reference's colour.
    CProfil printer;
    const double last[4] = {240, 240, 240, 240};
    ASSERT_TRUE(LoadProfile(printer, fogra));
    EXPECT_EQ(in.GetCmyk(194480, 3), 94.0);
    EXPECT_NEAR(out.GetLab(194480, 0), CmykLab(printer, last).L, 0.05);
}

}  // namespace
}  // namespace vantrel::test
