#pragma once
// lcms2 as the oracle of the ICC tests: the tables of a LUT tag as lcms2 decodes them, and a v4
// profile of "mAB "/"mBA " tables written by lcms2.

#include <lcms2.h>
#include <lcms2_plugin.h>

#include <cmath>
#include <memory>
#include <string>
#include <vector>

namespace vantrel::test {

// Input curves, CLUT and output curves of a LUT tag, 16-bit each (lcms2 widens 8-bit tables x 257).
struct OracleLut {
    std::vector<std::vector<uint16_t>> inputCurves;
    std::vector<uint16_t> clut;
    std::vector<std::vector<uint16_t>> outputCurves;
    bool ok = false;
};

inline OracleLut ReadWithLcms(const std::string& path, cmsTagSignature tag) {
    OracleLut lut;
    std::unique_ptr<void, decltype(&cmsCloseProfile)> profile(cmsOpenProfileFromFile(path.c_str(), "r"),
                                                               &cmsCloseProfile);
    auto* pipeline = profile ? static_cast<cmsPipeline*>(cmsReadTag(profile.get(), tag)) : nullptr;
    if (!pipeline) return lut;
    int curveSets = 0;
    for (cmsStage* stage = cmsPipelineGetPtrToFirstStage(pipeline); stage; stage = cmsStageNext(stage)) {
        if (cmsStageType(stage) == cmsSigCurveSetElemType) {
            auto* data = static_cast<_cmsStageToneCurvesData*>(cmsStageData(stage));
            auto& curves = curveSets++ == 0 ? lut.inputCurves : lut.outputCurves;
            for (cmsUInt32Number c = 0; c < data->nCurves; ++c) {
                const cmsUInt16Number* table = cmsGetToneCurveEstimatedTable(data->TheCurves[c]);
                curves.emplace_back(table, table + cmsGetToneCurveEstimatedTableEntries(data->TheCurves[c]));
            }
        } else if (cmsStageType(stage) == cmsSigCLutElemType) {
            auto* data = static_cast<_cmsStageCLutData*>(cmsStageData(stage));
            lut.clut.assign(data->Tab.T, data->Tab.T + data->nEntries);
        }
    }
    lut.ok = curveSets == 2 && !lut.clut.empty();
    return lut;
}

// A v4 CMYK profile from lcms2: A2B0 of 200-entry curves (shorter than held), a 7-point CLUT and
// 1024-entry curves; B2A0 of 512-entry curves, a 9-point CLUT and 300-entry curves. Every channel
// has a curve of its own.
inline bool WriteLcmsV4Profile(const std::string& path) {
    struct Shape {
        int inputs, outputs;
    };
    auto curves = [](int channels, int entries, double gamma) {
        std::vector<cmsToneCurve*> set;
        std::vector<cmsUInt16Number> table(static_cast<size_t>(entries));
        for (int c = 0; c < channels; ++c) {
            for (int k = 0; k < entries; ++k) table[k] = static_cast<cmsUInt16Number>(65535 * std::pow(k / (entries - 1.0), gamma - 0.1 * c) + 0.5);
            set.push_back(cmsBuildTabulatedToneCurve16(nullptr, entries, table.data()));
        }
        cmsStage* stage = cmsStageAllocToneCurves(nullptr, channels, set.data());
        for (cmsToneCurve* curve : set) cmsFreeToneCurve(curve);
        return stage;
    };
    auto sample = [](const cmsUInt16Number in[], cmsUInt16Number out[], void* data) -> cmsInt32Number {
        const auto* shape = static_cast<const Shape*>(data);
        unsigned sum = 0;
        for (int i = 0; i < shape->inputs; ++i) sum += in[i] / (3u + 2u * i);
        for (int o = 0; o < shape->outputs; ++o) out[o] = static_cast<cmsUInt16Number>((sum + 977u * o) & 0xFFFF);
        return TRUE;
    };
    auto table = [&](int inputs, int outputs, int inEntries, int grid, int outEntries) {
        cmsPipeline* pipeline = cmsPipelineAlloc(nullptr, inputs, outputs);
        cmsStage* clut = cmsStageAllocCLut16bit(nullptr, grid, inputs, outputs, nullptr);
        Shape shape{inputs, outputs};
        cmsStageSampleCLut16bit(clut, sample, &shape, 0);
        for (cmsStage* stage : {curves(inputs, inEntries, 1.2), clut, curves(outputs, outEntries, 0.8)})
            cmsPipelineInsertStage(pipeline, cmsAT_END, stage);
        return pipeline;
    };
    cmsHPROFILE profile = cmsCreateProfilePlaceholder(nullptr);
    cmsSetProfileVersion(profile, 4.3);
    cmsSetDeviceClass(profile, cmsSigOutputClass);
    cmsSetColorSpace(profile, cmsSigCmykData);
    cmsSetPCS(profile, cmsSigLabData);
    cmsPipeline* forward = table(4, 3, 200, 7, 1024);
    cmsPipeline* backward = table(3, 4, 512, 9, 300);
    const bool ok = cmsWriteTag(profile, cmsSigAToB0Tag, forward) && cmsWriteTag(profile, cmsSigBToA0Tag, backward) &&
                    cmsSaveProfileToFile(profile, path.c_str());
    cmsPipelineFree(forward);
    cmsPipelineFree(backward);
    cmsCloseProfile(profile);
    return ok;
}

}  // namespace vantrel::test
