#pragma once
// Five- to seven-colourant printer profiles for tests, written by lcms2 from a small ink model
// (no such profile is installed on these machines).
//
//   const std::string& path = MultiInkProfile(InkSet::kCmykOG);   // built on first use
//   Lab lab = InkModelLab(InkSet::kCmykOG, inks);  // the model itself (a printer to measure), inks 0..1
//
// The model: a paper reflecting evenly, each ink a filter whose optical density over 400..700 nm
// grows with its coverage (with some dot gain), overprints multiply their transmittances
// (Beer-Lambert), CIE 1931 observer (Wyman, Sloan and Shirley's fit) under an equal-energy light,
// relative to the paper and taken onto D50. The media white is D50, so relative and absolute
// colorimetric agree.
//
// Each profile is v2 with mft2 tables: A2B0 = A2B1 (device to Lab, 256-entry straight curves) and
// B2A0 = B2A1 (Lab to device, grid 17). The A2B grid has 7 points for five inks, 6 for six, 5 for
// seven. The separation inverts the forward table; it is a hue-sector one with full black
// replacement: every colour is two inks adjacent in hue plus black, so orange, green, red or blue
// ink prints where it extends the gamut beyond what the two process inks beside it reach.
// Profiles are written once per test process into a temporary directory.

#include <lcms2.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "colour/colour_values.h"
#include "helpers/test_paths.h"

