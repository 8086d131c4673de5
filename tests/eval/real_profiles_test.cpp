// The corpus of real profiles (helpers/profile_corpus.h) walked by every profile-level check: the
// tables as read, the forward and inverse evaluations against lcms2 on the same tags, node round
// trips and the gamut record. The cut and flipped copies are in icc/malformed_profiles_test.cpp.
#include <gtest/gtest.h>

#include <random>

#include "eval/gamut_record.h"
#include "eval/inverse.h"
#include "eval/table_nodes.h"
#include "eval_helpers.h"
#include "helpers/profile_corpus.h"
#include "it8/measured_it8.h"

namespace vantrel {
namespace {

using namespace test;

uint16_t Stretch(uint16_t v) { return static_cast<uint16_t>(std::min(65535.0, std::floor(v * 257.0 / 256 + 0.5))); }

// Compares a slot with lcms2's decoding of the same tag, allowing for what the reader does on purpose:
// 8-bit tables keep their bytes, v2 Lab tables ending at 0xFF00 are stretched to the full range, and
// input curves shorter than 256 entries are held spread over 256.
void ExpectSlotMatches(const CProfil& p, int slot, OracleLut oracle) {
    ASSERT_TRUE(oracle.ok);
    const LutSlot& lut = p.m_Lut[slot];
    const size_t m = static_cast<size_t>(lut.outputChannels);
    const int precision = p.m_Precision[slot];
    auto narrow = [](std::vector<uint16_t>& v) { std::transform(v.begin(), v.end(), v.begin(), [](uint16_t x) { return x / 257; }); };
    for (auto* curves : {&oracle.inputCurves, &oracle.outputCurves})
        for (auto& curve : *curves) {
            if (precision == 0) narrow(curve);
            if (precision == 1 && (curves == &oracle.outputCurves || curve.size() >= 256) && curve.back() == 0xFF00)
                std::transform(curve.begin(), curve.end(), curve.begin(), Stretch);
        }
    if (precision == 0) narrow(oracle.clut);
    if (precision == 1 && m >= 3 && oracle.clut[0] == 0xFF00 && oracle.clut[1] == 0x8000 && oracle.clut[2] == 0x8000)
        for (size_t k = 0; k < oracle.clut.size(); k += m) oracle.clut[k] = Stretch(oracle.clut[k]);
    for (size_t c = 0; c < oracle.inputCurves.size(); ++c) {
        std::vector<uint16_t>& curve = oracle.inputCurves[c];
        if (curve.size() >= 256) continue;
        // Entry j lies near the curve at j / 255.
        cmsToneCurve* tone = cmsBuildTabulatedToneCurve16(nullptr, static_cast<cmsUInt32Number>(curve.size()), curve.data());
        curve.assign(p.m_InputCurves[slot].begin() + static_cast<std::ptrdiff_t>(256 * c),
                     p.m_InputCurves[slot].begin() + static_cast<std::ptrdiff_t>(256 * c + 256));
        for (int j = 0; j < 256; ++j)
            EXPECT_NEAR(curve[static_cast<size_t>(j)], cmsEvalToneCurve16(tone, static_cast<cmsUInt16Number>(257 * j)), 64) << c << " " << j;
        cmsFreeToneCurve(tone);
    }
    auto flatten = [](const std::vector<std::vector<uint16_t>>& curves) {
        std::vector<uint16_t> all;
        for (const auto& curve : curves) all.insert(all.end(), curve.begin(), curve.end());
        return all;
    };
    EXPECT_EQ(oracle.inputCurves.size(), static_cast<size_t>(lut.inputChannels));
    EXPECT_EQ(flatten(oracle.inputCurves), p.m_InputCurves[slot]);
    EXPECT_EQ(oracle.clut, p.m_Clut[slot]);
    EXPECT_EQ(oracle.outputCurves.size(), m);
    EXPECT_EQ(flatten(oracle.outputCurves), p.m_OutputCurves[slot]);
}

TEST(RealProfiles, TablesReadAsLcmsDecodesThem) {
    const cmsTagSignature colorants[3] = {cmsSigRedColorantTag, cmsSigGreenColorantTag, cmsSigBlueColorantTag};
    const cmsTagSignature trcs[3] = {cmsSigRedTRCTag, cmsSigGreenTRCTag, cmsSigBlueTRCTag};
    for (const RealProfile& r : ProfileCorpus()) {
        if (r.path.empty()) continue;
        SCOPED_TRACE(r.name);
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, r.path, "A2B1", r.b2a));
        if (!r.matrixTrc) {
            std::unique_ptr<void, decltype(&cmsCloseProfile)> profile(cmsOpenProfileFromFile(r.path.c_str(), "r"), &cmsCloseProfile);
            EXPECT_EQ(p.m_Lut[0].pcs, cmsGetPCS(profile.get()) == cmsSigXYZData ? "XYZ" : "Lab");
            ExpectSlotMatches(p, 0, ReadWithLcms(r.path, r.A2BTag()));
            ExpectSlotMatches(p, 1, ReadWithLcms(r.path, r.B2ATag()));
            continue;
        }
        EXPECT_EQ(p.m_Lut[0].type, "MATR");
        cmsHPROFILE profile = cmsOpenProfileFromFile(r.path.c_str(), "r");
        EXPECT_EQ(p.m_Lut[0].pcs, "XYZ");
        for (int c = 0; c < 3; ++c) {
            const auto* xyz = static_cast<const cmsCIEXYZ*>(cmsReadTag(profile, colorants[c]));
            EXPECT_NEAR(p.m_Lut[0].matrix[0][c], xyz->X, 1e-9);
            EXPECT_NEAR(p.m_Lut[0].matrix[1][c], xyz->Y, 1e-9);
            EXPECT_NEAR(p.m_Lut[0].matrix[2][c], xyz->Z, 1e-9);  // direction 1's inverse: by the evaluation
            auto* trc = static_cast<cmsToneCurve*>(cmsReadTag(profile, trcs[c]));
            cmsToneCurve* reversed = cmsReverseToneCurve(trc);
            for (int i = 0; i < 256; ++i) {
                // Sampled curves are decimated, not interpolated: a quarter of a sample step off at most.
                EXPECT_NEAR(p.m_Trc[0].curve[c][static_cast<size_t>(i)], 255 * cmsEvalToneCurveFloat(trc, i / 255.0f), 0.5) << i;
                // Inverses are built on a 1/16 grid and filled by a spline; steep starts are the worst.
                // They start at 0 also where the curve is flat at its start (no single inverse there).
                if (i > 0) {
                    EXPECT_NEAR(p.m_Trc[1].curve[c][static_cast<size_t>(i)], 255 * cmsEvalToneCurveFloat(reversed, i / 255.0f),
                                i < 8 ? 3.0 : 1.0) << i;
                }
            }
            cmsFreeToneCurve(reversed);
        }
        cmsCloseProfile(profile);
    }
    for (const std::string& path : ParametricProfiles()) {
        CProfil p;
        for (int direction : {0, 1}) {
            p.ReadTagTable(direction, path);
            EXPECT_EQ(p.LoadLut(direction, direction ? "B2A1" : "A2B1", path), -1) << path;
            EXPECT_FALSE(p.SlotHolds(direction));
        }
    }
}

