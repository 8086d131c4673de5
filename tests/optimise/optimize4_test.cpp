// optimize4: calibration runs of a device link through analyse3 and optimize4, measured with a
// printer that lcms2 evaluates.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <cmath>
#include <filesystem>
#include <sstream>

#include "colour/colour_math.h"
#include "helpers/cgats_files.h"
#include "helpers/icc_builder.h"
#include "helpers/multi_ink_profiles.h"
#include "helpers/test_paths.h"
#include "helpers/tool_handle.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// A chart of the link's 5-point grid: every C, M, Y of 0, 25 .. 100 %, once without black (and
// extra inks) and once with 50 % black, or 50 % of the first extra ink (those never move the link).
std::vector<std::array<int, 7>> GridChart(int channels) {
    std::vector<std::array<int, 7>> chart;
    for (int other : {0, 50})
        for (int c = 0; c <= 100; c += 25)
            for (int m = 0; m <= 100; m += 25)
                for (int y = 0; y <= 100; y += 25) {
                    std::array<int, 7> p = {c, m, y, channels == 4 ? other : 0, channels == 4 ? 0 : other, 0, 0};
                    chart.push_back(p);
                }
    return chart;
}
bool OnPlane(const std::array<int, 7>& p) { return p[3] == 0 && p[4] == 0 && p[5] == 0 && p[6] == 0; }

// Colours through lcms2, absolute colorimetric: a profile's A2B, optionally behind a link; CMYK
// or seven channels in percent.
class Printer {
public:
    Printer(const std::string& profile, const std::string& link, int channels = 4) : channels_(channels) {
        lab_ = cmsCreateLab4Profile(nullptr);
        cmsHPROFILE device = cmsOpenProfileFromFile(profile.c_str(), "r");
        const cmsUInt32Number format = channels == 4 ? TYPE_CMYK_DBL
                                                     : (COLORSPACE_SH(PT_MCH7) | CHANNELS_SH(7) | BYTES_SH(0) | FLOAT_SH(1));
        if (link.empty()) {
            transform_ = cmsCreateTransform(device, format, lab_, TYPE_Lab_DBL, INTENT_ABSOLUTE_COLORIMETRIC, 0);
        } else {
            cmsHPROFILE chain[3] = {cmsOpenProfileFromFile(link.c_str(), "r"), device, lab_};
            cmsUInt32Number intents[3] = {INTENT_PERCEPTUAL, INTENT_ABSOLUTE_COLORIMETRIC, INTENT_ABSOLUTE_COLORIMETRIC};
            cmsBool bpc[3] = {0, 0, 0};
            cmsFloat64Number adapt[3] = {1, 1, 1};
            transform_ = cmsCreateExtendedTransform(nullptr, 3, chain, bpc, intents, adapt, nullptr, 0, format,
                                                    TYPE_Lab_DBL, cmsFLAGS_NOOPTIMIZE);
            cmsCloseProfile(chain[0]);
        }
        cmsCloseProfile(device);
    }
    ~Printer() {
        if (transform_) cmsDeleteTransform(transform_);
        cmsCloseProfile(lab_);
    }
    bool Ok() const { return transform_ != nullptr; }
    cmsCIELab operator()(const std::array<int, 7>& percent) const {
        double in[7];
        for (int c = 0; c < 7; ++c) in[c] = percent[c];
        cmsCIELab out;
        cmsDoTransform(transform_, in, &out, 1);
        out.L += shift_.L;
        out.a += shift_.a;
        out.b += shift_.b;
        return out;
    }
    // A printer that prints everything this much off.
    Printer& Shifted(double L, double a, double b) {
        shift_ = {L, a, b};
        return *this;
    }

private:
    int channels_;
    cmsCIELab shift_ = {0, 0, 0};
    cmsHPROFILE lab_;
    cmsHTRANSFORM transform_ = nullptr;
};

// The chart as a measurement file, colours from `print`.
std::string ChartFile(const TempDir& dir, const std::string& name, const Printer& print, int channels) {
    std::vector<std::string> rows;
    int id = 1;
    for (const auto& p : GridChart(channels)) {
        const cmsCIELab lab = print(p);
        std::ostringstream row;
        row << id++;
        for (int c = 0; c < channels; ++c) row << ' ' << p[c];
        row << ' ' << lab.L << ' ' << lab.a << ' ' << lab.b;
        rows.push_back(row.str());
    }
    const std::string device = channels == 4 ? "CMYK_C CMYK_M CMYK_Y CMYK_K"
                                             : "7CLR_1 7CLR_2 7CLR_3 7CLR_4 7CLR_5 7CLR_6 7CLR_7";
    return WriteText(dir, name, Cgats("SAMPLE_ID " + device + " LAB_L LAB_A LAB_B", rows));
}

// Mean colour difference of the patches on the corrected plane between two charts' colours.
double MeanError(const Printer& reference, const Printer& proof, int channels) {
    double sum = 0;
    int count = 0;
    for (const auto& p : GridChart(channels)) {
        if (!OnPlane(p)) continue;
        const cmsCIELab a = reference(p), b = proof(p);
        sum += DeltaE(a.L, a.a, a.b, b.L, b.a, b.b);
        ++count;
    }
    return sum / count;
}

}  // namespace

