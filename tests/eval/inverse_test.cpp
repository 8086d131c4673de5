// Inverse evaluation: the direction-1 tables against lcms2 on the same tags, the Lab encoding
// of 8- and 16-bit tables, and the inverse search.
#include <gtest/gtest.h>

#include <random>

#include "colour/colour_math.h"
#include "eval/forward.h"
#include "eval/inverse.h"
#include "eval_oracle.h"
#include "helpers/icc_builder.h"
#include "icc/profil.h"

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

struct InverseCase {
    const char* name;
    std::string path;
    const char* b2a;
    cmsTagSignature tag;
    double meanLimit, maxLimit;
};

// The tag's own pipeline as lcms2 reads it (input curves, grid, output curves, and the matrix of
// an XYZ table), evaluated at the table inputs a Lab stands for: L* / 100 and (a* + 127.5) / 255
// for a 16-bit Lab table, (a* + 128) / 255 for an 8-bit one, XYZ / 1.99997 for an XYZ one.
class OraclePipeline {
public:
    OraclePipeline(const std::string& path, cmsTagSignature tag) : profile_(cmsOpenProfileFromFile(path.c_str(), "r")) {
        if (profile_) pipeline_ = static_cast<cmsPipeline*>(cmsReadTag(profile_, tag));
    }
    ~OraclePipeline() {
        if (profile_) cmsCloseProfile(profile_);
    }
    bool ok() const { return pipeline_ != nullptr; }
    void Device(const Lab& lab, bool xyz, bool eightBit, double* device) const {
        float in[3], out[8];
        if (xyz) {
            const cmsCIELab l{lab.L, lab.a, lab.b};
            cmsCIEXYZ v;
            cmsLab2XYZ(cmsD50_XYZ(), &v, &l);
            in[0] = float(v.X * 32768.0 / 65535.0);
            in[1] = float(v.Y * 32768.0 / 65535.0);
            in[2] = float(v.Z * 32768.0 / 65535.0);
        } else {
            in[0] = float(lab.L / 100.0);
            const double half = eightBit ? 128.0 : 127.5;
            in[1] = float((lab.a + half) / 255.0);
            in[2] = float((lab.b + half) / 255.0);
        }
        cmsPipelineEvalFloat(in, out, pipeline_);
        for (int k = 0; k < 4; ++k) device[k] = out[k] * 255.0;
    }

private:
    cmsHPROFILE profile_;
    cmsPipeline* pipeline_ = nullptr;
};

TEST(InverseEvaluation, CmykTablesAgreeWithLcmsOnTheSameTables) {
    // The device answers differ where the output curves act: per grid corner here, after the
    // interpolation in lcms2. They are compared by their colours through the same forward table.
    // (lcms2's own Lab-to-CMYK transform is no oracle here: it reshapes dark colours outside the
    // gamut before the table, by up to 20 device units on these profiles.)
    std::vector<InverseCase> cases;
    auto add = [&cases](const char* name, const std::string& path, const char* tag, cmsTagSignature sig, double mean,
                        double max) {
        if (!path.empty()) cases.push_back({name, path, tag, sig, mean, max});
    };
    add("FOGRA39L B2A1", FixtureProfile("FOGRA39L"), "B2A1", cmsSigBToA1Tag, 0.3, 2.0);
    add("TR003 B2A1", FixtureProfile("TR003"), "B2A1", cmsSigBToA1Tag, 0.6, 4.0);
    add("default_cmyk B2A1 (mft1)", SystemProfile("ghostscript/default_cmyk.icc"), "B2A1", cmsSigBToA1Tag, 0.3, 4.0);
    add("ps_cmyk B2A0 (XYZ, matrix)", SystemProfile("ghostscript/ps_cmyk.icc"), "B2A0", cmsSigBToA0Tag, 0.05, 0.5);
    if (cases.empty()) GTEST_SKIP() << "no CMYK profiles available";
    for (const auto& c : cases) {
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, c.path, "A2B1", c.b2a, false)) << c.name;
        OraclePipeline table(c.path, c.tag);
        LcmsTransform forward(c.path, TYPE_CMYK_DBL, true, INTENT_RELATIVE_COLORIMETRIC);
        ASSERT_TRUE(table.ok() && forward.ok()) << c.name;
        const bool xyz = p.m_Lut[1].pcs == "XYZ";
        const bool eightBit = p.m_Precision[1] == 0;
        const int entries = p.m_Lut[1].outputEntries;
        const bool curves = entries >= 256 && !p.m_OutputIdentity[1];
        DeltaStats stats;
        double largestDevice = 0, largestCurveAfter = 0;
        for (const Lab& lab : LabSamples()) {
            double ours[4] = {lab.L * 2.55, lab.a, lab.b, 0};
            EXPECT_EQ(LabToCmyk(p, ours), 1);
            double theirs[4];
            table.Device(lab, xyz, eightBit, theirs);
            for (int k = 0; k < 4; ++k) largestDevice = std::max(largestDevice, std::fabs(ours[k] - theirs[k]));
            stats.Add(Difference(OracleToLab(forward, ours, 4), OracleToLab(forward, theirs, 4)));

            // The same grid read raw, with the output curves applied after the interpolation as
            // lcms2 does: then the two agree to rounding.
            if (!curves) continue;
            double raw[4] = {lab.L * 2.55, lab.a, lab.b, 0};
            p.m_OutputIdentity[1] = 1;
            LabToCmyk(p, raw);
            p.m_OutputIdentity[1] = 0;
            for (int j = 0; j < 4; ++j) {
                const double position = eightBit ? raw[j] : raw[j] * 257.0 * (entries - 1) / 65535.0;
                const int k = std::min(static_cast<int>(position), entries - 1);
                const double u = position - k;
                const uint16_t* curve = &p.m_OutputCurves[1][static_cast<size_t>(j * entries)];
                double v = k < entries - 1 ? curve[k] + (curve[k + 1] - curve[k]) * u : curve[k];
                if (!eightBit) v /= 257.0;
                largestCurveAfter = std::max(largestCurveAfter, std::fabs(v - theirs[j]));
            }
        }
        stats.Report(std::string(c.name) + " LabToCmyk vs lcms2");
        std::printf("[ device   ] %-48s largest device difference %.2f of 255; %.3f with curves after\n", c.name,
                    largestDevice, largestCurveAfter);
        EXPECT_LT(stats.Mean(), c.meanLimit) << c.name;
        EXPECT_LT(stats.max, c.maxLimit) << c.name;
        EXPECT_LT(largestCurveAfter, eightBit ? 0.6 : 0.05) << c.name;
    }
}