// The two differ only where the interpolation schemes differ: lcms2 interpolates four-input
// tables as tetrahedra in CMY blended along K, and applies output curves after the grid.
TEST(RealProfiles, ForwardAgreesWithLcmsOnTheSameTables) {
    for (const RealProfile& r : ProfileCorpus()) {
        if (r.path.empty() || !r.forward.Set()) continue;
        CProfil p;
        p.ReadTagTable(0, r.path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", r.path), 1) << r.name;
        const int channels = r.matrixTrc ? 3 : 4;
        const auto oracle = MakeLcmsTransform(r.path, channels == 3 ? TYPE_RGB_DBL : TYPE_CMYK_DBL, true);
        ASSERT_TRUE(oracle) << r.name;
        // Every node of a 9-point lattice, then random colours.
        std::vector<std::vector<double>> samples;
        for (int k = 0; k < std::pow(9, channels); ++k) {
            std::vector<double> s(4, 0.0);
            for (int i = 0, rest = k; i < channels; ++i, rest /= 9) s[i] = rest % 9 * 31.875;
            samples.push_back(s);
        }
        std::mt19937 rng(7);
        std::uniform_real_distribution<double> value(0, 255);
        for (int i = 0; i < 3000; ++i) samples.push_back({value(rng), value(rng), value(rng), value(rng)});
        DeltaStats stats;
        for (const auto& s : samples) {
            double v[4] = {s[0], s[1], s[2], s[3]};
            EXPECT_EQ(channels == 3 ? RgbToLab(p, v) : CmykToLab(p, v), 1);
            stats.Add(Difference(Lab{v[0] / 2.55, v[1], v[2]}, OracleLab(oracle, s.data(), channels)));
        }
        stats.Report(std::string(r.name) + " to Lab vs lcms2");
        EXPECT_LT(stats.Mean(), r.forward.mean) << r.name;
        EXPECT_LT(stats.max, r.forward.max) << r.name;
    }
}

std::vector<Lab> LabSamples() {
    std::vector<Lab> samples;
    for (int L = 0; L <= 100; L += 10)
        for (int a = -100; a <= 100; a += 20)
            for (int b = -100; b <= 100; b += 20) samples.push_back(Lab{double(L), double(a), double(b)});
    return samples;
}

// CMYK: the device answers differ where the output curves act, per grid corner here and after the
// interpolation in lcms2. They are compared by their colours through the same forward table, and
// once more with the grid read raw and the output curves applied after it, where the two agree to
// rounding. (lcms2's own Lab-to-CMYK transform is no oracle here: it reshapes dark colours outside
// the gamut before the table, by up to 20 device units on these profiles.)
void ExpectCmykInverseAgrees(CProfil& p, const RealProfile& r) {
    std::unique_ptr<void, decltype(&cmsCloseProfile)> profile(cmsOpenProfileFromFile(r.path.c_str(), "r"), &cmsCloseProfile);
    auto* pipeline = profile ? static_cast<cmsPipeline*>(cmsReadTag(profile.get(), r.B2ATag())) : nullptr;
    const auto forward = MakeLcmsTransform(r.path, TYPE_CMYK_DBL, true);
    ASSERT_TRUE(pipeline && forward);
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
    stats.Report(std::string(r.name) + " LabToCmyk vs lcms2");
    EXPECT_LT(stats.Mean(), r.inverse.mean);
    EXPECT_LT(stats.max, r.inverse.max);
    EXPECT_LT(largestCurveAfter, eightBit ? 0.6 : 0.05);
}

// RGB: the inverse tone curves are 256-entry tables indexed by linear light in steps of 1/255,
// coarse in the shadows (one step is some 13 device steps of sRGB there, up to 3.5 in L*):
// compared by colour, for the colours inside the RGB gamut, which have one answer.
void ExpectRgbInverseAgrees(CProfil& p, const RealProfile& r) {
    const auto inverse = MakeLcmsTransform(r.path, TYPE_RGB_DBL, false);
    const auto forward = MakeLcmsTransform(r.path, TYPE_RGB_DBL, true);
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
    stats.Report(std::string(r.name) + " LabToRgb vs lcms2");
    EXPECT_GT(stats.count, 50);
    EXPECT_LT(stats.Mean(), r.inverse.mean);
    EXPECT_LT(stats.max, r.inverse.max);
}

TEST(RealProfiles, InverseAgreesWithLcmsOnTheSameTables) {
    for (const RealProfile& r : ProfileCorpus()) {
        if (r.path.empty() || !r.inverse.Set()) continue;
        SCOPED_TRACE(r.name);
        CProfil p;
        ASSERT_TRUE(LoadProfile(p, r.path, "A2B1", r.b2a));
        r.matrixTrc ? ExpectRgbInverseAgrees(p, r) : ExpectCmykInverseAgrees(p, r);
    }
}

// The largest difference between random Lab values (of positive XYZ, which an XYZ table can hold)
// written at random nodes of slot 0 and read back.
double LargestNodeRoundTripError(CProfil& p, int trials) {
    std::mt19937 rng(21);
    std::uniform_real_distribution<double> L(30, 95), ab(-30, 30);
    std::uniform_int_distribution<int> index(0, p.m_Lut[0].gridPoints - 1);
    double largest = 0;
    for (int t = 0; t < trials; ++t) {
        const Lab lab{L(rng), ab(rng), ab(rng)};
        double record[17] = {lab.L * 2.55, lab.a, lab.b, 0};
        for (int i = 0; i < p.m_Lut[0].inputChannels; ++i) record[4 + i] = index(rng);
        EXPECT_EQ(WriteNodeLab(p, record, 0), 1);
        record[0] = record[1] = record[2] = -999;
        EXPECT_EQ(ReadNodeLab(p, record, 0, false), 1);
        largest = std::max(largest, Difference(Lab{record[0] / 2.55, record[1], record[2]}, lab));
    }
    return largest;
}

TEST(RealProfiles, LabWrittenToANodeReadsBackWithinTheTableQuantisation) {
    for (const RealProfile& r : ProfileCorpus()) {
        for (const bool absolute : {false, true}) {
            const double limit = absolute ? r.absoluteNodeRoundTrip : r.nodeRoundTrip;
            if (r.path.empty() || limit == 0) continue;
            CProfil p;
            LoadProfile(p, r.path, "A2B1", r.b2a, absolute);
            ASSERT_TRUE(p.SlotHolds(0)) << r.name;
            EXPECT_LT(LargestNodeRoundTripError(p, 500), limit) << r.name << (absolute ? " absolute" : "");
        }
    }
    // An 8-bit table keeps half a unit of L* x 2.55, a* and b*: up to 0.73 together.
    TempDir dir;
    CProfil p8;
    const LutSpec lut = MakeLut(4, 3, 3, [](const std::vector<int>&, int) { return uint16_t(128); }, 256, 256, 255);
    WriteAndLoad(p8, dir, "CMYK", {{"A2B1", Mft1Tag(lut)}});
    ASSERT_EQ(p8.m_Precision[0], 0);
    EXPECT_LT(LargestNodeRoundTripError(p8, 300), 0.75);
}

// Press profiles hold the colours they were built from (read as the library reads measurements);
// an RGB profile holds the inner colours of its lattice and most of its surface.
TEST(RealProfiles, GamutRecordHoldsTheColoursTheProfileWasBuiltFrom) {
    for (const RealProfile& r : ProfileCorpus()) {
        if (r.path.empty() || r.measurements.empty()) continue;
        SCOPED_TRACE(r.name);
        CProfil p;
        // Measurements are absolute; the lattice is compared through lcms2's relative transform.
        ASSERT_TRUE(LoadProfile(p, r.path, "A2B1", r.b2a, !r.matrixTrc));
        const GamutRecord g = BuildGamutRecord(p);
        EXPECT_EQ(g.valid, 1);
        if (r.matrixTrc) {
            const auto forward = MakeLcmsTransform(r.path, TYPE_RGB_DBL, true);
            int inside[2] = {0, 0}, total[2] = {0, 0};
            for (int k = 0; k < 216; ++k) {
                const double rgb[3] = {k / 36 * 51.0, k / 6 % 6 * 51.0, k % 6 * 51.0};
                const Lab lab = OracleLab(forward, rgb, 3);
                const bool surface = *std::min_element(rgb, rgb + 3) == 0 || *std::max_element(rgb, rgb + 3) == 255;
                inside[surface] += IsInGamut(g, lab.L, lab.a, lab.b);
                ++total[surface];
            }
            EXPECT_EQ(inside[0], total[0]);
            EXPECT_GE(inside[1], total[1] * 3 / 4);
            EXPECT_FALSE(IsInGamut(g, 50, -110, -110));
            continue;
        }
        Measured_IT8 it8;
        ASSERT_EQ(it8.ReadIt8(r.measurements), 0);
        EXPECT_NEAR(g.paperWhite[0], p.WhiteL(0), 1e-12);
        int inside = 0;
        for (int set = 0; set < it8.PatchCount(); ++set)
            inside += IsInGamut(g, it8.GetLab(set, 0), it8.GetLab(set, 1), it8.GetLab(set, 2));
        const double share = double(inside) / it8.PatchCount();
        std::printf("[ gamut    ] %-10s %4d of %4d measured colours inside (%.1f %%)\n", r.name, inside,
                    it8.PatchCount(), 100 * share);
        EXPECT_GE(share, 0.9);
        // A measured colour inside the gamut is reproduced closely; one far outside is not.
        const Lab first = ReproducedLab(p, it8.GetLab(0, 0), it8.GetLab(0, 1), it8.GetLab(0, 2));
        EXPECT_LT(Difference(first, Lab{it8.GetLab(0, 0), it8.GetLab(0, 1), it8.GetLab(0, 2)}), 2.0);
        EXPECT_GT(Difference(ReproducedLab(p, 50, 100, 90), Lab{50, 100, 90}), 10.0);
        // Far outside any press: saturated RGB-primary colours, and lighter than the paper.
        for (const Lab& lab : {Lab{50, 100, 90}, Lab{88, -90, 10}, Lab{30, 60, -110}, Lab{99, 0, 0}, Lab{60, -100, -60}})
            EXPECT_FALSE(IsInGamut(g, lab.L, lab.a, lab.b)) << lab.L;
    }
}

}  // namespace
}  // namespace vantrel
