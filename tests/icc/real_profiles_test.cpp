#include <gtest/gtest.h>

#include <lcms2.h>
#include <lcms2_plugin.h>

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <fstream>
#include <memory>

#include "helpers/test_paths.h"
#include "icc/profil.h"

using namespace vantrel;
using namespace vantrel::test;

namespace {

// The tables of a LUT tag as lcms2 decodes them: curves, CLUT, curves, 16-bit each.
struct OracleLut {
    std::vector<std::vector<uint16_t>> inputCurves;
    std::vector<uint16_t> clut;
    std::vector<std::vector<uint16_t>> outputCurves;
    bool ok = false;
};

std::vector<std::vector<uint16_t>> CurvesOf(cmsStage* stage) {
    std::vector<std::vector<uint16_t>> curves;
    auto* data = static_cast<_cmsStageToneCurvesData*>(cmsStageData(stage));
    for (cmsUInt32Number c = 0; c < data->nCurves; ++c) {
        const cmsToneCurve* curve = data->TheCurves[c];
        const cmsUInt16Number* table = cmsGetToneCurveEstimatedTable(curve);
        curves.emplace_back(table, table + cmsGetToneCurveEstimatedTableEntries(curve));
    }
    return curves;
}

OracleLut ReadWithLcms(const std::string& path, cmsTagSignature tag) {
    OracleLut lut;
    std::unique_ptr<void, decltype(&cmsCloseProfile)> profile(cmsOpenProfileFromFile(path.c_str(), "r"),
                                                               &cmsCloseProfile);
    if (!profile) return lut;
    auto* pipeline = static_cast<cmsPipeline*>(cmsReadTag(profile.get(), tag));
    if (!pipeline) return lut;
    int curveSets = 0;
    for (cmsStage* stage = cmsPipelineGetPtrToFirstStage(pipeline); stage; stage = cmsStageNext(stage)) {
        if (cmsStageType(stage) == cmsSigCurveSetElemType) {
            (curveSets++ == 0 ? lut.inputCurves : lut.outputCurves) = CurvesOf(stage);
        } else if (cmsStageType(stage) == cmsSigCLutElemType) {
            auto* data = static_cast<_cmsStageCLutData*>(cmsStageData(stage));
            lut.clut.assign(data->Tab.T, data->Tab.T + data->nEntries);
        }
    }
    lut.ok = curveSets == 2 && !lut.clut.empty();
    return lut;
}

// Curves of v2 Lab tables that end at 0xFF00 are held stretched to the full 16-bit range.
std::vector<uint16_t> Stretched(std::vector<uint16_t> curve) {
    if (curve.back() == 0xFF00)
        for (uint16_t& v : curve) v = static_cast<uint16_t>(std::min(65535.0, std::floor(v * 257.0 / 256 + 0.5)));
    return curve;
}

void ExpectSlotMatches(const CProfil& p, int slot, OracleLut oracle) {
    ASSERT_TRUE(oracle.ok);
    const int m = p.m_Lut[slot].outputChannels;
    if (p.m_Precision[slot] == 1) {
        for (auto& curve : oracle.inputCurves)
            if (curve.size() >= 256) curve = Stretched(curve);
        for (auto& curve : oracle.outputCurves) curve = Stretched(curve);
        // A first node at the legacy white marks a legacy table: L* of every node is stretched.
        if (m >= 3 && oracle.clut[0] == 0xFF00 && oracle.clut[1] == 0x8000 && oracle.clut[2] == 0x8000)
            for (size_t k = 0; k < oracle.clut.size(); k += static_cast<size_t>(m))
                oracle.clut[k] = static_cast<uint16_t>(std::min(65535.0, std::floor(oracle.clut[k] * 257.0 / 256 + 0.5)));
    }
    // Input curves shorter than 256 entries are held spread over 256: entry j near the curve at j / 255.
    for (size_t c = 0; c < oracle.inputCurves.size(); ++c) {
        if (oracle.inputCurves[c].size() >= 256) continue;
        cmsToneCurve* curve = cmsBuildTabulatedToneCurve16(nullptr, static_cast<cmsUInt32Number>(oracle.inputCurves[c].size()),
                                                           oracle.inputCurves[c].data());
        for (int j = 0; j < 256; ++j)
            EXPECT_NEAR(p.m_InputCurves[slot][c * 256 + static_cast<size_t>(j)],
                        cmsEvalToneCurve16(curve, static_cast<cmsUInt16Number>(257 * j)), 64)
                << "input curve " << c << " entry " << j;
        cmsFreeToneCurve(curve);
        oracle.inputCurves[c].assign(p.m_InputCurves[slot].begin() + static_cast<std::ptrdiff_t>(c * 256),
                                     p.m_InputCurves[slot].begin() + static_cast<std::ptrdiff_t>(c * 256 + 256));
    }
    const LutSlot& lut = p.m_Lut[slot];
    ASSERT_EQ(oracle.inputCurves.size(), static_cast<size_t>(lut.inputChannels));
    ASSERT_EQ(oracle.outputCurves.size(), static_cast<size_t>(lut.outputChannels));
    for (size_t c = 0; c < oracle.inputCurves.size(); ++c) {
        ASSERT_EQ(oracle.inputCurves[c].size(), static_cast<size_t>(lut.inputEntries));
        EXPECT_TRUE(std::equal(oracle.inputCurves[c].begin(), oracle.inputCurves[c].end(),
                               p.m_InputCurves[slot].begin() + static_cast<std::ptrdiff_t>(c * lut.inputEntries)))
            << "input curve " << c;
    }
    EXPECT_EQ(oracle.clut, p.m_Clut[slot]);
    for (size_t c = 0; c < oracle.outputCurves.size(); ++c) {
        ASSERT_EQ(oracle.outputCurves[c].size(), static_cast<size_t>(lut.outputEntries));
        EXPECT_TRUE(std::equal(oracle.outputCurves[c].begin(), oracle.outputCurves[c].end(),
                               p.m_OutputCurves[slot].begin() + static_cast<std::ptrdiff_t>(c * lut.outputEntries)))
            << "output curve " << c;
    }
}

}  // namespace

