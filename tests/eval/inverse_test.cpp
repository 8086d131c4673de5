// Inverse evaluation: the direction-1 tables (8- and 16-bit, Lab and XYZ, matrix/TRC) against
// lcms2 on the same tags, and the inverse search.
#include <gtest/gtest.h>

#include <memory>
#include <random>

#include "eval/inverse.h"
#include "eval_helpers.h"

namespace vantrel {
namespace {

using namespace test;

std::vector<Lab> LabSamples() {
    std::vector<Lab> samples;
    for (int L = 0; L <= 100; L += 10)
        for (int a = -100; a <= 100; a += 20)
            for (int b = -100; b <= 100; b += 20) samples.push_back(Lab{double(L), double(a), double(b)});
    return samples;
}

// The tag's own pipeline as lcms2 reads it (input curves, grid, output curves, and the matrix of
// an XYZ table), evaluated at the table inputs a Lab stands for: L* / 100 and (a* + 127.5) / 255
// for a 16-bit Lab table, (a* + 128) / 255 for an 8-bit one, XYZ / 1.99997 for an XYZ one.
void OracleTable(cmsPipeline* pipeline, const Lab& lab, bool xyz, bool eightBit, double* device) {
    float in[3], out[8];
    if (xyz) {
        const cmsCIELab l{lab.L, lab.a, lab.b};
        cmsCIEXYZ v;
        cmsLab2XYZ(cmsD50_XYZ(), &v, &l);
        in[0] = float(v.X * 32768.0 / 65535.0);
        in[1] = float(v.Y * 32768.0 / 65535.0);
        in[2] = float(v.Z * 32768.0 / 65535.0);
    } else {
        const double half = eightBit ? 128.0 : 127.5;
        in[0] = float(lab.L / 100.0);
        in[1] = float((lab.a + half) / 255.0);
        in[2] = float((lab.b + half) / 255.0);
    }
    cmsPipelineEvalFloat(in, out, pipeline);
    for (int k = 0; k < 4; ++k) device[k] = out[k] * 255.0;
}

TEST(InverseEvaluation, CmykTablesAgreeWithLcmsOnTheSameTables) {
    // The device answers differ where the output curves act: per grid corner here, after the
    // interpolation in lcms2. They are compared by their colours through the same forward table,
    // and once more with the grid read raw and the output curves applied after it, where the two
    // agree to rounding. (lcms2's own Lab-to-CMYK transform is no oracle here: it reshapes dark
    // colours outside the gamut before the table, by up to 20 device units on these profiles.)
    struct Case {
        const char* name;
        std::string path;
        const char* b2a;
        cmsTagSignature tag;
        double meanLimit, maxLimit;
    };
    const Case cases[] = {
        {"FOGRA39L B2A1", FixtureProfile("FOGRA39L"), "B2A1", cmsSigBToA1Tag, 0.3, 2.0},
        {"TR003 B2A1", FixtureProfile("TR003"), "B2A1", cmsSigBToA1Tag, 0.6, 4.0},
        {"default_cmyk B2A1 (mft1)", SystemProfile("ghostscript/default_cmyk.icc"), "B2A1", cmsSigBToA1Tag, 0.3, 4.0},
        {"ps_cmyk B2A0 (XYZ, matrix)", SystemProfile("ghostscript/ps_cmyk.icc"), "B2A0", cmsSigBToA0Tag, 0.05, 0.5},
    };
    int tested = 0;
    for (const Case& c : cases) {
        if (c.path.empty()) continue;
        ++tested;
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, c.path, "A2B1", c.b2a)) << c.name;
        std::unique_ptr<void, decltype(&cmsCloseProfile)> profile(cmsOpenProfileFromFile(c.path.c_str(), "r"),
                                                                   &cmsCloseProfile);
        auto* pipeline = profile ? static_cast<cmsPipeline*>(cmsReadTag(profile.get(), c.tag)) : nullptr;
        const auto forward = MakeLcmsTransform(c.path, TYPE_CMYK_DBL, true);
        ASSERT_TRUE(pipeline && forward) << c.name;
        const bool xyz = p.m_Lut[1].pcs == "XYZ";
        const bool eightBit = p.m_Precision[1] == 0;
        const int entries = p.m_Lut[1].outputEntries;
        const bool curves = entries >= 256 && !p.m_OutputIdentity[1];
        DeltaStats stats;
        double largestCurveAfter = 0;
        for (const Lab& lab : LabSamples()) {
            double ours[4] = {lab.L * 2.55, lab.a, lab.b, 0};
            EXPECT_EQ(LabToCmyk(p, ours), 1);
            double theirs[4];
            OracleTable(pipeline, lab, xyz, eightBit, theirs);
            stats.Add(Difference(OracleLab(forward, ours, 4), OracleLab(forward, theirs, 4)));
            if (!curves) continue;
            double raw[4] = {lab.L * 2.55, lab.a, lab.b, 0};
            p.m_OutputIdentity[1] = 1;
            LabToCmyk(p, raw);
            p.m_OutputIdentity[1] = 0;
            for (int j = 0; j < 4; ++j) {
                const double position = eightBit ? raw[j] : raw[j] * 257.0 * (entries - 1) / 65535.0;
                const int k = std::min(static_cast<int>(position), entries - 1);
                const uint16_t* curve = &p.m_OutputCurves[1][static_cast<size_t>(j * entries)];
                const double v = k < entries - 1 ? curve[k] + (curve[k + 1] - curve[k]) * (position - k) : curve[k];
                largestCurveAfter = std::max(largestCurveAfter, std::fabs((eightBit ? v : v / 257.0) - theirs[j]));
            }
        }
        stats.Report(std::string(c.name) + " LabToCmyk vs lcms2");
        std::printf("[ device   ] %-48s %.3f of 255 with the curves after the grid\n", c.name, largestCurveAfter);
        EXPECT_LT(stats.Mean(), c.meanLimit) << c.name;
        EXPECT_LT(stats.max, c.maxLimit) << c.name;
        EXPECT_LT(largestCurveAfter, eightBit ? 0.6 : 0.05) << c.name;
    }
    if (tested == 0) GTEST_SKIP() << "no CMYK profiles available";
}

