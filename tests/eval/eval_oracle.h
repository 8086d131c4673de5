#pragma once

// Loading real profiles into CProfil, and lcms2 as the oracle that evaluates the same tags.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "colour/colour_values.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

namespace vantrel::test {

// Reads both directions of `path` into `p`: direction 0 from tag a2b, direction 1 from b2a.
inline bool LoadProfile(CProfil& p, const std::string& path, const char* a2b, const char* b2a, bool mediaWhite) {
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = mediaWhite ? 1 : 0;
    p.ReadTagTable(0, path);
    if (p.LoadLut(0, a2b, path) != 1) return false;
    p.ReadTagTable(1, path);
    return p.LoadLut(1, b2a, path) == 1;
}

inline std::string SystemProfile(const std::string& name) {
    const std::string path = SystemIccDir() + name;
    return std::ifstream(path).good() ? path : std::string();
}

// A device-to-Lab or Lab-to-device transform of lcms2 on the profile's own tables (no
// optimisation, so that it interpolates the tags themselves).
class LcmsTransform {
public:
    LcmsTransform(const std::string& path, cmsUInt32Number deviceFormat, bool toLab, cmsUInt32Number intent) {
        device_ = cmsOpenProfileFromFile(path.c_str(), "r");
        lab_ = cmsCreateLab2Profile(nullptr);
        if (!device_ || !lab_) return;
        if (toLab) {
            transform_ = cmsCreateTransform(device_, deviceFormat, lab_, TYPE_Lab_DBL, intent,
                                            cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
        } else {
            transform_ = cmsCreateTransform(lab_, TYPE_Lab_DBL, device_, deviceFormat, intent,
                                            cmsFLAGS_NOOPTIMIZE | cmsFLAGS_NOCACHE);
        }
    }
    ~LcmsTransform() {
        if (transform_) cmsDeleteTransform(transform_);
        if (lab_) cmsCloseProfile(lab_);
        if (device_) cmsCloseProfile(device_);
    }
    LcmsTransform(const LcmsTransform&) = delete;
    LcmsTransform& operator=(const LcmsTransform&) = delete;

    bool ok() const { return transform_ != nullptr; }
    void Run(const void* in, void* out) const { cmsDoTransform(transform_, in, out, 1); }

private:
    cmsHPROFILE device_ = nullptr;
    cmsHPROFILE lab_ = nullptr;
    cmsHTRANSFORM transform_ = nullptr;
};

// Device values (0..255) to Lab through lcms2; CMYK in percent, RGB on 0..1.
inline Lab OracleToLab(const LcmsTransform& t, const double* device, int channels) {
    double in[4];
    for (int c = 0; c < channels; ++c) in[c] = channels == 4 ? device[c] / 2.55 : device[c] / 255.0;
    cmsCIELab out;
    t.Run(in, &out);
    return Lab{out.L, out.a, out.b};
}

inline void OracleToDevice(const LcmsTransform& t, const Lab& lab, double* device, int channels) {
    const cmsCIELab in{lab.L, lab.a, lab.b};
    double out[4];
    t.Run(&in, out);
    for (int c = 0; c < channels; ++c) device[c] = channels == 4 ? out[c] * 2.55 : out[c] * 255.0;
}

inline double Difference(const Lab& x, const Lab& y) {
    return std::sqrt((x.L - y.L) * (x.L - y.L) + (x.a - y.a) * (x.a - y.a) + (x.b - y.b) * (x.b - y.b));
}

// Mean and largest difference of a comparison, printed for the record.
struct DeltaStats {
    double sum = 0, max = 0;
    int count = 0;
    void Add(double d) {
        sum += d;
        max = std::max(max, d);
        ++count;
    }
    double Mean() const { return count ? sum / count : 0; }
    void Report(const std::string& what) const {
        std::printf("[ dE       ] %-48s mean %.3f  max %.3f  (%d colours)\n", what.c_str(), Mean(), max, count);
        ::testing::Test::RecordProperty(what + " mean dE", std::to_string(Mean()));
        ::testing::Test::RecordProperty(what + " max dE", std::to_string(max));
    }
};

}  // namespace vantrel::test
