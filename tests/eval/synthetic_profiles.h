#pragma once

// Small profiles with tables of known functions, for exact cases of the evaluation tests.
#include <algorithm>
#include <cmath>
#include <functional>
#include <string>
#include <vector>

#include "colour/colour_values.h"
#include "helpers/icc_builder.h"
#include "helpers/test_paths.h"
#include "icc/profil.h"

namespace vantrel::test {

// Lab as the 16-bit values of a Lab table: L* 100 at 65535, a* = 0 at 127.5 x 257.
inline uint16_t EncodeL16(double L) { return static_cast<uint16_t>(std::lround(std::clamp(L * 655.35, 0.0, 65535.0))); }
inline uint16_t EncodeAB16(double a) {
    return static_cast<uint16_t>(std::lround(std::clamp((a + 127.5) * 257.0, 0.0, 65535.0)));
}

// Device fractions (0..1 per input) of a grid node.
inline std::vector<double> NodeFractions(const std::vector<int>& node, int grid) {
    std::vector<double> f;
    for (int i : node) f.push_back(static_cast<double>(i) / (grid - 1));
    return f;
}

using LabFunction = std::function<Lab(const std::vector<double>&)>;

// A device-to-Lab table (16-bit, 256-entry straight curves) sampling `lab` at its nodes.
inline LutSpec DeviceToLabLut(int inputs, int grid, const LabFunction& lab) {
    return MakeLut(
        inputs, 3, grid,
        [&](const std::vector<int>& node, int out) {
            const Lab v = lab(NodeFractions(node, grid));
            return out == 0 ? EncodeL16(v.L) : EncodeAB16(out == 1 ? v.a : v.b);
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

// Writes a profile of the given data colour space holding the tags, and loads it into `p`
// (direction 0 from "A2B1" and direction 1 from "B2A1" where present).
inline std::string WriteAndLoad(CProfil& p, const TempDir& dir, const std::string& name, const char* space,
                                const std::vector<std::pair<std::string, Bytes>>& tags, bool mediaWhite = false) {
    IccBuilder builder(space, "Lab ");
    for (const auto& tag : tags) builder.AddTag(tag.first, tag.second);
    const std::string path = WriteFile(dir.File(name), builder.Build());
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = mediaWhite;
    p.ReadTagTable(0, path);
    p.LoadLut(0, "A2B1", path);
    p.ReadTagTable(1, path);
    p.LoadLut(1, "B2A1", path);
    return path;
}

}  // namespace vantrel::test