// Argyll writes full-range 16-bit mft2 tables with 256-entry or longer curves, which are held unchanged.
TEST(RealProfiles, ArgyllCmykTablesMatchLcms) {
    for (const char* name : {"FOGRA39L", "TR003"}) {
        const std::string path = FixtureProfile(name);
        if (path.empty()) GTEST_SKIP() << name << " fixture not built";
        CProfil p;
        p.ReadTagTable(0, path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1) << name;
        p.ReadTagTable(1, path);
        ASSERT_EQ(p.LoadLut(1, "B2A1", path), 1) << name;
        EXPECT_EQ(p.m_Lut[0].type, "mft2");
        EXPECT_EQ(p.m_Lut[0].colourSpace, "CMYK");
        EXPECT_EQ(p.m_Lut[0].pcs, "Lab");
        EXPECT_EQ(p.m_Lut[0].inputChannels, 4);
        EXPECT_EQ(p.m_Lut[1].inputChannels, 3);
        EXPECT_EQ(p.m_Lut[1].outputChannels, 4);
        ExpectSlotMatches(p, 0, ReadWithLcms(path, cmsSigAToB1Tag));
        ExpectSlotMatches(p, 1, ReadWithLcms(path, cmsSigBToA1Tag));
    }
}

// ghostscript's CMYK profiles: v2 with an 8-bit B2A table, and v4 with XYZ as PCS.
TEST(RealProfiles, GhostscriptCmykTablesMatchLcms) {
    struct Case {
        const char* file;
        cmsTagSignature forward, backward;
        const char* backwardType;
        const char* pcs;
    };
    for (const Case& c : {Case{"default_cmyk.icc", cmsSigAToB1Tag, cmsSigBToA1Tag, "mft1", "Lab"},
                          Case{"ps_cmyk.icc", cmsSigAToB0Tag, cmsSigBToA0Tag, "mft2", "XYZ"}}) {
        const std::string path = SystemIccDir() + "ghostscript/" + c.file;
        if (!std::filesystem::exists(path)) GTEST_SKIP() << path << " missing";
        CProfil p;
        p.ReadTagTable(0, path);
        ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1) << c.file;  // ps_cmyk has only A2B0
        p.ReadTagTable(1, path);
        ASSERT_EQ(p.LoadLut(1, c.backward == cmsSigBToA1Tag ? "B2A1" : "B2A0", path), 1) << c.file;
        EXPECT_EQ(p.m_Lut[1].type, c.backwardType);
        EXPECT_EQ(p.m_Lut[0].pcs, c.pcs);
        ExpectSlotMatches(p, 0, ReadWithLcms(path, c.forward));
        if (p.m_Precision[1] == 0) {
            // lcms2 widens 8-bit tables to 16 bits (x 257); this reader keeps the bytes.
            OracleLut oracle = ReadWithLcms(path, c.backward);
            for (auto* curves : {&oracle.inputCurves, &oracle.outputCurves})
                for (auto& curve : *curves)
                    for (uint16_t& v : curve) v = static_cast<uint16_t>(v / 257);
            for (uint16_t& v : oracle.clut) v = static_cast<uint16_t>(v / 257);
            ExpectSlotMatches(p, 1, oracle);
        } else {
            ExpectSlotMatches(p, 1, ReadWithLcms(path, c.backward));
        }
    }
}

