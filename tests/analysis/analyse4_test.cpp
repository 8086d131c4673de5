// analyse4 through the C interface: the four figures of a proof, the alignment of charts in
// another order, the simulated reference, the ISD step at the fixed path and bad input.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

#include "helpers/cgats_files.h"
#include "helpers/chart_figures.h"
#include "helpers/tool_handle.h"
#include "support/platform.h"

namespace fs = std::filesystem;
using namespace vantrel;
using namespace vantrel::test;

namespace {

struct Host {
    TempDir dir;
    ToolHandle tool{dir.Slash().c_str()};
    int out[4] = {-777, -777, -777, -777};
    int Run(const std::string& paper, const std::string& refProfile, const std::string& ref, const std::string& meas) {
        return analyse4(tool.h, paper.c_str(), refProfile.c_str(), ref.c_str(), meas.c_str(), &out[0], &out[1],
                        &out[2], &out[3]);
    }
    std::string Copy(const std::string& from, const std::string& name) {
        return WriteText(dir, name, ReadText(from));
    }
};

std::vector<ChartPatch> Fogra(const char* name) { return ReadCmykChart(SystemIccDir() + name + ".ti3"); }

// The colour of the first patch of `chart` with the device values of `p`, zeros when none.
std::array<double, 3> FirstMatch(const std::vector<ChartPatch>& chart, const ChartPatch& p) {
    for (const ChartPatch& q : chart)
        if (q.cmyk == p.cmyk) return q.lab;
    return {0, 0, 0};
}

// The fixed ISD path is cleared for each test; whatever stood there comes back when it ends.
class FixedIsdPath {
public:
    FixedIsdPath() : path_(platform::IsdProfilePath()), saved_(path_ + ".saved-by-test") {
        if (fs::exists(path_)) fs::rename(path_, saved_);
    }
    ~FixedIsdPath() {
        std::error_code ignored;
        fs::remove(path_, ignored);
        if (fs::exists(saved_)) fs::rename(saved_, path_, ignored);
    }
    const std::string& Path() const { return path_; }

private:
    std::string path_, saved_;
};

class Analyse4 : public ::testing::Test {
protected:
    FixedIsdPath isd;
};

}  // namespace

TEST_F(Analyse4, ChartPairsGiveTheirOwnFigures) {
    if (!fs::exists(SystemIccDir() + "FOGRA40L.ti3")) GTEST_SKIP() << "no FOGRA data";
    for (const char* other : {"FOGRA40L", "FOGRA39L"}) {
        Host host;
        const std::string ref = host.Copy(SystemIccDir() + "FOGRA39L.ti3", "ref.ti3");
        const std::string meas = host.Copy(SystemIccDir() + other + ".ti3", "meas.ti3");
        ASSERT_EQ(host.Run("", "", ref, meas), 0);
        const ChartFigures want = Figures(Fogra("FOGRA39L"), Fogra(other));
        EXPECT_EQ(host.out[0], want.mean) << other;
        EXPECT_EQ(host.out[1], want.maximum) << other;
        EXPECT_EQ(host.out[2], want.white) << other;
        EXPECT_EQ(host.out[3], 0);  // no paper profile, no gamut
        EXPECT_GT(want.mean, std::string(other) == "FOGRA40L" ? 1000 : -1);
    }
}

TEST_F(Analyse4, InGamutShareFallsForAPaperOfSmallerGamut) {
    const std::string fogra = FixtureProfile("FOGRA39L"), swop = FixtureProfile("TR003");
    if (fogra.empty() || swop.empty()) GTEST_SKIP() << "no Argyll fixtures";
    int share[2];
    for (int k = 0; k < 2; ++k) {
        Host host;
        const std::string chart = host.Copy(SystemIccDir() + "FOGRA39L.ti3", "chart.ti3");
        ASSERT_EQ(host.Run(k == 0 ? fogra : swop, "", chart, chart), 0);
        EXPECT_EQ(host.out[0] + host.out[1] + host.out[2], 0);
        share[k] = host.out[3];
    }
    EXPECT_GT(share[0], 80000);  // the chart's own printing condition
    EXPECT_LT(share[1], share[0] - 5000);
}