TEST(InverseEvaluation, MatrixTrcRgbAgreesWithLcms) {
    const char* names[] = {"sRGB.icc", "compatibleWithAdobeRGB1998.icc", "ghostscript/srgb.icc"};
    int tested = 0;
    for (const char* name : names) {
        const std::string path = SystemProfile(name);
        if (path.empty()) continue;
        ++tested;
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, path, "A2B1", "B2A1", false)) << name;
        LcmsTransform inverse(path, TYPE_RGB_DBL, false, INTENT_RELATIVE_COLORIMETRIC);
        ASSERT_TRUE(inverse.ok());
        LcmsTransform forward(path, TYPE_RGB_DBL, true, INTENT_RELATIVE_COLORIMETRIC);
        ASSERT_TRUE(forward.ok());
        // The inverse tone curves are 256-entry tables indexed by linear light in steps of 1/255,
        // coarse in the shadows (one step is some 13 device steps of sRGB there, up to 3.5 in
        // L*): compared by colour.
        DeltaStats stats;
        for (const Lab& lab : LabSamples()) {
            double theirs[3];
            OracleToDevice(inverse, lab, theirs, 3);
            // Only colours inside the RGB gamut have one answer.
            if (*std::min_element(theirs, theirs + 3) <= 0 || *std::max_element(theirs, theirs + 3) >= 255) continue;
            double ours[3] = {lab.L * 2.55, lab.a, lab.b};
            LabToRgb(p, ours);
            stats.Add(Difference(OracleToLab(forward, ours, 3), OracleToLab(forward, theirs, 3)));
        }
        stats.Report(std::string(name) + " LabToRgb vs lcms2");
        EXPECT_GT(stats.count, 50);
        EXPECT_LT(stats.Mean(), 0.6) << name;
        EXPECT_LT(stats.max, 4.0) << name;
    }
    if (tested == 0) GTEST_SKIP() << "no RGB profiles available";
}

// A PCS-to-device table that hands its three encoded inputs straight out (and 0 as black).
std::string PassThroughProfile(const TempDir& dir, bool sixteenBit) {
    const unsigned top = sixteenBit ? 65535 : 255;
    LutSpec lut = MakeLut(
        3, 4, 2, [top](const std::vector<int>& node, int out) { return uint16_t(out < 3 ? node[out] * top : 0); },
        sixteenBit ? 2 : 256, sixteenBit ? 2 : 256, top);
    IccBuilder profile("CMYK", "Lab ");
    profile.AddTag("B2A1", sixteenBit ? Mft2Tag(lut) : Mft1Tag(lut));
    return WriteFile(dir.File(sixteenBit ? "pass16.icc" : "pass8.icc"), profile.Build());
}