namespace {

// The TRC of `channel` evaluated by lcms2 at i / 255 on 0..255, or its inverse.
std::vector<double> LcmsTrc(const std::string& path, int channel, bool inverse) {
    const cmsTagSignature tags[3] = {cmsSigRedTRCTag, cmsSigGreenTRCTag, cmsSigBlueTRCTag};
    std::vector<double> curve;
    cmsHPROFILE profile = cmsOpenProfileFromFile(path.c_str(), "r");
    auto* trc = static_cast<cmsToneCurve*>(cmsReadTag(profile, tags[channel]));
    cmsToneCurve* reversed = inverse ? cmsReverseToneCurve(trc) : nullptr;
    for (int i = 0; i < 256; ++i) curve.push_back(255 * cmsEvalToneCurveFloat(inverse ? reversed : trc, i / 255.0f));
    if (reversed) cmsFreeToneCurve(reversed);
    cmsCloseProfile(profile);
    return curve;
}

}  // namespace

// v2 matrix/TRC RGB profiles: gamma curves, 1024- and 2048-entry sampled curves, identity curves.
TEST(RealProfiles, MatrixTrcProfilesMatchLcms) {
    const std::string icc = SystemIccDir();
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
        EXPECT_EQ(p.m_Lut[0].gridPoints, 9);
        EXPECT_EQ(p.m_Lut[0].pcs, "XYZ");
        EXPECT_EQ(p.m_Precision[0], 0);
        EXPECT_TRUE(p.SlotHolds(0));
        EXPECT_TRUE(p.SlotHolds(1));

        cmsHPROFILE profile = cmsOpenProfileFromFile(path.c_str(), "r");
        const cmsTagSignature colorants[3] = {cmsSigRedColorantTag, cmsSigGreenColorantTag, cmsSigBlueColorantTag};
        for (int c = 0; c < 3; ++c) {
            const auto* xyz = static_cast<const cmsCIEXYZ*>(cmsReadTag(profile, colorants[c]));
            EXPECT_NEAR(p.m_Lut[0].matrix[0][c], xyz->X, 1e-9);
            EXPECT_NEAR(p.m_Lut[0].matrix[1][c], xyz->Y, 1e-9);
            EXPECT_NEAR(p.m_Lut[0].matrix[2][c], xyz->Z, 1e-9);
        }
        cmsCloseProfile(profile);
        // Direction 1 holds the inverse matrix.
        for (int r = 0; r < 3; ++r)
            for (int c = 0; c < 3; ++c) {
                double sum = 0;
                for (int k = 0; k < 3; ++k) sum += p.m_Lut[1].matrix[r][k] * p.m_Lut[0].matrix[k][c];
                EXPECT_NEAR(sum, r == c ? 1.0 : 0.0, 1e-9);
            }
        for (int c = 0; c < 3; ++c) {
            const std::vector<double> forward = LcmsTrc(path, c, false);
            const std::vector<double> inverse = LcmsTrc(path, c, true);
            for (int i = 0; i < 256; ++i) {
                // Sampled curves are decimated, not interpolated: a quarter of a sample step off at most.
                EXPECT_NEAR(p.m_Trc[0].curve[c][static_cast<size_t>(i)], forward[static_cast<size_t>(i)], 0.5) << i;
                // Inverses are built on a 1/16 grid and filled by a spline; steep starts are the worst.
                // They start at 0 also where the curve is flat at its start (no single inverse there).
                if (i == 0) continue;
                EXPECT_NEAR(p.m_Trc[1].curve[c][static_cast<size_t>(i)], inverse[static_cast<size_t>(i)], i < 8 ? 3.0 : 1.0)
                    << i;
            }
        }
    }
}

// colord's v4 profiles carry parametric curves, which this reader does not take: a clean failure.
TEST(RealProfiles, ParametricCurvesFailCleanly) {
    for (const char* name : {"sRGB.icc", "AdobeRGB1998.icc", "ProPhotoRGB.icc"}) {
        const std::string path = SystemIccDir() + "colord/" + name;
        if (!std::filesystem::exists(path)) continue;
        CProfil p;
        p.ReadTagTable(0, path);
        EXPECT_EQ(p.LoadLut(0, "A2B1", path), -1) << name;
        p.ReadTagTable(1, path);
        EXPECT_EQ(p.LoadLut(1, "B2A1", path), -1) << name;
        EXPECT_FALSE(p.SlotHolds(0));
        EXPECT_FALSE(p.SlotHolds(1));
    }
}

