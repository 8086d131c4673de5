// The interpolation kernels against brute-force references written here: a generic Kuhn
// simplex (sort every fraction, walk the n + 1 corners) and a generic multilinear sum over
// all 2^n corners. Every table array is exactly as large as the table needs, so that a read past
// the grid or a curve fails under AddressSanitizer.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include "eval/interpolation.h"

namespace vantrel {
namespace {

struct RandomLut {
    int n = 3, m = 3, E = 256, O = 256, G = 9;
    bool sixteenBit = true;
    bool identity = false;
    std::vector<uint16_t> in, clut, out;
    std::vector<int32_t> strides, corners;

    int64_t Node(const std::vector<int>& idx) const {
        int64_t off = 0;
        for (int i = 0; i < n; ++i) off = off * G + idx[i];
        return off * m;
    }
    double GridScale() const { return (G - 1) / (sixteenBit ? 65535.0 : 255.0); }
    double OutScale() const { return sixteenBit ? (O - 1) / 65535.0 : 1.0; }
    bool UsesCurves() const { return O >= 256 && !identity; }
    LutView View() const {
        return LutView{n, m, E, O, G, GridScale(), OutScale(), identity,
                       in.data(), clut.data(), out.data(), strides.data(), corners.data()};
    }

    // Random curves (sorted and spanning the range when `monotone`), grid and output curves, the
    // strides and the corner table: corners ordered by the number of raised channels, then by
    // their channel lists.
    void Randomise(std::mt19937& rng, bool monotone) {
        const int top = sixteenBit ? 65535 : 255;
        std::uniform_int_distribution<int> value(0, top);
        auto fill = [&](std::vector<uint16_t>& v, size_t size) {
            v.resize(size);
            for (auto& x : v) x = static_cast<uint16_t>(value(rng));
        };
        fill(in, static_cast<size_t>(n) * E);
        for (int i = 0; monotone && i < n; ++i) {
            const auto curve = in.begin() + static_cast<long>(i) * E;
            std::sort(curve, curve + E);
            curve[0] = 0;
            curve[E - 1] = static_cast<uint16_t>(top);
        }
        fill(clut, static_cast<size_t>(std::pow(G, n)) * m);
        fill(out, static_cast<size_t>(m) * O);
        strides.assign(n, 0);
        for (int i = n - 1, s = m; i >= 0; --i, s *= G) strides[i] = s;
        std::vector<std::vector<int>> sets;
        for (int mask = 0; mask < (1 << n); ++mask) {
            sets.emplace_back();
            for (int i = 0; i < n; ++i)
                if (mask & (1 << i)) sets.back().push_back(i);
        }
        std::stable_sort(sets.begin(), sets.end(), [](const auto& a, const auto& b) {
            return a.size() != b.size() ? a.size() < b.size() : a < b;
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
        const double top = sixteenBit ? 65535.0 : 255.0;
        for (int i = 0; i < n; ++i)
            for (int k = 0; k < E; ++k) in[i * E + k] = static_cast<uint16_t>(k * top / (E - 1) + 0.5);
    }
};

struct Scratch {
    double vector[20] = {};
    WorkRecord records[20] = {};
    double complement[20] = {};
    double weights[128] = {};
};

struct Cell {
    std::vector<int> j;
    std::vector<double> f;
};

Cell ReferenceLocate(const RandomLut& t, const std::vector<double>& x) {
    Cell c;
    for (int i = 0; i < t.n; ++i) {
        const uint16_t* curve = &t.in[static_cast<size_t>(i) * t.E];
        const double p = (t.E - 1) * x[i] / 255.0;
        int k = static_cast<int>(std::floor(p));
        double u = p - k;
        if (u > 0.9999) {
            ++k;
            u = 0;
        }
        const double g = (k >= t.E - 1 ? curve[t.E - 1] : curve[k] + (curve[k + 1] - curve[k]) * u) * t.GridScale();
        int j = static_cast<int>(std::floor(g));
        double f = g - j;
        if (f > 0.998) {
            ++j;
            f = 0;
        }
        if (j >= t.G - 1) {
            j = t.G - 1;
            f = 0;
        }
        c.j.push_back(j);
        c.f.push_back(f);
    }
    return c;
}

std::vector<double> ReferenceSimplex(const RandomLut& t, const std::vector<double>& x) {
    const Cell c = ReferenceLocate(t, x);
    std::vector<int> order(t.n);
    std::iota(order.begin(), order.end(), 0);
    std::stable_sort(order.begin(), order.end(), [&](int a, int b) { return c.f[a] > c.f[b]; });
    std::vector<double> out(t.m, 0.0);
    std::vector<int> idx = c.j;
    for (int k = 0; k <= t.n; ++k) {
        if (k > 0) ++idx[order[k - 1]];
        const double w = (k == 0 ? 1.0 : c.f[order[k - 1]]) - (k == t.n ? 0.0 : c.f[order[k]]);
        if (w <= 0) continue;
        for (int j = 0; j < t.m; ++j) {
            double v = t.clut.at(t.Node(idx) + j);
            if (t.UsesCurves()) v = t.out.at(j * t.O + static_cast<int>(v * t.OutScale()));
            out[j] += w * v;
        }
    }
    return out;
}

std::vector<double> ReferenceMultilinear(const RandomLut& t, const std::vector<double>& x) {
    const Cell c = ReferenceLocate(t, x);
    std::vector<double> out(t.m, 0.0);
    for (int mask = 0; mask < (1 << t.n); ++mask) {
        double w = 1;
        std::vector<int> idx = c.j;
        for (int i = 0; i < t.n; ++i) {
            const bool raised = mask & (1 << (t.n - 1 - i));
            w *= raised ? c.f[i] : 1 - c.f[i];
            idx[i] += raised;
        }
        if (w <= 0) continue;
        for (int j = 0; j < t.m; ++j) out[j] += w * t.clut.at(t.Node(idx) + j);
    }
    for (int j = 0; j < t.m && t.UsesCurves(); ++j) {
        const double q = out[j] * t.OutScale();
        const int k = std::min(static_cast<int>(q), t.O - 1);
        const uint16_t* curve = &t.out[j * t.O];
        out[j] = (q - k > 0 && k < t.O - 1) ? curve[k] + (curve[k + 1] - curve[k]) * (q - k) : curve[k];
    }
    return out;
}

enum class Kernel { Simplex, Multilinear };

std::vector<double> Evaluate(Kernel kernel, const RandomLut& t, const std::vector<double>& x, Scratch& s) {
    std::fill(std::begin(s.vector), std::end(s.vector), -1.0);
    std::copy(x.begin(), x.end(), s.vector);
    KernelScratch view{s.vector, s.records, s.complement, s.weights};
    kernel == Kernel::Simplex ? InterpolateSimplex(t.View(), view) : InterpolateMultilinear(t.View(), view);
    return std::vector<double>(s.vector, s.vector + t.m);
}

void ExpectNear(const std::vector<double>& got, const std::vector<double>& want, const std::string& what) {
    ASSERT_EQ(got.size(), want.size());
    for (size_t j = 0; j < got.size(); ++j) EXPECT_NEAR(got[j], want[j], 1e-6 * (1 + std::fabs(want[j]))) << what;
}

// Random tables of every shape the loader gives: grid sizes, 8- and 16-bit, long input curves,
// 2-entry (skipped), 256- and 4096-entry output curves, identity output curves, steep curves.
// Each is tried at every 0/255 corner of the input cube (the two uniform corners beyond five
// inputs) and at random inputs, a fifth of whose channels sit at 0 or 255.
void CompareWithReference(Kernel kernel, int n, int tables, int inputsPerTable) {
    std::mt19937 rng(1234 + n);
    std::uniform_real_distribution<double> value(0.0, 255.0);
    std::bernoulli_distribution edge(0.2);
    Scratch s;
    for (int variant = 0; variant < tables; ++variant) {
        RandomLut t;
        t.n = n;
        t.m = n == 1 ? 1 + variant % 3 : 3 + variant % 2;
        t.G = 2 + static_cast<int>(rng() % ((n >= 6 ? 4 : n == 5 ? 6 : 17) - 1));
        t.sixteenBit = variant % 4 != 3;
        t.E = t.sixteenBit && variant % 5 == 0 ? 4096 : 256;
        t.O = t.sixteenBit ? std::vector<int>{256, 2, 4096, 256}[variant % 4] : 256;
        t.identity = variant % 7 == 6;
        t.Randomise(rng, variant % 2 == 0);

        std::vector<std::vector<double>> inputs;
        for (int mask = 0; mask < (1 << n); ++mask) {
            if (n > 5 && mask != 0 && mask != (1 << n) - 1) continue;
            std::vector<double> x(n);
            for (int i = 0; i < n; ++i) x[i] = (mask & (1 << i)) ? 255.0 : 0.0;
            inputs.push_back(x);
        }
        for (int r = 0; r < inputsPerTable; ++r) {
            std::vector<double> x(n);
            for (auto& v : x) v = edge(rng) ? (edge(rng) ? 255.0 : 0.0) : value(rng);
            inputs.push_back(x);
        }
        for (const auto& x : inputs) {
            const std::string what = "table " + std::to_string(variant) + " of " + std::to_string(n) +
                                     " inputs, G=" + std::to_string(t.G) + ", x=" + ::testing::PrintToString(x);
            const auto want = kernel == Kernel::Simplex ? ReferenceSimplex(t, x) : ReferenceMultilinear(t, x);
            ExpectNear(Evaluate(kernel, t, x, s), want, what);
            // The working records hold the cell: at 255 the last grid point with fraction 0.
            const Cell cell = ReferenceLocate(t, x);
            for (int i = 0; i < n; ++i) {
                EXPECT_EQ(s.records[i].index, cell.j[i]) << what;
                EXPECT_NEAR(s.records[i].fraction, cell.f[i], 1e-9) << what;
                EXPECT_NEAR(s.complement[i], 1.0 - cell.f[i], 1e-9) << what;
            }
            if (::testing::Test::HasFailure()) return;
        }
    }
}

TEST(SimplexKernel, MatchesGenericKuhnSimplexOnRandomTablesOfOneToFourInputs) {
    for (int n = 1; n <= 4; ++n) CompareWithReference(Kernel::Simplex, n, 28, 300);
}

TEST(MultilinearKernel, MatchesGenericMultilinearOnRandomTablesOfOneToSevenInputs) {
    for (int n = 1; n <= 7; ++n) CompareWithReference(Kernel::Multilinear, n, 28, n >= 6 ? 60 : 200);
}

// A table with random grid values whose inputs are easy to place: identity input curves.
RandomLut LinearTable(int n, int G) {
    std::mt19937 rng(99);
    RandomLut t;
    t.n = n;
    t.G = G;
    t.Randomise(rng, true);
    t.LinearInputCurves();
    return t;
}

TEST(Kernels, SnapLimitsMoveToTheNextNodeAndTheNextCurveEntry) {
    Scratch s;
    // Grid coordinate 2.9985 on channel 1 lands on node 3 (fraction 0); 2.9975 stays in cell 2.
    RandomLut t = LinearTable(3, 9);
    t.identity = true;  // raw grid values
    const std::vector<double> node(&t.clut[t.Node({0, 3, 0})], &t.clut[t.Node({0, 3, 0})] + 3);
    auto input = [](double g) { return g * 255.0 / 8.0; };
    for (Kernel kernel : {Kernel::Simplex, Kernel::Multilinear}) {
        ExpectNear(Evaluate(kernel, t, {0.0, input(2.9985), 0.0}, s), node, "grid snap");
        EXPECT_EQ(s.records[1].index, 3);
        EXPECT_EQ(s.records[1].fraction, 0.0);
        Evaluate(kernel, t, {0.0, input(2.9975), 0.0}, s);
        EXPECT_EQ(s.records[1].index, 2);
        EXPECT_NEAR(s.records[1].fraction, 0.9975, 1e-9);
    }
    // Input position 100.99995 (E = 256) is taken as entry 101; steep random curves show a miss.
    std::mt19937 rng(5);
    RandomLut steep;
    steep.G = 17;
    steep.Randomise(rng, true);
    const double x = 100.99995;
    ExpectNear(Evaluate(Kernel::Simplex, steep, {x, x, x}, s), Evaluate(Kernel::Simplex, steep, {101, 101, 101}, s),
               "input snap");
}

TEST(Kernels, UnsupportedInputCountsAndInputsOutsideTheRangeAreSafe) {
    Scratch s;
    // Five inputs are not the simplex kernel's: the vector stays as it was.
    std::mt19937 rng(3);
    RandomLut five;
    five.n = 5;
    five.m = 4;
    five.G = 3;
    five.Randomise(rng, true);
    EXPECT_EQ(Evaluate(Kernel::Simplex, five, {1, 2, 3, 4, 5}, s), (std::vector<double>{1, 2, 3, 4}));
    // Inputs beyond 0..255, and NaN, are held to the range instead of indexing past the curves.
    const RandomLut t = LinearTable(4, 9);
    EXPECT_EQ(Evaluate(Kernel::Simplex, t, {-40.0, 300.0, std::nan(""), 1e9}, s),
              Evaluate(Kernel::Simplex, t, {0.0, 255.0, 0.0, 255.0}, s));
}

}  // namespace
}  // namespace vantrel