// The measurement in reverse order (same count) is rewritten in the reference's order; a subset
// in reverse order has the reference rewritten in its order. Either way by first match.
TEST_F(Analyse4, ChartsInAnotherOrderAreAlignedByFirstMatch) {
    if (!fs::exists(SystemIccDir() + "FOGRA40L.ti3")) GTEST_SKIP() << "no FOGRA data";
    const std::vector<ChartPatch> ref39 = Fogra("FOGRA39L"), all40 = Fogra("FOGRA40L");
    std::vector<ChartPatch> reversed(all40.rbegin(), all40.rend()), subset;
    for (std::size_t i = all40.size(); i-- > 0;)
        if (i % 7 == 3) subset.push_back(all40[i]);
    for (const bool whole : {true, false}) {
        Host host;
        const std::vector<ChartPatch>& measured = whole ? reversed : subset;
        const std::string ref = host.Copy(SystemIccDir() + "FOGRA39L.ti3", "ref.ti3");
        const std::string meas = WriteText(host.dir, "meas.it8", ChartText(measured));
        ASSERT_EQ(host.Run("", "", ref, meas), 0);

        // The order-giving chart with each patch's colour found in the other.
        const std::vector<ChartPatch>& order = whole ? ref39 : measured;
        const std::vector<ChartPatch>& scanned = whole ? measured : ref39;
        std::vector<ChartPatch> aligned = order;
        for (ChartPatch& p : aligned) p.lab = FirstMatch(scanned, p);
        const std::string written = (whole ? meas : ref) + ".$$$";
        EXPECT_FALSE(fs::exists((whole ? ref : meas) + ".$$$"));
        const std::vector<ChartPatch> file = ReadCmykChart(written);
        ASSERT_EQ(file.size(), order.size());
        for (std::size_t i = 0; i < file.size(); ++i) {
            EXPECT_EQ(file[i].cmyk, order[i].cmyk) << i;  // whole percent already
            for (int c = 0; c < 3; ++c) EXPECT_NEAR(file[i].lab[c], aligned[i].lab[c], 5e-5) << i;
        }
        EXPECT_EQ(Lines(ReadText(written))[3],
                  "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z");
        // Figures of the aligned pair; the whites come from the files as given.
        const ChartFigures want = whole ? Figures(ref39, aligned) : Figures(aligned, measured);
        EXPECT_EQ(host.out[0], want.mean) << whole;
        EXPECT_EQ(host.out[1], want.maximum) << whole;
        EXPECT_EQ(host.out[2], HostValue(Dist(PaperWhite(measured), PaperWhite(ref39)))) << whole;
    }
}

TEST_F(Analyse4, CountsThatCannotBeAlignedGiveTheUnalignedFigures) {
    Host host;
    const std::string fields = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    const std::string ref = WriteText(host.dir, "ref.it8", Cgats(fields, {"1 0 0 0 0 95 0 0", "2 50 0 0 0 60 0 0"}));
    const std::string meas = WriteText(host.dir, "meas.it8",
                                       Cgats(fields, {"1 0 0 0 0 95 0 0", "2 50 0 0 0 61 0 0", "3 0 50 0 0 60 9 0"}));
    fs::create_directory(meas + ".$$$");  // the aligned file cannot be written
    ASSERT_EQ(host.Run("", "", ref, meas), 0);
    EXPECT_EQ(host.out[0], 100000);
    EXPECT_EQ(host.out[1], 100000);
}