namespace vantrel::test {

enum class InkSet {
    kCmykO,    // "5CLR": C, M, Y, K, orange
    kCmykOG,   // "6CLR": C, M, Y, K, orange, green
    kCmykRGB,  // "7CLR": C, M, Y, K, red, green, blue
    kCmyk,     // "CMYK": the process inks of the same model alone
};

namespace multi_ink {

constexpr int kBands = 31;  // 400, 410, .. 700 nm
inline double Wavelength(int band) { return 400.0 + 10.0 * band; }

// One lobe of the observer fit: a Gaussian with different widths either side of its peak.
inline double Lobe(double nm, double peak, double below, double above) {
    const double t = (nm - peak) / (nm < peak ? below : above);
    return std::exp(-0.5 * t * t);
}
inline std::array<double, 3> Observer(double nm) {
    return {1.056 * Lobe(nm, 599.8, 37.9, 31.0) + 0.362 * Lobe(nm, 442.0, 16.0, 26.7) -
                0.065 * Lobe(nm, 501.1, 20.4, 26.2),
            0.821 * Lobe(nm, 568.8, 46.9, 40.5) + 0.286 * Lobe(nm, 530.9, 16.3, 31.1),
            1.217 * Lobe(nm, 437.0, 11.8, 36.0) + 0.681 * Lobe(nm, 459.0, 26.0, 13.8)};
}

// Density of a filter absorbing between lo and hi nm, with soft edges.
inline double Band(double nm, double lo, double hi) {
    auto rise = [](double x) { return 1.0 / (1.0 + std::exp(-x / 9.0)); };
    return rise(nm - lo) * rise(hi - nm);
}

enum Ink { kC, kM, kY, kK, kO, kG, kR, kB };

inline double Density(Ink ink, double nm) {
    switch (ink) {
        case kC: return 1.45 * Band(nm, 585, 760) + 0.10 * Band(nm, 480, 585);
        case kM: return 1.40 * Band(nm, 495, 595) + 0.12 * Band(nm, 380, 495);
        case kY: return 1.50 * Band(nm, 340, 495) + 0.03;
        case kK: return 1.75 + 0.1 * (nm - 400) / 300;
        case kO: return 1.45 * Band(nm, 340, 565) + 0.04;
        case kG: return 1.45 * (Band(nm, 340, 480) + Band(nm, 585, 760)) + 0.05;
        case kR: return 1.55 * Band(nm, 340, 590) + 0.04;
        case kB: return 1.45 * Band(nm, 495, 760) + 0.06;
    }
    return 0;
}

struct Set {
    const char* space;                         // header colour space
    cmsColorSpaceSignature signature;
    int grid;                                  // A2B grid points
    std::vector<Ink> inks;                     // channel order
    std::vector<std::pair<int, int>> sectors;  // channel pairs adjacent in hue
};

inline const Set& SetOf(InkSet s) {
    static const Set sets[] = {
        {"5CLR", cmsSig5colorData, 7, {kC, kM, kY, kK, kO}, {{1, 4}, {4, 2}, {2, 0}, {0, 1}}},
        {"6CLR", cmsSig6colorData, 6, {kC, kM, kY, kK, kO, kG}, {{1, 4}, {4, 2}, {2, 5}, {5, 0}, {0, 1}}},
        {"7CLR", cmsSig7colorData, 5, {kC, kM, kY, kK, kR, kG, kB},
         {{1, 4}, {4, 2}, {2, 5}, {5, 0}, {0, 6}, {6, 1}}},
        {"CMYK", cmsSigCmykData, 9, {kC, kM, kY, kK}, {{1, 2}, {2, 0}, {0, 1}}},
    };
    return sets[static_cast<int>(s)];
}

// Densities per channel and band, and the observer's weights per band, computed once.
struct Tables {
    std::vector<std::array<double, kBands>> density;
    std::array<std::array<double, 3>, kBands> observer;
    std::array<double, 3> paper;
    explicit Tables(const Set& set) {
        for (Ink ink : set.inks) {
            std::array<double, kBands> d;
            for (int k = 0; k < kBands; ++k) d[k] = Density(ink, Wavelength(k));
            density.push_back(d);
        }
        paper = {0, 0, 0};
        for (int k = 0; k < kBands; ++k) {
            observer[k] = Observer(Wavelength(k));
            for (int c = 0; c < 3; ++c) paper[c] += observer[k][c];
        }
    }
    Lab Evaluate(const double* inks) const {
        std::array<double, 3> xyz = {0, 0, 0};
        double amount[7];
        // Dot gain: a 50 % tint prints as about 60 % of the solid's density.
        for (size_t i = 0; i < density.size(); ++i) {
            const double c = std::clamp(inks[i], 0.0, 1.0);
            amount[i] = c * (1.0 + 0.4 * (1.0 - c));
        }
        for (int k = 0; k < kBands; ++k) {
            double d = 0;
            for (size_t i = 0; i < density.size(); ++i) d += amount[i] * density[i][k];
            const double r = std::pow(10.0, -d);
            for (int c = 0; c < 3; ++c) xyz[c] += r * observer[k][c];
        }
        // Relative to the paper: the paper is L* 100, a* b* 0.
        auto f = [](double t) { return t > 216.0 / 24389 ? std::cbrt(t) : (24389.0 / 27 * t + 16) / 116; };
        const double fx = f(xyz[0] / paper[0]), fy = f(xyz[1] / paper[1]), fz = f(xyz[2] / paper[2]);
        return Lab{116 * fy - 16, 500 * (fx - fy), 200 * (fy - fz)};
    }
};

inline double Distance(const Lab& x, const Lab& y) {
    return std::sqrt((x.L - y.L) * (x.L - y.L) + (x.a - y.a) * (x.a - y.a) + (x.b - y.b) * (x.b - y.b));
}

// Inks (0..1 per channel) for `target`: the best of every sector's pair plus black, found from a
// coarse lattice by a shrinking pattern search. `forward` gives the colour of inks (7 values).
template <typename Forward>
class Separation {
public:
    Separation(const Set& set, Forward forward) : set_(set), forward_(forward) {
        for (size_t s = 0; s < set.sectors.size(); ++s)
            for (int i = 0; i <= kCoarse; ++i)
                for (int j = 0; j <= kCoarse; ++j)
                    for (int k = 0; k <= kCoarse; ++k) {
                        const std::array<double, 3> p = {double(i) / kCoarse, double(j) / kCoarse, double(k) / kCoarse};
                        coarse_.push_back({static_cast<int>(s), p, Colour(static_cast<int>(s), p)});
                    }
    }
    std::vector<double> Inks(const Lab& target) const {
        // The two best starting points of different sectors, each refined.
        const Start* best[2] = {nullptr, nullptr};
        double bestD[2] = {1e300, 1e300};
        for (const Start& s : coarse_) {
            const double d = Distance(s.lab, target);
            if (d < bestD[0]) {
                if (!best[0] || best[0]->sector != s.sector) {
                    best[1] = best[0];
                    bestD[1] = bestD[0];
                }
                best[0] = &s;
                bestD[0] = d;
            } else if (d < bestD[1] && s.sector != best[0]->sector) {
                best[1] = &s;
                bestD[1] = d;
            }
        }
        std::vector<double> inks(set_.inks.size(), 0.0);
        double answer = 1e300;
        for (const Start* start : best) {
            // A second sector only when it starts about as close.
            if (!start || (start == best[1] && bestD[1] > bestD[0] + 2.0)) continue;
            std::array<double, 3> p = start->p;
            double d = Distance(Colour(start->sector, p), target);
            for (double step = 0.5 / kCoarse; step > 5e-4;) {
                bool moved = false;
                for (int axis = 0; axis < 3; ++axis)
                    for (double sign : {1.0, -1.0}) {
                        std::array<double, 3> q = p;
                        q[axis] = std::clamp(q[axis] + sign * step, 0.0, 1.0);
                        const double e = Distance(Colour(start->sector, q), target);
                        if (e < d - 1e-9) {
                            d = e;
                            p = q;
                            moved = true;
                        }
                    }
                if (!moved) step *= 0.5;
            }
            if (d < answer) {
                answer = d;
                const auto all = Channels(start->sector, p);
                inks.assign(all.begin(), all.begin() + static_cast<long>(inks.size()));
            }
        }
        return inks;
    }

private:
    static constexpr int kCoarse = 8;
    struct Start {
        int sector;
        std::array<double, 3> p;
        Lab lab;
    };
    std::array<double, 7> Channels(int sector, const std::array<double, 3>& p) const {
        std::array<double, 7> inks = {};
        inks[static_cast<size_t>(set_.sectors[static_cast<size_t>(sector)].first)] = p[0];
        inks[static_cast<size_t>(set_.sectors[static_cast<size_t>(sector)].second)] = p[1];
        inks[3] = p[2];  // black is channel 3 of every set
        return inks;
    }
    Lab Colour(int sector, const std::array<double, 3>& p) const { return forward_(Channels(sector, p).data()); }

