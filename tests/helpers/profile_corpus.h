#pragma once
// The real profiles of the profile-level checks, declared once: what each file is, what it
// exercises that the others do not, and the fault it is there to catch. Each check walks the entries
// that carry its numbers (a zero limit leaves an entry out); a file not installed or not built is
// skipped.

#include <filesystem>
#include <stdexcept>
#include <string>
#include <vector>

#include "helpers/lcms_oracle.h"
#include "helpers/test_paths.h"

namespace vantrel::test {

struct Limits {
    double mean, max;  // colour differences against lcms2 on the same tags
    bool Set() const { return max > 0; }
};

struct RealProfile {
    const char* name;
    std::string path;  // empty when the file is not installed or not built
    const char* what;
    const char* exercises;
    const char* fault;  // a fault only this entry shows, or the one it was kept for
    const char* b2a;  // "B2A0" for a profile with intent-0 tables only (A2B1 falls back to A2B0 itself)
    bool matrixTrc;
    Limits forward, inverse;
    double nodeRoundTrip, absoluteNodeRoundTrip;  // largest Lab error of a node written and read back
    std::string measurements;                     // what the gamut record must hold ("lattice": RGB)
    bool corrupt;                                 // cut and flipped by the malformed-profile check

    cmsTagSignature A2BTag() const { return b2a[3] == '0' ? cmsSigAToB0Tag : cmsSigAToB1Tag; }
    cmsTagSignature B2ATag() const { return b2a[3] == '0' ? cmsSigBToA0Tag : cmsSigBToA1Tag; }
};

namespace corpus_detail {
inline std::string Installed(const std::string& name) {
    const std::string path = SystemIccDir() + name;
    return std::filesystem::exists(path) ? path : std::string();
}
inline std::string LcmsV4() {
    static const TempDir dir;
    static const std::string path = WriteLcmsV4Profile(dir.File("v4.icc")) ? dir.File("v4.icc") : std::string();
    return path;
}
}  // namespace corpus_detail

// name, path, what, exercises, fault;
// B2A tag, matrix/TRC, forward and inverse limits, node round trips, measurements, corrupted
inline const std::vector<RealProfile>& ProfileCorpus() {
    using corpus_detail::Installed;
    const std::string icc = SystemIccDir();
    static const std::vector<RealProfile> corpus = {
        {"FOGRA39L", FixtureProfile("FOGRA39L"), "Argyll colprof of FOGRA39L.ti3", "16-bit mft2, long input curves",
         "the press profile of the search, node and gamut checks",
         "B2A1", false, {0.5, 3.0}, {0.3, 2.0}, 0.01, 0.1, icc + "FOGRA39L.ti3", false},
        {"TR003", FixtureProfile("TR003"), "Argyll colprof of TR003.ti3", "a second press, another gamut",
         "a gamut record that only fits one press",
         "B2A1", false, {0.8, 5.0}, {0.6, 4.0}, 0, 0, icc + "TR003.ti3", true},
        {"default_cmyk", Installed("ghostscript/default_cmyk.icc"), "ghostscript's CMYK", "an 8-bit mft1 B2A1",
         "8-bit tables widened as 16-bit ones",
         "B2A1", false, {0.5, 3.0}, {0.3, 4.0}, 0, 0, "", true},
        // Its five-point grid is far from linear (a* swings by 120 across one cell), where a
        // four-input simplex and lcms2's CMY tetrahedra blended along K part by up to 30 between
        // the nodes; on the nodes they agree. Node values go through XYZ and a float cube root.
        {"ps_cmyk", Installed("ghostscript/ps_cmyk.icc"), "ghostscript's v4 CMYK", "XYZ PCS; A2B0 and B2A0 only",
         "XYZ tables decoded as Lab; no fallback from A2B1 to A2B0",
         "B2A0", false, {1.5, 35.0}, {0.05, 0.5}, 0.05, 0, "", true},
        {"lcms2 v4", corpus_detail::LcmsV4(), "written by lcms2", "\"mAB \"/\"mBA \" with short and long curves",
         "v4 tables read at the wrong offsets",
         "B2A0", false, {0, 0}, {0, 0}, 0, 0, "", false},
        {"sRGB", Installed("sRGB.icc"), "icc-profiles-free's sRGB", "matrix/TRC, 1024-entry curves",
         "the inverse matrix applied transposed; an RGB profile given the empty gamut record",
         "B2A1", true, {0.3, 1.5}, {0.6, 4.0}, 0, 0, "lattice", true},
        {"AdobeRGB", Installed("compatibleWithAdobeRGB1998.icc"), "icc-profiles-free's Adobe RGB",
         "matrix/TRC, gamma curves", "a u8Fixed8 gamma read with the wrong scale",
         "B2A1", true, {0.3, 1.5}, {0.6, 4.0}, 0, 0, "", false},
        {"gs srgb", Installed("ghostscript/srgb.icc"), "ghostscript's sRGB", "matrix/TRC, 2048-entry curves",
         "long sampled curves decimated off by one", "B2A1", true, {0, 0}, {0, 0}, 0, 0, "", false},
        {"gs esrgb", Installed("ghostscript/esrgb.icc"), "ghostscript's e-sRGB", "matrix/TRC, identity curves",
         "identity (empty) curves", "B2A1", true, {0, 0}, {0, 0}, 0, 0, "", false},
        {"gs scrgb", Installed("ghostscript/scrgb.icc"), "ghostscript's scRGB", "matrix/TRC, identity curves",
         "identity (empty) curves", "B2A1", true, {0, 0}, {0, 0}, 0, 0, "", false},
    };
    return corpus;
}

inline const RealProfile& CorpusProfile(const std::string& name) {
    for (const RealProfile& p : ProfileCorpus())
        if (name == p.name) return p;
    throw std::invalid_argument("no corpus profile " + name);
}

// colord's v4 profiles carry parametric curves, which the reader does not take.
inline std::vector<std::string> ParametricProfiles() {
    std::vector<std::string> paths;
    for (const char* name : {"colord/sRGB.icc", "colord/AdobeRGB1998.icc", "colord/ProPhotoRGB.icc"})
        if (const std::string path = corpus_detail::Installed(name); !path.empty()) paths.push_back(path);
    return paths;
}

}  // namespace vantrel::test
