// optimize2 and optimize3 on small synthetic tables: how far one patch moves the nodes it
// reaches, and what bad input gives.
#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>
#include <string>
#include <vector>

#include "eval/eval_helpers.h"
#include "eval/grid_location.h"
#include "eval/inverse.h"
#include "eval/table_nodes.h"
#include "helpers/cgats_files.h"
#include "helpers/tool_handle.h"
#include "optimise/measured_corrections.h"

namespace vantrel::test {
namespace {

// A CMYK paper whose lightness follows cyan alone, both ways, with a 3-point B2A grid.
Bytes CyanPaper() {
    const LutSpec a2b = DeviceToLabLut(4, 2, [](const std::vector<double>& f) { return Lab{100 * (1 - f[0]), 0, 0}; });
    return IccBuilder("CMYK", "Lab ")
        .AddTag("A2B1", Mft2Tag(a2b))
        .AddTag("B2A1", Mft2Tag(DeviceLut(3, 4, 3, [](const std::vector<double>& f, int out) {
            return out == 0 ? 255.0 * (1.0 - f[0]) : 0.0;
        })))
        .AddTag("wtpt", XyzTag(0.9642, 1.0, 0.8249))
        .Build();
}

std::string Chart(const TempDir& dir, const std::string& name, const std::string& fields,
                  const std::vector<std::string>& rows) {
    return WriteText(dir, name, Cgats(fields, rows));
}

std::string Row(double cyan, const Lab& v) {
    char row[160];
    std::snprintf(row, sizeof row, "1 %.4f 0 0 0 %.4f %.4f %.4f", cyan, v.L, v.a, v.b);
    return row;
}

// The measurements analyse4 would leave: one cyan patch wanted at `wanted`, printed at `printed`.
void Measure(CIterativtoolDlg& tool, const TempDir& dir, double cyan, const Lab& wanted, const Lab& printed) {
    const std::string fields = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    tool.m_ReferenceIT8Name = Chart(dir, "ref.txt", fields, {Row(cyan, wanted)});
    tool.m_MeasIT8Name = Chart(dir, "meas.txt", fields, {Row(cyan, printed)});
    ASSERT_EQ(tool.m_ReferenceIT8->ReadIt8(tool.m_ReferenceIT8Name), 0);
    ASSERT_EQ(tool.m_MeasIT8->ReadIt8(tool.m_MeasIT8Name), 0);
    tool.m_RefWhite = tool.m_MeasWhite = Lab{100, 0, 0};
}

double Cyan(CProfil& p, const Lab& v) {
    double r[CProfil::kEvalSize] = {v.L * 2.55, v.a, v.b};
    LabToCmyk(p, r);
    return r[0];
}

Lab NodeLab(CProfil& p, int i, int j, int k) {
    double r[CProfil::kEvalSize] = {0, 0, 0, 0, double(i), double(j), double(k)};
    ReadNodeLab(p, r, 1, false);
    return {r[0] / 2.55, r[1], r[2]};
}

// A patch on a node moves that node, one inside a cell each corner by its own weight:
// optimize2 by 0.75 (node) or 0.6 x weight (corner) of half the device error the paper table
// sees, optimize3 by 1.5 (node) or 1.0 x weight (corner) of the Lab error.
TEST(MeasuredCorrection, OnePatchMovesItsNodeOrItsCornersByTheStepFactor) {
    for (const bool cell : {false, true}) {
        SCOPED_TRACE(cell ? "cell" : "node");
        TempDir dir;
        {  // optimize2: the paper is its own reference, so the patch is located where it prints.
            const std::string paperPath = WriteFile(dir.File("paper.icc"), CyanPaper());
            CProfil paper;
            ASSERT_TRUE(LoadProfile(paper, paperPath, "A2B1", "B2A1", true));
            const double cyan = cell ? 40.0 : 49.8047;  // L* 60 inside a cell, L* 50.195 on node (1, 1, 1)
            const Lab wanted = CmykLab(paper, std::vector<double>{cyan * 2.55, 0, 0, 0}.data());
            const Lab printed{wanted.L + 2, 0, 0};  // lighter: more cyan, which the white corner can take
            const double error = (Cyan(paper, wanted) - Cyan(paper, printed)) / 2;
            double where[CProfil::kEvalSize] = {wanted.L * 2.55, 0, 0};
            CornerWeights w{};
            if (cell) LocateCell(paper, where, 1, w);
            const std::vector<uint16_t> before = paper.m_Clut[1];

            ToolHandle h;
            h.Tool().m_OptFlagA = cell;
            h.Tool().m_PaperName = h.Tool().m_RefName = paperPath;
            Measure(h.Tool(), dir, cyan, wanted, printed);
            int o1 = 0, o2 = 0;
            ASSERT_EQ(optimize2(h.h, dir.File("out.icc").c_str(), &o1, &o2, 3), 0);
            EXPECT_EQ(o1 + o2, 555000);
            EXPECT_EQ(h.Tool().m_PaperName, dir.File("out.icc"));
            CProfil out;
            ASSERT_TRUE(LoadProfile(out, dir.File("out.icc")));
            for (int n = 0; n < 27; ++n) {
                const int i = n / 9, j = n / 3 % 3, k = n % 3;
                double move = !cell && n == 13 ? 0.75 * error : 0.0;
                // The cell's lower corner is (1, 1, 1).
                if (cell && i >= 1 && j >= 1 && k >= 1) move = 0.6 * w[(i - 1) * 4 + (j - 1) * 2 + (k - 1)] * error;
                // Corners barely inside the cell take cube roots of tiny fractions: a little slack.
                EXPECT_NEAR((out.m_Clut[1][4 * n] - before[4 * n]) / 257.0, move, 0.03) << "node " << n;
            }
        }
        {  // optimize3 on the identity 3CC of the library.
            ToolHandle h(dir.Slash().c_str());
            const std::string table = dir.File("neutral.3cc");
            CProfil before;
            ASSERT_TRUE(LoadProfile(before, table));
            const Lab wanted = cell ? Lab{52, 2, -3} : Lab{50, 0, 0};  // (16, 16, 16) is a node
            const Lab printed{wanted.L - 2, wanted.a + 1, wanted.b - 1};
            double where[CProfil::kEvalSize] = {wanted.L * 2.55, wanted.a, wanted.b};
            CornerWeights w{};
            const double g = cell ? LocateCell(before, where, 1, w) : LocateNearestNode(before, where, 1);
            const int i0 = int(where[0]), j0 = int(where[1]), k0 = int(where[2]);
            h.Tool().m_OptFlagA = cell;
            Measure(h.Tool(), dir, 50, wanted, printed);
            ASSERT_EQ(optimize3(h.h, table.c_str(), nullptr, nullptr, 0), 0);
            CProfil after;
            ASSERT_TRUE(LoadProfile(after, table));
            for (int corner = 0; corner < (cell ? 8 : 1); ++corner) {
                const int i = i0 + (corner >> 2 & 1), j = j0 + (corner >> 1 & 1), k = k0 + (corner & 1);
                const double factor = cell ? w[corner] : 1.5 * (1 - g);
                const Lab was = NodeLab(before, i, j, k), now = NodeLab(after, i, j, k);
                EXPECT_NEAR(now.L - was.L, factor * 2, 0.02) << corner;
                EXPECT_NEAR(now.a - was.a, -factor, 0.02) << corner;
                EXPECT_NEAR(now.b - was.b, factor, 0.02) << corner;
            }
        }
    }
}

// Input that gives nothing to correct from leaves the table as it was and says so; a stop
// request half-way still leaves a loadable profile.
TEST(MeasuredCorrection, BadMeasurementsLeaveTheTableAndAStopLeavesALoadableProfile) {
    const std::string cmyk = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    const std::vector<std::string> one = {"1 40 0 0 0 60 0 0"}, printed = {"1 40 0 0 0 58 0 0"};
    struct Variant {
        const char* name;
        std::string refFields, measFields;
        std::vector<std::string> ref, meas;
        int result;
        bool changes;
        bool stops = false;
    };
    const Variant variants[] = {
        {"patch counts differ", cmyk, cmyk, one, {printed[0], printed[0]}, kMeasuredNothingToCorrect, false},
        {"no device columns", "SAMPLE_ID LAB_L LAB_A LAB_B", cmyk, {"1 60 0 0"}, printed,
         kMeasuredNothingToCorrect, false},
        // 58 L* as XYZ (D50): the same correction as from Lab.
        {"XYZ only", "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z",
         "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z", {"1 40 0 0 0 27.1165 28.1233 23.1989"},
         {"1 40 0 0 0 25.0316 25.9610 21.4152"}, 0, true},
        {"stop request half-way", cmyk, cmyk, one, printed, 0, true, true},
    };
    for (const Variant& v : variants) {
        for (const bool three : {false, true}) {
            SCOPED_TRACE(std::string(v.name) + (three ? " optimize3" : " optimize2"));
            TempDir dir;
            ProgressLog log;
            ToolHandle h(dir.Slash().c_str());
            CIterativtoolDlg& tool = h.Tool();
            const std::string paper = WriteFile(dir.File("paper.icc"), CyanPaper());
            const std::string target = three ? dir.File("neutral.3cc") : dir.File("out.icc");
            const std::string start = three ? target : paper;
            const Bytes before = ReadFile(start);
            tool.m_PaperName = paper;
            tool.m_ReferenceIT8Name = Chart(dir, "ref.txt", v.refFields, v.ref);
            tool.m_MeasIT8Name = Chart(dir, "meas.txt", v.measFields, v.meas);
            tool.m_ReferenceIT8->ReadIt8(tool.m_ReferenceIT8Name);
            tool.m_MeasIT8->ReadIt8(tool.m_MeasIT8Name);
            tool.m_RefWhite = tool.m_MeasWhite = Lab{100, 0, 0};
            // Stopped while the nodes are written: those before the patch's cell took their part.
            if (v.stops) log.cancelAt = three ? 56 : 8;
            const int result = three ? optimize3(h.h, target.c_str(), nullptr, nullptr, 3)
                                     : optimize2(h.h, target.c_str(), nullptr, nullptr, 3);
            EXPECT_EQ(result, v.result);
            EXPECT_EQ(ReadFile(target) != before, v.changes);
            CProfil out;
            EXPECT_TRUE(LoadProfile(out, target));
        }
    }
    ToolHandle h;
    EXPECT_EQ(optimize2(h.h, "", nullptr, nullptr, 0), kMeasuredBadArgument);
    EXPECT_EQ(optimize2(h.h, "out.icc", nullptr, nullptr, 0), kMeasuredNotLoaded);  // no paper profile named
    EXPECT_EQ(optimize3(h.h, "/nonexistent/x.3cc", nullptr, nullptr, 0), kMeasuredNotLoaded);
    EXPECT_EQ(optimize2(nullptr, "out.icc", nullptr, nullptr, 0), 1);
    EXPECT_EQ(optimize3(nullptr, "x.3cc", nullptr, nullptr, 0), 1);
}

}  // namespace
}  // namespace vantrel::test