TEST(InverseEvaluation, NeutralAxisIsEncodedAsHalfOfTheTableRange) {
    TempDir dir;
    for (bool sixteenBit : {true, false}) {
        const std::string path = PassThroughProfile(dir, sixteenBit);
        CProfil p;
        p.ReadTagTable(1, path);
        ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
        ASSERT_EQ(p.m_Precision[1], sixteenBit ? 1 : 0);
        double v[4] = {50 * 2.55, 0.0, 0.0, 0};
        LabToCmyk(p, v);
        EXPECT_NEAR(v[0], 127.5, 1e-6);
        EXPECT_NEAR(v[1], sixteenBit ? 127.5 : 128.0, 1e-6) << (sixteenBit ? "mft2" : "mft1");
        EXPECT_NEAR(v[2], sixteenBit ? 127.5 : 128.0, 1e-6);
        // Inputs beyond the Lab range are clamped in the caller's array before they are encoded.
        double wild[4] = {300.0, -200.0, 200.0, 0};
        LabToCmyk(p, wild);
        EXPECT_NEAR(wild[0], 255.0, 1e-6);
        EXPECT_NEAR(wild[1], 0.0, 1e-6);  // a* -128 encodes below 0 on a 16-bit table: held at 0
        EXPECT_NEAR(wild[2], 255.0, 1e-6);
    }
}

class InverseSearchTest : public ::testing::Test {
protected:
    void SetUp() override {
        path_ = FixtureProfile("FOGRA39L");
        if (path_.empty()) GTEST_SKIP() << "FOGRA39L.icc not built";
        ASSERT_TRUE(LoadProfile(p_, path_, "A2B1", "B2A1", false));
    }
    Lab Forward(const double* cmyk) {
        double v[4] = {cmyk[0], cmyk[1], cmyk[2], cmyk[3]};
        CmykToLab(p_, v);
        return Lab{v[0] / 2.55, v[1], v[2]};
    }
    std::string path_;
    CProfil p_;
};

TEST_F(InverseSearchTest, ReachesReachableTargetsFromTheTableAnswer) {
    std::mt19937 rng(11);
    std::uniform_real_distribution<double> value(5, 250);
    DeltaStats table, searched;
    int stuck = 0;
    for (int i = 0; i < 300; ++i) {
        const double cmyk[4] = {value(rng), value(rng), value(rng), value(rng) * 0.6};
        const Lab target = Forward(cmyk);
        double start[4] = {target.L * 2.55, target.a, target.b, 0};
        LabToCmyk(p_, start);
        start[3] = cmyk[3];  // the search keeps black: start from the black that reaches the target
        double result[4];
        double delta = -1;
        EXPECT_EQ(InverseSearch(p_, target.L, target.a, target.b, start, result, delta), result);
        const Lab reached = Forward(result);
        EXPECT_NEAR(delta, Difference(reached, target), 1e-9);
        EXPECT_EQ(result[3], start[3]);
        table.Add(Difference(Forward(start), target));
        searched.Add(delta);
        stuck += delta > 0.5;
    }
    table.Report("FOGRA39L table answer (black fixed)");
    searched.Report("FOGRA39L after InverseSearch");
    EXPECT_LT(searched.Mean(), 0.15);
    EXPECT_LE(stuck, 6);  // a few targets sit where the three free channels saturate
}

TEST_F(InverseSearchTest, ReturnsTheStartWhenItCannotImprove) {
    const double start[4] = {40.0, 90.5, 12.25, 70.0};
    const Lab target = Forward(start);
    double result[4];
    double delta = -1;
    InverseSearch(p_, target.L, target.a, target.b, start, result, delta);
    for (int c = 0; c < 4; ++c) EXPECT_EQ(result[c], start[c]);
    EXPECT_NEAR(delta, 0.0, 1e-12);
}

TEST_F(InverseSearchTest, KeepsWithinTheDeviceRangeForUnreachableTargets) {
    const double start[4] = {128, 128, 128, 20};
    double result[4];
    double delta = -1;
    const Lab wanted{50, 120, -120};  // far outside any press gamut
    InverseSearch(p_, wanted.L, wanted.a, wanted.b, start, result, delta);
    for (int c = 0; c < 3; ++c) {
        EXPECT_GE(result[c], 0.0);
        EXPECT_LE(result[c], 255.0);
    }
    EXPECT_EQ(result[3], 20.0);
    EXPECT_LT(delta, Difference(Forward(start), wanted));
    EXPECT_NEAR(delta, Difference(Forward(result), wanted), 1e-9);
}

}  // namespace
}  // namespace vantrel