    const Set& set_;
    Forward forward_;
    std::vector<Start> coarse_;
};

// v2 Lab PCS encoding of mft2 tables: L* 100 at 0xFF00, a* b* 0 at 0x8000.
inline std::array<cmsUInt16Number, 3> EncodeLabV2(const Lab& lab) {
    auto word = [](double v) { return static_cast<cmsUInt16Number>(std::lround(std::clamp(v, 0.0, 65535.0))); };
    return {word(lab.L * 652.8), word((lab.a + 128) * 256), word((lab.b + 128) * 256)};
}

inline cmsStage* StraightCurves(int channels) {
    std::vector<cmsUInt16Number> ramp(256);
    for (int k = 0; k < 256; ++k) ramp[static_cast<size_t>(k)] = static_cast<cmsUInt16Number>(k * 257);
    cmsToneCurve* curve = cmsBuildTabulatedToneCurve16(nullptr, 256, ramp.data());
    std::vector<cmsToneCurve*> curves(static_cast<size_t>(channels), curve);
    cmsStage* stage = cmsStageAllocToneCurves(nullptr, static_cast<cmsUInt32Number>(channels), curves.data());
    cmsFreeToneCurve(curve);
    return stage;
}

// A curves-CLUT-curves pipeline whose CLUT node values come from `node` (grid indices in, 16-bit
// outputs out).
template <typename Node>
cmsPipeline* ClutPipeline(int inputs, int outputs, int grid, Node node) {
    cmsStage* clut = cmsStageAllocCLut16bit(nullptr, static_cast<cmsUInt32Number>(grid),
                                            static_cast<cmsUInt32Number>(inputs), static_cast<cmsUInt32Number>(outputs),
                                            nullptr);
    auto sample = [](const cmsUInt16Number in[], cmsUInt16Number out[], void* data) -> cmsInt32Number {
        (*static_cast<Node*>(data))(in, out);
        return TRUE;
    };
    cmsStageSampleCLut16bit(clut, sample, &node, 0);
    cmsPipeline* pipeline = cmsPipelineAlloc(nullptr, static_cast<cmsUInt32Number>(inputs),
                                             static_cast<cmsUInt32Number>(outputs));
    for (cmsStage* stage : {StraightCurves(inputs), clut, StraightCurves(outputs)})
        cmsPipelineInsertStage(pipeline, cmsAT_END, stage);
    return pipeline;
}

// Grid points of the separation tables: enough for smooth separations, few enough that the
// profiles take a second to build in a sanitizer build.
constexpr int kSeparationGrid = 17;

inline bool WriteProfile(InkSet which, const std::string& path) {
    const Set& set = SetOf(which);
    const Tables model(set);
    const int n = static_cast<int>(set.inks.size());
    cmsPipeline* forward = ClutPipeline(n, 3, set.grid, [&](const cmsUInt16Number in[], cmsUInt16Number out[]) {
        double inks[7] = {};
        for (int i = 0; i < n; ++i) inks[i] = in[i] / 65535.0;
        const auto v = EncodeLabV2(model.Evaluate(inks));
        std::copy(v.begin(), v.end(), out);
    });
    // The separation inverts the forward table as lcms2 interpolates it, so that the two tables
    // agree with each other, as a profiler's do.
    auto table = [forward, n](const double* inks) {
        float in[7], out[3];
        for (int i = 0; i < n; ++i) in[i] = static_cast<float>(inks[i]);
        cmsPipelineEvalFloat(in, out, forward);
        return Lab{out[0] * 65535.0 / 652.8, out[1] * 65535.0 / 256.0 - 128, out[2] * 65535.0 / 256.0 - 128};
    };
    const Separation<decltype(table)> separation(set, table);
    cmsPipeline* backward = ClutPipeline(3, n, kSeparationGrid, [&](const cmsUInt16Number in[], cmsUInt16Number out[]) {
        const Lab target{in[0] / 652.8, in[1] / 256.0 - 128, in[2] / 256.0 - 128};
        const std::vector<double> inks = separation.Inks(target);
        for (int i = 0; i < n; ++i) out[i] = static_cast<cmsUInt16Number>(std::lround(inks[static_cast<size_t>(i)] * 65535));
    });

    cmsHPROFILE profile = cmsCreateProfilePlaceholder(nullptr);
    cmsSetProfileVersion(profile, 2.4);
    cmsSetDeviceClass(profile, cmsSigOutputClass);
    cmsSetColorSpace(profile, set.signature);
    cmsSetPCS(profile, cmsSigLabData);
    cmsMLU* text = cmsMLUalloc(nullptr, 1);
    cmsMLUsetASCII(text, "en", "US", (std::string("Test ink model ") + set.space).c_str());
    bool ok = cmsWriteTag(profile, cmsSigProfileDescriptionTag, text) && cmsWriteTag(profile, cmsSigCopyrightTag, text) &&
              cmsWriteTag(profile, cmsSigMediaWhitePointTag, cmsD50_XYZ());
    for (cmsTagSignature tag : {cmsSigAToB0Tag, cmsSigAToB1Tag}) ok = ok && cmsWriteTag(profile, tag, forward);
    for (cmsTagSignature tag : {cmsSigBToA0Tag, cmsSigBToA1Tag}) ok = ok && cmsWriteTag(profile, tag, backward);
    ok = ok && cmsSaveProfileToFile(profile, path.c_str());
    cmsMLUfree(text);
    cmsPipelineFree(forward);
    cmsPipelineFree(backward);
    cmsCloseProfile(profile);
    return ok;
}

}  // namespace multi_ink

inline int InkChannels(InkSet s) { return static_cast<int>(multi_ink::SetOf(s).inks.size()); }
inline const char* InkColourSpace(InkSet s) { return multi_ink::SetOf(s).space; }

// Relative Lab of the model for inks 0..1 in the profile's channel order.
inline Lab InkModelLab(InkSet s, const double* inks) {
    static std::map<InkSet, multi_ink::Tables> models;
    auto it = models.find(s);
    if (it == models.end()) it = models.emplace(s, multi_ink::Tables(multi_ink::SetOf(s))).first;
    return it->second.Evaluate(inks);
}

// lcms2 reads the a*, b* of these v2 tables as v / 256 - 128; the library reads every 16-bit
// Lab table as v / 257 - 127.5 (0.4 % short towards the ends). An lcms2 a* or b* as the library
// reads the same table value.
inline double AsReadFromSixteenBits(double ab) { return (ab + 128) * 256 / 257 - 127.5; }

// The profile's path, written on first use; empty when lcms2 could not write it.
inline const std::string& MultiInkProfile(InkSet s) {
    static TempDir dir;
    static std::map<InkSet, std::string> paths;
    auto it = paths.find(s);
    if (it == paths.end()) {
        const std::string path = dir.File(std::string("ink-") + InkColourSpace(s) + ".icc");
        it = paths.emplace(s, multi_ink::WriteProfile(s, path) ? path : std::string()).first;
    }
    return it->second;
}

}  // namespace vantrel::test
