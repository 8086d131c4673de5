#pragma once

// Synthetic lookup tables for the kernel tests: every array is exactly as large as the table
// needs, so that a read past the grid or a curve shows under AddressSanitizer.
#include <algorithm>
#include <cstdint>
#include <random>
#include <vector>

#include "eval/lut_view.h"

namespace vantrel::test {

struct RandomLut {
    int n = 3, m = 3, E = 256, O = 256, G = 9;
    bool sixteenBit = true;
    bool identity = false;
    std::vector<uint16_t> in, clut, out;
    std::vector<int32_t> strides, corners;

    // Node offset of grid indices idx (first input slowest, outputs innermost).
    int64_t Node(const std::vector<int>& idx) const {
        int64_t off = 0;
        for (int i = 0; i < n; ++i) off = off * G + idx[i];
        return off * m;
    }

    LutView View() const {
        LutView v;
        v.inputs = n;
        v.outputs = m;
        v.inputEntries = E;
        v.outputEntries = O;
        v.grid = G;
        v.gridScale = sixteenBit ? (G - 1) / 65535.0 : (G - 1) / 255.0;
        v.outputScale = sixteenBit ? (O - 1) / 65535.0 : 1.0;
        v.outputIdentity = identity;
        v.inputCurves = in.data();
        v.clut = clut.data();
        v.outputCurves = out.data();
        v.clutStrides = strides.data();
        v.cornerOffsets = corners.data();
        return v;
    }

    // Strides and the corner table: corners ordered by the number of raised channels, then
    // by their channel lists.
    void BuildGeometry() {
        strides.assign(n, 0);
        int32_t s = m;
        for (int i = n - 1; i >= 0; --i) {
            strides[i] = s;
            s *= G;
        }
        std::vector<std::vector<int>> sets;
        for (int mask = 0; mask < (1 << n); ++mask) {
            std::vector<int> set;
            for (int i = 0; i < n; ++i)
                if (mask & (1 << i)) set.push_back(i);
            sets.push_back(set);
        }
        std::stable_sort(sets.begin(), sets.end(), [](const std::vector<int>& a, const std::vector<int>& b) {
            if (a.size() != b.size()) return a.size() < b.size();
            return a < b;
        });
        corners.clear();
        for (const auto& set : sets) {
            int32_t off = 0;
            for (int i : set) off += strides[i];
            corners.push_back(off);
        }
    }

    // Identity input curves on the table's value range.
    void LinearInputCurves() {
        in.resize(static_cast<size_t>(n) * E);
        const double top = sixteenBit ? 65535.0 : 255.0;
        for (int i = 0; i < n; ++i)
            for (int k = 0; k < E; ++k) in[i * E + k] = static_cast<uint16_t>(k * top / (E - 1) + 0.5);
    }

    void Randomise(std::mt19937& rng, bool monotoneInputs) {
        const int top = sixteenBit ? 65535 : 255;
        std::uniform_int_distribution<int> value(0, top);
        in.resize(static_cast<size_t>(n) * E);
        for (int i = 0; i < n; ++i) {
            std::vector<uint16_t> c(E);
            for (auto& x : c) x = static_cast<uint16_t>(value(rng));
            if (monotoneInputs) {
                std::sort(c.begin(), c.end());
                c.front() = 0;
                c.back() = static_cast<uint16_t>(top);
            }
            std::copy(c.begin(), c.end(), in.begin() + static_cast<long>(i) * E);
        }
        size_t nodes = 1;
        for (int i = 0; i < n; ++i) nodes *= G;
        clut.resize(nodes * m);
        for (auto& x : clut) x = static_cast<uint16_t>(value(rng));
        out.resize(static_cast<size_t>(m) * O);
        for (auto& x : out) x = static_cast<uint16_t>(value(rng));
        BuildGeometry();
    }
};

}  // namespace vantrel::test
