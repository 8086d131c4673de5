#pragma once

// Shared by the evaluation tests: real profiles loaded into CProfil, and small profiles with tables
// of known functions for exact cases. lcms2, the oracle, is in helpers/lcms_oracle.h.
#include <gtest/gtest.h>
#include <lcms2.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "colour/colour_values.h"
#include "eval/forward.h"
#include "helpers/icc_builder.h"
#include "helpers/lcms_oracle.h"
#include "helpers/profile_corpus.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

namespace vantrel::test {

// Reads both directions of `path` into `p`; true when both tags loaded.
inline bool LoadProfile(CProfil& p, const std::string& path, const char* a2b = "A2B1", const char* b2a = "B2A1",
                        bool mediaWhite = false) {
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = mediaWhite;
    p.ReadTagTable(0, path);
    const bool forward = p.LoadLut(0, a2b, path) == 1;
    p.ReadTagTable(1, path);
    return p.LoadLut(1, b2a, path) == 1 && forward;
}

// A profile of data colour space `space` (Lab PCS) holding `tags`, written into `dir` under a
// fresh name and loaded into `p` from "A2B1" and "B2A1" where present.
inline void WriteAndLoad(CProfil& p, const TempDir& dir, const char* space,
                         const std::vector<std::pair<std::string, Bytes>>& tags, bool mediaWhite = false) {
    IccBuilder builder(space, "Lab ");
    for (const auto& tag : tags) builder.AddTag(tag.first, tag.second);
    const auto files = std::distance(std::filesystem::directory_iterator(dir.Path()), {});
    LoadProfile(p, WriteFile(dir.File(std::to_string(files) + ".icc"), builder.Build()), "A2B1", "B2A1", mediaWhite);
}

// Device fractions (0..1 per input) of a grid node.
inline std::vector<double> NodeFractions(const std::vector<int>& node, int grid) {
    std::vector<double> f;
    for (int i : node) f.push_back(static_cast<double>(i) / (grid - 1));
    return f;
}

// A device-to-Lab table (16-bit, 256-entry straight curves) sampling `lab` at its nodes: L* 100 at
// 65535, a* = 0 at 127.5 x 257.
inline LutSpec DeviceToLabLut(int inputs, int grid, const std::function<Lab(const std::vector<double>&)>& lab) {
    auto encode = [](double v, double offset, double scale) {
        return static_cast<uint16_t>(std::lround(std::clamp((v + offset) * scale, 0.0, 65535.0)));
    };
    return MakeLut(
        inputs, 3, grid,
        [&](const std::vector<int>& node, int out) {
            const Lab v = lab(NodeFractions(node, grid));
            return out == 0 ? encode(v.L, 0.0, 655.35) : encode(out == 1 ? v.a : v.b, 127.5, 257.0);
        },
        256, 256);
}

// A table of `outputs` device values (0..255 each) from `device` at its nodes.
inline LutSpec DeviceLut(int inputs, int outputs, int grid,
                         const std::function<double(const std::vector<double>&, int)>& device) {
    return MakeLut(
        inputs, outputs, grid,
        [&](const std::vector<int>& node, int out) {
            const double value = std::clamp(device(NodeFractions(node, grid), out), 0.0, 255.0);
            return static_cast<uint16_t>(std::lround(value * 257.0));
        },
        256, 256);
}

// The Lab (L* unscaled) of four device values through the direction-0 table.
inline Lab CmykLab(CProfil& p, const double* device) {
    double v[4] = {device[0], device[1], device[2], device[3]};
    CmykToLab(p, v);
    return Lab{v[0] / 2.55, v[1], v[2]};
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
    }
};

}  // namespace vantrel::test
