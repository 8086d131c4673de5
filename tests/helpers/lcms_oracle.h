#pragma once
// lcms2, the one oracle of the profile tests: the tables of a LUT tag as lcms2 decodes them, the
// tag's pipeline evaluated at table inputs, transforms on a profile's own tables, and a v4 profile
// of "mAB "/"mBA " tables written by lcms2.

#include <lcms2.h>
#include <lcms2_plugin.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "colour/colour_values.h"

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

// A device-to-Lab or Lab-to-device transform of lcms2 on the profile's own tables (no
// optimisation, so that it interpolates the tags themselves); null when lcms2 cannot make it.
using LcmsTransform = std::unique_ptr<void, decltype(&cmsDeleteTransform)>;
inline LcmsTransform MakeLcmsTransform(const std::string& path, cmsUInt32Number deviceFormat, bool toLab,
                                       cmsUInt32Number intent = INTENT_RELATIVE_COLORIMETRIC) {
    cmsHPROFILE device = cmsOpenProfileFromFile(path.c_str(), "r");
    cmsHPROFILE lab = cmsCreateLab2Profile(nullptr);
    const cmsUInt32Number flags = cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE;
    cmsHTRANSFORM t = nullptr;
    if (device && lab)
        t = toLab ? cmsCreateTransform(device, deviceFormat, lab, TYPE_Lab_DBL, intent, flags)
                  : cmsCreateTransform(lab, TYPE_Lab_DBL, device, deviceFormat, intent, flags);
    if (device) cmsCloseProfile(device);  // a transform keeps what it needs of its profiles
    if (lab) cmsCloseProfile(lab);
    return LcmsTransform(t, &cmsDeleteTransform);
}

// Device values (0..255) to Lab and back through lcms2, which takes CMYK in percent, RGB on 0..1.
inline Lab OracleLab(const LcmsTransform& t, const double* device, int channels) {
    double in[4];
    for (int c = 0; c < channels; ++c) in[c] = device[c] / (channels == 4 ? 2.55 : 255.0);
    cmsCIELab out;
    cmsDoTransform(t.get(), in, &out, 1);
    return Lab{out.L, out.a, out.b};
}
inline void OracleDevice(const LcmsTransform& t, const Lab& lab, double* device, int channels) {
    const cmsCIELab in{lab.L, lab.a, lab.b};
    double out[4];
    cmsDoTransform(t.get(), &in, out, 1);
    for (int c = 0; c < channels; ++c) device[c] = out[c] * (channels == 4 ? 2.55 : 255.0);
}

// A Lab-to-device tag's own pipeline as lcms2 reads it (input curves, grid, output curves, and the
// matrix of an XYZ table), evaluated at the table inputs a Lab stands for: L* / 100 and
// (a* + 127.5) / 255 for a 16-bit Lab table, (a* + 128) / 255 for an 8-bit one, XYZ / 1.99997 for
// an XYZ one. Four device values on 0..255.
inline void OracleTable(cmsPipeline* pipeline, const Lab& lab, bool xyz, bool eightBit, double* device) {
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

}  // namespace vantrel::test