// Three calibration runs of an identity link against a reference: CMYK with a TR003 printer
// against FOGRA39L data, seven colourants with the ink-model printer against the same model
// printing 2 L* darker and 3 b* yellower. The printer's colours come closer to the reference run
// by run (CMYK: 3.6, 2.3, 2.0, 2.0 here); nodes off the black = 0, extra = 0 plane, and the black
// and extra outputs, never move.
TEST(Optimize4, CalibrationRunsBringThePrinterCloserToTheReference) {
    const std::string reference = FixtureProfile("FOGRA39L");
    if (reference.empty() || FixtureProfile("TR003").empty()) GTEST_SKIP() << "FOGRA39L or TR003 fixture not built";
    for (const int channels : {4, 7}) {
        SCOPED_TRACE(channels);
        TempDir dir;
        ToolHandle tool(dir.Slash().c_str());
        const std::string printer = channels == 4 ? FixtureProfile("TR003") : MultiInkProfile(InkSet::kCmykRGB);
        const std::string link = dir.File("link.mcc");
        std::filesystem::copy_file(dir.File(channels == 4 ? "cmyk2cmyk5neutral.mcc" : "cmykrgb2cmykrgb5neutral.mcc"), link);
        Printer press(channels == 4 ? reference : printer, "", channels);
        if (channels == 7) press.Shifted(-2, 0, 3);
        const std::string ref = ChartFile(dir, "press.it8", press, channels);
        CProfil before;
        before.ReadTagTable(1, link);
        ASSERT_EQ(before.LoadLut(1, "A2B0", link), 1);

        double error = MeanError(press, Printer(printer, link, channels), channels);
        const double start = error;
        for (int run = 1; run <= 3; ++run) {
            const Printer proof(printer, link, channels);
            ASSERT_TRUE(proof.Ok());
            const std::string meas = ChartFile(dir, "proof_cal" + std::to_string(run) + ".it8", proof, channels);
            int out[2];
            ASSERT_EQ(analyse3(tool.h, printer.c_str(), link.c_str(), ref.c_str(), meas.c_str(), &out[0], &out[1]), 0);
            ASSERT_EQ(optimize4(tool.h, link.c_str(), &out[0], &out[1], nullptr, printer.c_str(), 1), 0);
            EXPECT_EQ(tool.Tool().m_CalRun, run);
            const double now = MeanError(press, Printer(printer, link, channels), channels);
            std::printf("[ optimize4] %d channels, calibration run %d: mean dE76 at the corrected nodes %.2f -> %.2f\n",
                        channels, run, error, now);
            EXPECT_LE(now, error + 0.01) << "run " << run;
            error = now;
        }
        EXPECT_LT(error, start - 0.5);

        CProfil after;
        after.ReadTagTable(1, link);
        ASSERT_EQ(after.LoadLut(1, "A2B0", link), 1);
        const size_t m = static_cast<size_t>(channels), nodes = after.m_Clut[1].size() / m;
        for (size_t node = 0; node < nodes; ++node) {
            size_t rest = node;
            bool onPlane = true;  // indices of channels 3.. (the last count fastest) all 0
            for (size_t axis = m; axis-- > 3; rest /= 5) onPlane = onPlane && rest % 5 == 0;
            for (size_t c = 0; c < m; ++c) {
                if (!onPlane || c >= 3) {
                    ASSERT_EQ(after.m_Clut[1][m * node + c], before.m_Clut[1][m * node + c]) << node;
                }
            }
        }
    }
}

// Links that cannot be corrected leave their files loadable and say so.
TEST(Optimize4, BadLinksAndProfilesGiveACleanResult) {
    TempDir dir;
    const std::string text = Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B", {"1 0 0 0 0 95 0 0", "2 50 0 0 0 60 -30 -40"});
    const std::string broken = WriteFile(dir.File("broken.mcc"), Bytes(300, 7));
    const struct {
        const char* what;
        std::string link;
        int result;
    } cases[] = {
        {"no name", "", -1},
        {"missing link", dir.File("absent.mcc"), 2},
        {"broken link", broken, 2},
        {"seven-colourant link without measurements", "cmykrgb2cmykrgb5neutral.mcc", 0},
    };
    for (const auto& c : cases) {
        ToolHandle tool(dir.Slash().c_str());
        const std::string link = c.link.empty() || c.link[0] == '/' ? c.link : dir.File(c.link);
        const Bytes before = ReadFile(link);
        int out[2] = {0, 0};
        EXPECT_EQ(optimize4(tool.h, link.c_str(), &out[0], &out[1], nullptr, "", 1), c.result) << c.what;
        if (!link.empty()) {
            EXPECT_EQ(ReadFile(link), before) << c.what;
        }
    }
    EXPECT_EQ(optimize4(nullptr, "", nullptr, nullptr, nullptr, "", 0), 1);
}