// Without a reference measurement the reference profile predicts one beside itself.
TEST_F(Analyse4, TheReferenceProfileStandsInForAMissingReference) {
    const std::string fogra = FixtureProfile("FOGRA39L");
    if (fogra.empty()) GTEST_SKIP() << "no Argyll fixture";
    Host host;
    const std::string profile = host.Copy(fogra, "ref.icc");
    const std::vector<std::array<double, 4>> cmyk = {{0, 0, 0, 0}, {39.5, 0, 0, 0}, {100, 60.25, 0, 20}, {0, 0, 100, 0}};
    std::vector<std::string> rows;
    for (std::size_t i = 0; i < cmyk.size(); ++i)
        rows.push_back(std::to_string(i + 1) + " " + std::to_string(cmyk[i][0]) + " " + std::to_string(cmyk[i][1]) +
                       " " + std::to_string(cmyk[i][2]) + " " + std::to_string(cmyk[i][3]) + " 50 10 -10");
    const std::string meas = WriteText(host.dir, "proof.it8",
                                       Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B", rows));
    ASSERT_EQ(host.Run("", profile, "", meas), 0);

    const std::vector<ChartPatch> simulated = ReadCmykChart(profile + ".it8");
    ASSERT_EQ(simulated.size(), cmyk.size());
    cmsHPROFILE in = cmsOpenProfileFromFile(profile.c_str(), "r"), lab = cmsCreateLab4Profile(nullptr);
    cmsHTRANSFORM t = cmsCreateTransform(in, TYPE_CMYK_DBL, lab, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC,
                                         cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
    ASSERT_NE(t, nullptr);
    std::vector<ChartPatch> measured;
    for (std::size_t i = 0; i < cmyk.size(); ++i) {
        for (int c = 0; c < 4; ++c) EXPECT_EQ(simulated[i].cmyk[c], std::trunc(cmyk[i][c] + 0.5)) << i;
        double want[3];
        cmsDoTransform(t, cmyk[i].data(), want, 1);
        for (int c = 0; c < 3; ++c) EXPECT_NEAR(simulated[i].lab[c], want[c], 1.0) << i << " " << c;
        measured.push_back({cmyk[i], {50, 10, -10}});
    }
    cmsDeleteTransform(t);
    cmsCloseProfile(lab);
    cmsCloseProfile(in);
    // The proof is judged against the predictions.
    const ChartFigures want = Figures(simulated, measured);
    EXPECT_EQ(host.out[0], want.mean);
    EXPECT_EQ(host.out[1], want.maximum);
    EXPECT_EQ(host.out[2], want.white);
}

// Bad charts: clean figures, no crash, the given files untouched.
TEST_F(Analyse4, BadChartsGiveCleanFigures) {
    const std::string cmyk = "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B";
    std::vector<std::string> many;
    for (int i = 0; i < 20000; ++i)
        many.push_back(std::to_string(i + 1) + " " + std::to_string(i % 101) + " " + std::to_string(i / 101 % 101) +
                       " " + std::to_string(i / 10201) + " 0 50 0 0");
    struct Case {
        const char* name;
        std::string ref, meas;
        int want[4];
    } cases[] = {
        {"no device columns", Cgats("SAMPLE_ID LAB_L LAB_A LAB_B", {"1 95 0 0", "2 50 0 0"}),
         Cgats("SAMPLE_ID LAB_L LAB_A LAB_B", {"1 95 0 0", "2 51 0 0"}), {255000, 300000, 0, 0}},
        {"XYZ only", Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z", {"1 0 0 0 0 96.42 100 82.49", "2 9 0 0 0 20 20 20"}),
         Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z", {"1 0 0 0 0 96.42 100 82.49", "2 9 0 0 0 20 20 20"}),
         {0, 0, 0, 0}},
        {"one patch", Cgats(cmyk, {"1 0 0 0 0 95 0 0"}), Cgats(cmyk, {"1 0 0 0 0 94 0 0"}), {1000, 1000, 0, 0}},
        {"20000 patches", Cgats(cmyk, many), Cgats(cmyk, many), {0, 0, 0, 0}},
        {"different kinds", Cgats("SAMPLE_ID RGB_R RGB_G RGB_B LAB_L LAB_A LAB_B", {"1 255 255 255 95 0 0", "2 0 0 0 5 0 0"}),
         Cgats(cmyk, {"1 0 0 0 0 95 0 0", "2 0 0 0 100 5 0 0"}), {255000, 300000, 0, 0}},
    };
    for (const Case& c : cases) {
        for (const bool three : {false, true}) {
            Host host;
            const std::string ref = WriteText(host.dir, "ref.it8", c.ref), meas = WriteText(host.dir, "meas.it8", c.meas);
            if (three) {
                int out1 = -777, out2 = -777;
                ASSERT_EQ(analyse3(host.tool.h, "", host.dir.File("neutral.3cc").c_str(), ref.c_str(), meas.c_str(),
                                   &out1, &out2), 0);
                EXPECT_EQ(out1, c.want[0]) << c.name;
                EXPECT_EQ(out2, c.want[1]) << c.name;
            } else {
                ASSERT_EQ(host.Run("", "", ref, meas), 0);
                for (int k = 0; k < 4; ++k) EXPECT_EQ(host.out[k], c.want[k]) << c.name << " out" << k + 1;
            }
            EXPECT_EQ(ReadText(ref), c.ref) << c.name;
            EXPECT_EQ(ReadText(meas), c.meas) << c.name;
        }
    }
    // No measurement: nothing happens and nothing is written.
    Host host;
    ASSERT_EQ(host.Run("", "", "", ""), 0);
    EXPECT_EQ(host.out[0], -777);
    EXPECT_EQ(analyse4(host.tool.h, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr), 0);
}

TEST_F(Analyse4, AnIsdProfileOfTheKnownSizeReplacesTheMeasurementFirst) {
    for (const bool known : {true, false}) {
        Host host;
        std::string neutral = ReadText(host.dir.File("neutral.3cc"));
        ASSERT_EQ(neutral.size(), 714612u);
        if (!known) neutral += '\0';
        WriteText(host.dir, "isd", neutral);
        fs::copy_file(host.dir.File("isd"), isd.Path(), fs::copy_options::overwrite_existing);
        const std::string text = Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B",
                                       {"1 0 0 0 0 95 0 0", "2 40 0 0 0 60 -20 -30"});
        const std::string ref = WriteText(host.dir, "ref.it8", text), meas = WriteText(host.dir, "meas.it8", text);
        ASSERT_EQ(host.Run("", "", ref, meas), 0);
        EXPECT_EQ(fs::exists(meas + "isd.it8"), known);
        if (known) {
            // The user's file now holds the ISD copy: whole percent, colours through the identity.
            EXPECT_EQ(ReadText(meas), ReadText(meas + "isd.it8"));
            EXPECT_NE(ReadText(meas), text);
            EXPECT_LT(host.out[0], 100);
        } else {
            EXPECT_EQ(ReadText(meas), text);
            EXPECT_EQ(host.out[0], 0);
        }
    }
}
