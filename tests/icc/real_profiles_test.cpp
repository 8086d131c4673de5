#include <gtest/gtest.h>

#include <lcms2.h>
#include <lcms2_plugin.h>

#include <algorithm>
#include <cmath>
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
    for (auto& curve : oracle.inputCurves) curve = Stretched(curve);
    for (auto& curve : oracle.outputCurves) curve = Stretched(curve);
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