TEST(InverseEvaluation, MatrixTrcRgbAgreesWithLcms) {
    // The inverse tone curves are 256-entry tables indexed by linear light in steps of 1/255,
    // coarse in the shadows (one step is some 13 device steps of sRGB there, up to 3.5 in L*):
    // compared by colour, for the colours inside the RGB gamut, which have one answer.
    int tested = 0;
    for (const char* name : {"sRGB.icc", "compatibleWithAdobeRGB1998.icc"}) {
        const std::string path = SystemProfile(name);
        if (path.empty()) continue;
        ++tested;
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path)) << name;
        const auto inverse = MakeLcmsTransform(path, TYPE_RGB_DBL, false);
        const auto forward = MakeLcmsTransform(path, TYPE_RGB_DBL, true);
        ASSERT_TRUE(inverse && forward);
        DeltaStats stats;
        for (const Lab& lab : LabSamples()) {
            double theirs[3];
            OracleDevice(inverse, lab, theirs, 3);
            if (*std::min_element(theirs, theirs + 3) <= 0 || *std::max_element(theirs, theirs + 3) >= 255) continue;
            double ours[3] = {lab.L * 2.55, lab.a, lab.b};
            LabToRgb(p, ours);
            stats.Add(Difference(OracleLab(forward, ours, 3), OracleLab(forward, theirs, 3)));
        }
        stats.Report(std::string(name) + " LabToRgb vs lcms2");
        EXPECT_GT(stats.count, 50);
        EXPECT_LT(stats.Mean(), 0.6) << name;
        EXPECT_LT(stats.max, 4.0) << name;
    }
    if (tested == 0) GTEST_SKIP() << "no RGB profiles available";
}

