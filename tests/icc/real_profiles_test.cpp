// Real profiles read into their slots and checked against the tables lcms2 decodes from them.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <filesystem>

#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"
#include "lcms_oracle.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

uint16_t Stretch(uint16_t v) { return static_cast<uint16_t>(std::min(65535.0, std::floor(v * 257.0 / 256 + 0.5))); }

// Compares a slot with lcms2's decoding of the same tag, allowing for what the reader does on purpose:
// 8-bit tables keep their bytes, v2 Lab tables ending at 0xFF00 are stretched to the full range, and
// input curves shorter than 256 entries are held spread over 256.
void ExpectSlotMatches(const CProfil& p, int slot, OracleLut oracle) {
    ASSERT_TRUE(oracle.ok);
    const LutSlot& lut = p.m_Lut[slot];
    const size_t m = static_cast<size_t>(lut.outputChannels);
    auto stretch = [](std::vector<uint16_t>& curve) {
        if (curve.back() == 0xFF00) std::transform(curve.begin(), curve.end(), curve.begin(), Stretch);
    };
    for (auto* curves : {&oracle.inputCurves, &oracle.outputCurves})
        for (auto& curve : *curves) {
            if (p.m_Precision[slot] == 0) std::transform(curve.begin(), curve.end(), curve.begin(), [](uint16_t v) { return v / 257; });
            if (p.m_Precision[slot] == 1 && (curves == &oracle.outputCurves || curve.size() >= 256)) stretch(curve);
        }
    if (p.m_Precision[slot] == 0) std::transform(oracle.clut.begin(), oracle.clut.end(), oracle.clut.begin(), [](uint16_t v) { return v / 257; });
    if (p.m_Precision[slot] == 1 && m >= 3 && oracle.clut[0] == 0xFF00 && oracle.clut[1] == 0x8000 && oracle.clut[2] == 0x8000)
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

}  // namespace

TEST(RealProfiles, LutTablesMatchLcms) {
    TempDir dir;
    const std::string v4 = dir.File("v4.icc");
    ASSERT_TRUE(WriteLcmsV4Profile(v4));
    const std::string gs = SystemIccDir() + "ghostscript/";
    struct Case {
        std::string path;
        const char* b2a;
        cmsTagSignature forward, backward;
        const char* pcs;
    };
    // Every case asks for A2B1; profiles with only A2B0 fall back to it.
    const Case cases[] = {
        {FixtureProfile("FOGRA39L"), "B2A1", cmsSigAToB1Tag, cmsSigBToA1Tag, "Lab"},  // Argyll: 16-bit, long curves
        {FixtureProfile("TR003"), "B2A1", cmsSigAToB1Tag, cmsSigBToA1Tag, "Lab"},
        {gs + "default_cmyk.icc", "B2A1", cmsSigAToB1Tag, cmsSigBToA1Tag, "Lab"},  // 8-bit B2A1
        {gs + "ps_cmyk.icc", "B2A0", cmsSigAToB0Tag, cmsSigBToA0Tag, "XYZ"},       // v4, XYZ PCS
        {v4, "B2A0", cmsSigAToB0Tag, cmsSigBToA0Tag, "Lab"},                       // lcms2's mAB / mBA
    };
    for (const Case& c : cases) {
        if (c.path.empty() || !std::filesystem::exists(c.path)) continue;  // fixture not built
        SCOPED_TRACE(c.path);
        CProfil p;
        p.ReadTagTable(0, c.path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", c.path), 1);
        p.ReadTagTable(1, c.path);
        ASSERT_EQ(p.LoadLut(1, c.b2a, c.path), 1);
        EXPECT_EQ(p.m_Lut[0].pcs, c.pcs);
        ExpectSlotMatches(p, 0, ReadWithLcms(c.path, c.forward));
        ExpectSlotMatches(p, 1, ReadWithLcms(c.path, c.backward));
    }
}

// v2 matrix/TRC RGB profiles: gamma curves, 1024- and 2048-entry sampled curves, identity curves.
TEST(RealProfiles, MatrixTrcProfilesMatchLcms) {
    const std::string icc = SystemIccDir();
    const cmsTagSignature colorants[3] = {cmsSigRedColorantTag, cmsSigGreenColorantTag, cmsSigBlueColorantTag};
    const cmsTagSignature trcs[3] = {cmsSigRedTRCTag, cmsSigGreenTRCTag, cmsSigBlueTRCTag};
    for (const std::string& path : {icc + "sRGB.icc", icc + "compatibleWithAdobeRGB1998.icc", icc + "ghostscript/srgb.icc",
                                   icc + "ghostscript/esrgb.icc", icc + "ghostscript/scrgb.icc"}) {
        if (!std::filesystem::exists(path)) continue;
        SCOPED_TRACE(path);
        CProfil p;
        p.ReadTagTable(0, path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);
        p.ReadTagTable(1, path);
        ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1);
        EXPECT_EQ(p.m_Lut[0].type, "MATR");
        EXPECT_EQ(p.m_Lut[0].pcs, "XYZ");
        cmsHPROFILE profile = cmsOpenProfileFromFile(path.c_str(), "r");
        for (int c = 0; c < 3; ++c) {
            const auto* xyz = static_cast<const cmsCIEXYZ*>(cmsReadTag(profile, colorants[c]));
            EXPECT_NEAR(p.m_Lut[0].matrix[0][c], xyz->X, 1e-9);
            EXPECT_NEAR(p.m_Lut[0].matrix[1][c], xyz->Y, 1e-9);
            EXPECT_NEAR(p.m_Lut[0].matrix[2][c], xyz->Z, 1e-9);  // direction 1's inverse: the evaluation tests
            auto* trc = static_cast<cmsToneCurve*>(cmsReadTag(profile, trcs[c]));
            cmsToneCurve* reversed = cmsReverseToneCurve(trc);
            for (int i = 0; i < 256; ++i) {
                // Sampled curves are decimated, not interpolated: a quarter of a sample step off at most.
                EXPECT_NEAR(p.m_Trc[0].curve[c][static_cast<size_t>(i)], 255 * cmsEvalToneCurveFloat(trc, i / 255.0f), 0.5) << i;
                // Inverses are built on a 1/16 grid and filled by a spline; steep starts are the worst.
                // They start at 0 also where the curve is flat at its start (no single inverse there).
                if (i > 0) {
                    EXPECT_NEAR(p.m_Trc[1].curve[c][static_cast<size_t>(i)], 255 * cmsEvalToneCurveFloat(reversed, i / 255.0f),
                                i < 8 ? 3.0 : 1.0)
                        << i;
                }
            }
            cmsFreeToneCurve(reversed);
        }
        cmsCloseProfile(profile);
    }
}

// colord's v4 profiles carry parametric curves, which this reader does not take: a clean failure.
TEST(RealProfiles, ParametricCurvesFailCleanly) {
    for (const char* name : {"sRGB.icc", "AdobeRGB1998.icc", "ProPhotoRGB.icc"}) {
        const std::string path = SystemIccDir() + "colord/" + name;
        if (!std::filesystem::exists(path)) continue;
        CProfil p;
        for (int direction : {0, 1}) {
            p.ReadTagTable(direction, path);
            EXPECT_EQ(p.LoadLut(direction, direction ? "B2A1" : "A2B1", path), -1) << name;
            EXPECT_FALSE(p.SlotHolds(direction));
        }
    }
}
