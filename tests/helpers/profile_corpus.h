#pragma once
// The real profiles of the profile-level checks, declared once: what each file is, what it
// exercises that the others do not, and the fault that brought it in. Each check walks the entries
// that carry its numbers (a zero limit leaves an entry out of that check); a profile that is not
// installed or not built is skipped.

#include <filesystem>
#include <string>
#include <utility>
#include <vector>

#include "helpers/lcms_oracle.h"
#include "helpers/test_paths.h"

namespace vantrel::test {

struct Limits {
    double mean = 0, max = 0;  // colour differences against lcms2 on the same tags
    bool Set() const { return max > 0; }
};

struct RealProfile {
    RealProfile(const char* name_, std::string path_, const char* what_, const char* exercises_, const char* fault_)
        : name(name_), path(std::move(path_)), what(what_), exercises(exercises_), fault(fault_) {}
    const char* name;
    std::string path;  // empty when the file is not installed or not built
    const char* what;
    const char* exercises;
    const char* fault;
    const char* a2b = "A2B1";  // the tags the library loads (A2B1 falls back to A2B0)
    const char* b2a = "B2A1";
    cmsTagSignature a2bTag = cmsSigAToB1Tag, b2aTag = cmsSigBToA1Tag;  // the same tags for lcms2
    const char* pcs = "Lab";
    Limits forward, inverse;
    double nodeRoundTrip = 0;          // largest Lab error of a node written and read back
    double absoluteNodeRoundTrip = 0;  // the same with the media white applied
    std::string measurements;          // the characterisation data it was built from, for the gamut
    bool corrupt = false;              // cut and flipped by the malformed-profile check
    bool matrixTrc = false;
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

inline const std::vector<RealProfile>& ProfileCorpus() {
    using corpus_detail::Installed;
    static const std::vector<RealProfile> corpus = [] {
        std::vector<RealProfile> c;
        RealProfile p{"FOGRA39L", FixtureProfile("FOGRA39L"), "Argyll colprof of FOGRA39L.ti3, CMYK to Lab",
                      "16-bit mft2 with long input curves; the press profile of the search and gamut checks",
                      "the mft2 CLUT read from the wrong offset; a node write rounding L* down"};
        p.forward = {0.5, 3.0};
        p.inverse = {0.3, 2.0};
        p.nodeRoundTrip = 0.01;
        p.absoluteNodeRoundTrip = 0.1;  // the four-decimal Bradford inverse there and back
        p.measurements = SystemIccDir() + "FOGRA39L.ti3";
        c.push_back(p);

        p = RealProfile{"TR003", FixtureProfile("TR003"), "Argyll colprof of TR003.ti3, CMYK to Lab",
                        "a second press whose gamut differs", "a gamut record built from the wrong white"};
        p.forward = {0.8, 5.0};
        p.inverse = {0.6, 4.0};
        p.measurements = SystemIccDir() + "TR003.ti3";
        p.corrupt = true;
        c.push_back(p);

        p = RealProfile{"default_cmyk", Installed("ghostscript/default_cmyk.icc"), "ghostscript's CMYK profile",
                        "an 8-bit mft1 B2A1", "8-bit tables widened as 16-bit ones"};
        p.forward = {0.5, 3.0};
        p.inverse = {0.3, 4.0};
        p.corrupt = true;
        c.push_back(p);

        // Its five-point grid is far from linear (a* swings by 120 across one cell), where a
        // four-input simplex and lcms2's CMY tetrahedra blended along K part by up to 30 between the
        // nodes; on the nodes they agree.
        p = RealProfile{"ps_cmyk", Installed("ghostscript/ps_cmyk.icc"), "ghostscript's v4 CMYK profile",
                        "XYZ PCS and A2B0/B2A0 only, which A2B1 falls back to",
                        "XYZ tables decoded as Lab; no fallback from A2B1 to A2B0"};
        p.b2a = "B2A0";
        p.a2bTag = cmsSigAToB0Tag;
        p.b2aTag = cmsSigBToA0Tag;
        p.pcs = "XYZ";
        p.forward = {1.5, 35.0};
        p.inverse = {0.05, 0.5};
        p.nodeRoundTrip = 0.05;  // XYZ to Lab takes its cube roots from a single-precision table
        p.corrupt = true;
        c.push_back(p);

        p = RealProfile{"lcms2 v4", corpus_detail::LcmsV4(), "written by lcms2 (helpers/lcms_oracle.h)",
                        "\"mAB \"/\"mBA \" tables with curves shorter and longer than held",
                        "v4 curves looked for at the wrong alignment"};
        p.b2a = "B2A0";
        p.a2bTag = cmsSigAToB0Tag;
        p.b2aTag = cmsSigBToA0Tag;
        c.push_back(p);

        p = RealProfile{"sRGB", Installed("sRGB.icc"), "icc-profiles-free's sRGB", "matrix/TRC with 1024-entry curves",
                        "the inverse matrix applied transposed"};
        p.pcs = "XYZ";
        p.matrixTrc = true;
        p.forward = {0.3, 1.5};
        p.inverse = {0.6, 4.0};
        p.measurements = "lattice";  // its gamut is checked on an RGB lattice
        p.corrupt = true;
        c.push_back(p);

        p = RealProfile{"AdobeRGB", Installed("compatibleWithAdobeRGB1998.icc"), "icc-profiles-free's Adobe RGB",
                        "matrix/TRC with gamma curves", "a gamma read as u8Fixed8 off by one step"};
        p.pcs = "XYZ";
        p.matrixTrc = true;
        p.forward = {0.3, 1.5};
        p.inverse = {0.6, 4.0};
        c.push_back(p);

        for (const char* name : {"ghostscript/srgb.icc", "ghostscript/esrgb.icc", "ghostscript/scrgb.icc"}) {
            p = RealProfile{name, Installed(name), "ghostscript's matrix/TRC RGB", "2048-entry and identity curves",
                            "sampled curves decimated off by one"};
            p.pcs = "XYZ";
            p.matrixTrc = true;
            c.push_back(p);
        }
        return c;
    }();
    return corpus;
}

inline const RealProfile& CorpusProfile(const std::string& name) {
    for (const RealProfile& p : ProfileCorpus())
        if (name == p.name) return p;
    static const RealProfile none{"none", std::string(), "", "", ""};
    return none;
}

// colord's v4 profiles carry parametric curves, which the reader does not take.
inline std::vector<std::string> ParametricProfiles() {
    std::vector<std::string> paths;
    for (const char* name : {"colord/sRGB.icc", "colord/AdobeRGB1998.icc", "colord/ProPhotoRGB.icc"})
        if (const std::string path = corpus_detail::Installed(name); !path.empty()) paths.push_back(path);
    return paths;
}

}  // namespace vantrel::test