TEST(InverseSearch, KeepsOnlyStrictImprovements) {
    // L* = 60 - 24 c, a* = 40 m; yellow changes nothing, so no step of it is ever an improvement.
    TempDir dir;
    CProfil p;
    auto lab = [](const std::vector<double>& f) { return Lab{60 - 24 * f[0], 40 * f[1], 0}; };
    WriteAndLoad(p, dir, "CMYK", {{"A2B1", Mft2Tag(DeviceToLabLut(4, 2, lab))}});
    const double start[4] = {0, 0, 100, 0};
    const double wanted[4] = {127.5, 63.75, 100, 0};
    const Lab target = CmykLab(p, wanted);
    double result[4], delta = -1;
    InverseSearch(p, target.L, target.a, target.b, start, result, delta);
    EXPECT_LT(delta, 0.1);
    EXPECT_NEAR(result[0], 127.5, 0.3);
    EXPECT_NEAR(result[1], 63.75, 0.3);
    EXPECT_EQ(result[2], 100.0);
    EXPECT_EQ(result[3], 0.0);
}

class InverseSearchTest : public ::testing::Test {
protected:
    void SetUp() override {
        const std::string path = FixtureProfile("FOGRA39L");
        if (path.empty()) GTEST_SKIP() << "FOGRA39L.icc not built";
        ASSERT_TRUE(LoadProfile(p_, path));
    }
    CProfil p_;
};

TEST_F(InverseSearchTest, LandsOnReachableTargetsFromTheTableAnswer) {
    std::mt19937 rng(11);
    std::uniform_real_distribution<double> value(5, 250);
    DeltaStats table, searched;
    int stuck = 0;
    for (int i = 0; i < 300; ++i) {
        const double cmyk[4] = {value(rng), value(rng), value(rng), value(rng) * 0.6};
        const Lab target = CmykLab(p_, cmyk);
        double start[4] = {target.L * 2.55, target.a, target.b, 0};
        LabToCmyk(p_, start);
        start[3] = cmyk[3];  // the search keeps black: start from the black that reaches the target
        double result[4];
        double delta = -1;
        EXPECT_EQ(InverseSearch(p_, target.L, target.a, target.b, start, result, delta), result);
        EXPECT_NEAR(delta, Difference(CmykLab(p_, result), target), 1e-9);
        EXPECT_EQ(result[3], start[3]);
        table.Add(Difference(CmykLab(p_, start), target));
        searched.Add(delta);
        stuck += delta > 0.5;
    }
    table.Report("FOGRA39L table answer (black fixed)");
    searched.Report("FOGRA39L after InverseSearch");
    EXPECT_LT(searched.Mean(), 0.15);
    EXPECT_LE(stuck, 6);  // a few targets sit where the three free channels saturate
}

TEST_F(InverseSearchTest, ReturnsTheStartWhenItCannotImproveAndStaysInRangeWhenItCannotReach) {
    const double start[4] = {40.0, 90.5, 12.25, 70.0};
    const Lab exact = CmykLab(p_, start);
    double result[4];
    double delta = -1;
    InverseSearch(p_, exact.L, exact.a, exact.b, start, result, delta);
    for (int c = 0; c < 4; ++c) EXPECT_EQ(result[c], start[c]);
    EXPECT_NEAR(delta, 0.0, 1e-12);

    const double grey[4] = {128, 128, 128, 20};
    const Lab wanted{50, 120, -120};  // far outside any press gamut
    InverseSearch(p_, wanted.L, wanted.a, wanted.b, grey, result, delta);
    for (int c = 0; c < 3; ++c) {
        EXPECT_GE(result[c], 0.0);
        EXPECT_LE(result[c], 255.0);
    }
    EXPECT_EQ(result[3], 20.0);
    EXPECT_LT(delta, Difference(CmykLab(p_, grey), wanted));
    EXPECT_NEAR(delta, Difference(CmykLab(p_, result), wanted), 1e-9);
}

}  // namespace
}  // namespace vantrel