namespace {

// A v4 CMYK profile written by lcms2: "mAB " and "mBA " tables of curves, CLUT and curves.
bool WriteLcmsV4Profile(const std::string& path) {
    cmsHPROFILE profile = cmsCreateProfilePlaceholder(nullptr);
    cmsSetProfileVersion(profile, 4.3);
    cmsSetDeviceClass(profile, cmsSigOutputClass);
    cmsSetColorSpace(profile, cmsSigCmykData);
    cmsSetPCS(profile, cmsSigLabData);
    auto curves = [](int channels, int entries, double gamma) {
        std::vector<cmsToneCurve*> set;
        std::vector<cmsUInt16Number> table(static_cast<size_t>(entries));
        for (int k = 0; k < entries; ++k)
            table[static_cast<size_t>(k)] = static_cast<cmsUInt16Number>(65535 * std::pow(k / (entries - 1.0), gamma) + 0.5);
        for (int c = 0; c < channels; ++c) set.push_back(cmsBuildTabulatedToneCurve16(nullptr, static_cast<cmsUInt32Number>(entries), table.data()));
        cmsStage* stage = cmsStageAllocToneCurves(nullptr, static_cast<cmsUInt32Number>(channels), set.data());
        for (cmsToneCurve* curve : set) cmsFreeToneCurve(curve);
        return stage;
    };
    auto sampler = [](const cmsUInt16Number in[], cmsUInt16Number out[], void* outputs) -> cmsInt32Number {
        const int m = *static_cast<int*>(outputs);
        for (int o = 0; o < m; ++o) out[o] = static_cast<cmsUInt16Number>((in[0] / 3 + in[1] / 5 + in[2] / 7 + 977 * o) & 0xFFFF);
        return TRUE;
    };
    int three = 3, four = 4;
    cmsPipeline* forward = cmsPipelineAlloc(nullptr, 4, 3);
    cmsPipelineInsertStage(forward, cmsAT_END, curves(4, 200, 1.2));
    cmsStage* clut = cmsStageAllocCLut16bit(nullptr, 7, 4, 3, nullptr);
    cmsStageSampleCLut16bit(clut, sampler, &three, 0);
    cmsPipelineInsertStage(forward, cmsAT_END, clut);
    cmsPipelineInsertStage(forward, cmsAT_END, curves(3, 1024, 0.8));
    cmsPipeline* backward = cmsPipelineAlloc(nullptr, 3, 4);
    cmsPipelineInsertStage(backward, cmsAT_END, curves(3, 512, 1.0));
    cmsStage* clut2 = cmsStageAllocCLut16bit(nullptr, 9, 3, 4, nullptr);
    cmsStageSampleCLut16bit(clut2, sampler, &four, 0);
    cmsPipelineInsertStage(backward, cmsAT_END, clut2);
    cmsPipelineInsertStage(backward, cmsAT_END, curves(4, 300, 1.1));
    const bool ok = cmsWriteTag(profile, cmsSigAToB0Tag, forward) && cmsWriteTag(profile, cmsSigBToA0Tag, backward) &&
                    cmsSaveProfileToFile(profile, path.c_str());
    cmsPipelineFree(forward);
    cmsPipelineFree(backward);
    cmsCloseProfile(profile);
    return ok;
}

}  // namespace

TEST(RealProfiles, LcmsWrittenV4TablesMatchLcms) {
    TempDir dir;
    const std::string path = dir.File("v4.icc");
    ASSERT_TRUE(WriteLcmsV4Profile(path));
    CProfil p;
    p.ReadTagTable(0, path);
    ASSERT_EQ(p.LoadLut(0, "A2B1", path), 1);  // falls back to A2B0
    p.ReadTagTable(1, path);
    ASSERT_EQ(p.LoadLut(1, "B2A0", path), 1);
    EXPECT_EQ(p.m_Lut[0].type, "mAB ");
    EXPECT_EQ(p.m_Lut[1].type, "mBA ");
    EXPECT_EQ(p.m_Lut[0].gridPoints, 7);
    EXPECT_EQ(p.m_Lut[1].gridPoints, 9);
    ExpectSlotMatches(p, 0, ReadWithLcms(path, cmsSigAToB0Tag));
    ExpectSlotMatches(p, 1, ReadWithLcms(path, cmsSigBToA0Tag));
    // Written back unchanged, the file stays as it was.
    const std::string before = [&path] {
        std::ifstream in(path, std::ios::binary);
        return std::string((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    }();
    EXPECT_TRUE(p.WriteClut(0, path));
    EXPECT_TRUE(p.WriteClut(1, path));
    std::ifstream in(path, std::ios::binary);
    EXPECT_EQ(std::string((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>()), before);
}
