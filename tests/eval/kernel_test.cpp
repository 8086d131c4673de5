// The interpolation kernels against brute-force references written here: a generic Kuhn
// simplex (sort every fraction, walk the n + 1 corners) and a generic multilinear sum over
// all 2^n corners. Tables are exactly sized, so a read past the grid fails under ASan.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <random>
#include <vector>

#include "eval/interpolation.h"
#include "random_lut.h"

namespace vantrel {
namespace {

using test::RandomLut;

struct Scratch {
    double vector[20] = {};
    WorkRecord records[20] = {};
    double complement[20] = {};
    double weights[128] = {};
    KernelScratch View() { return {vector, records, complement, weights}; }
};

struct Cell {
    std::vector<int> j;
    std::vector<double> f;
};

Cell ReferenceLocate(const RandomLut& t, const std::vector<double>& x) {
    Cell c;
    const double scale = t.sixteenBit ? (t.G - 1) / 65535.0 : (t.G - 1) / 255.0;
    for (int i = 0; i < t.n; ++i) {
        const uint16_t* curve = &t.in[static_cast<size_t>(i) * t.E];
        const double p = (t.E - 1) * x[i] / 255.0;
        int k = static_cast<int>(std::floor(p));
        double u = p - k;
        if (u > 0.9999) {
            ++k;
            u = 0;
        }
        const double v = k >= t.E - 1 ? curve[t.E - 1] : curve[k] + (curve[k + 1] - curve[k]) * u;
        const double g = v * scale;
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

bool UsesCurves(const RandomLut& t) { return t.O >= 256 && !t.identity; }
double OutScale(const RandomLut& t) { return t.sixteenBit ? (t.O - 1) / 65535.0 : 1.0; }

std::vector<double> ReferenceSimplex(const RandomLut& t, const std::vector<double>& x) {
    const Cell c = ReferenceLocate(t, x);
    std::vector<int> order(t.n);
    std::iota(order.begin(), order.end(), 0);
    std::stable_sort(order.begin(), order.end(), [&](int a, int b) { return c.f[a] > c.f[b]; });
    std::vector<double> out(t.m, 0.0);
    std::vector<int> idx = c.j;
    for (int k = 0; k <= t.n; ++k) {
        if (k > 0) ++idx[order[k - 1]];
        const double hi = k == 0 ? 1.0 : c.f[order[k - 1]];
        const double lo = k == t.n ? 0.0 : c.f[order[k]];
        const double w = hi - lo;
        if (w <= 0) continue;
        const int64_t node = t.Node(idx);
        for (int j = 0; j < t.m; ++j) {
            double v = t.clut.at(node + j);
            if (UsesCurves(t)) v = t.out.at(j * t.O + static_cast<int>(v * OutScale(t)));
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
        const int64_t node = t.Node(idx);
        for (int j = 0; j < t.m; ++j) out[j] += w * t.clut.at(node + j);
    }
    if (UsesCurves(t)) {
        for (int j = 0; j < t.m; ++j) {
            const double q = out[j] * OutScale(t);
            const int k = std::min(static_cast<int>(q), t.O - 1);
            const double u = q - k;
            out[j] = (u > 0 && k < t.O - 1) ? t.out[j * t.O + k] + (t.out[j * t.O + k + 1] - t.out[j * t.O + k]) * u
                                            : t.out[j * t.O + k];
        }
    }
    return out;
}

enum class Kernel { Simplex, Multilinear };

std::vector<double> Evaluate(Kernel kernel, const RandomLut& t, const std::vector<double>& x, Scratch& s) {
    std::fill(std::begin(s.vector), std::end(s.vector), -1.0);
    std::copy(x.begin(), x.end(), s.vector);
    KernelScratch view = s.View();
    if (kernel == Kernel::Simplex) {
        InterpolateSimplex(t.View(), view);
    } else {
        InterpolateMultilinear(t.View(), view);
    }
    return std::vector<double>(s.vector, s.vector + t.m);
}

// Inputs worth trying on a table: every 0/255 corner of the input cube (all of them up to
// five inputs, the two uniform ones and random mixtures beyond), then random values.
std::vector<std::vector<double>> Inputs(const RandomLut& t, std::mt19937& rng, int randomCount) {
    std::vector<std::vector<double>> inputs;
    if (t.n <= 5) {
        for (int mask = 0; mask < (1 << t.n); ++mask) {
            std::vector<double> x(t.n);
            for (int i = 0; i < t.n; ++i) x[i] = (mask & (1 << i)) ? 255.0 : 0.0;
            inputs.push_back(x);
        }
    } else {
        inputs.push_back(std::vector<double>(t.n, 0.0));
        inputs.push_back(std::vector<double>(t.n, 255.0));
    }
    std::uniform_real_distribution<double> value(0.0, 255.0);
    std::bernoulli_distribution edge(0.2);
    for (int r = 0; r < randomCount; ++r) {
        std::vector<double> x(t.n);
        for (auto& v : x) v = edge(rng) ? (edge(rng) ? 255.0 : 0.0) : value(rng);
        inputs.push_back(x);
    }
    return inputs;
}

void ExpectNear(const std::vector<double>& got, const std::vector<double>& want, const std::string& what) {
    ASSERT_EQ(got.size(), want.size());
    for (size_t j = 0; j < got.size(); ++j) EXPECT_NEAR(got[j], want[j], 1e-6 * (1 + std::fabs(want[j]))) << what;
}

std::string Describe(const RandomLut& t, const std::vector<double>& x) {
    std::string s = "n=" + std::to_string(t.n) + " m=" + std::to_string(t.m) + " G=" + std::to_string(t.G) +
                    " O=" + std::to_string(t.O) + (t.sixteenBit ? " 16-bit" : " 8-bit") +
                    (t.identity ? " identity" : "") + " x=";
    for (double v : x) s += std::to_string(v) + " ";
    return s;
}

RandomLut MakeTable(std::mt19937& rng, int n, int variant) {
    RandomLut t;
    t.n = n;
    t.m = n == 1 ? 1 + variant % 3 : 3 + variant % 2;
    const int maxGrid = n >= 6 ? 4 : n == 5 ? 6 : 17;
    t.G = 2 + static_cast<int>(rng() % (maxGrid - 1));
    t.sixteenBit = variant % 4 != 3;
    t.E = t.sixteenBit && variant % 5 == 0 ? 4096 : 256;
    const int outEntries[] = {256, 2, 4096, 256};
    t.O = t.sixteenBit ? outEntries[variant % 4] : 256;
    t.identity = variant % 7 == 6;
    t.Randomise(rng, variant % 2 == 0);
    return t;
}

void CompareWithReference(Kernel kernel, int n, int tables, int inputsPerTable) {
    std::mt19937 rng(1234 + n);
    Scratch s;
    for (int variant = 0; variant < tables; ++variant) {
        const RandomLut t = MakeTable(rng, n, variant);
        for (const auto& x : Inputs(t, rng, inputsPerTable)) {
            const auto want = kernel == Kernel::Simplex ? ReferenceSimplex(t, x) : ReferenceMultilinear(t, x);
            ExpectNear(Evaluate(kernel, t, x, s), want, Describe(t, x));
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

// A table with identity input curves whose grid values are easy to place.
RandomLut LinearTable(int n, int G, bool sixteenBit = true) {
    std::mt19937 rng(99);
    RandomLut t;
    t.n = n;
    t.m = 3;
    t.G = G;
    t.sixteenBit = sixteenBit;
    t.O = 256;
    t.Randomise(rng, true);
    t.LinearInputCurves();
    return t;
}

std::vector<double> NodeValue(const RandomLut& t, const std::vector<int>& idx, bool curves) {
    std::vector<double> v(t.m);
    for (int j = 0; j < t.m; ++j) {
        v[j] = t.clut[t.Node(idx) + j];
        if (curves) v[j] = t.out[j * t.O + static_cast<int>(v[j] * OutScale(t))];
    }
    return v;
}

TEST(Kernels, AllInputsAt255ReadOnlyTheLastNodeAndAt0TheFirst) {
    for (Kernel kernel : {Kernel::Simplex, Kernel::Multilinear}) {
        for (int n = 1; n <= (kernel == Kernel::Simplex ? 4 : 7); ++n) {
            const RandomLut t = LinearTable(n, n >= 6 ? 3 : 5);
            Scratch s;
            const auto top = Evaluate(kernel, t, std::vector<double>(n, 255.0), s);
            for (int i = 0; i < n; ++i) {
                EXPECT_EQ(s.records[i].index, t.G - 1);
                EXPECT_EQ(s.records[i].fraction, 0.0);
            }
            // Only the last node contributes; the simplex kernel maps it through the curves per
            // corner, the multilinear one after summing: the same for a single corner.
            const auto last = NodeValue(t, std::vector<int>(n, t.G - 1), kernel == Kernel::Simplex);
            if (kernel == Kernel::Simplex) {
                ExpectNear(top, last, "simplex 255");
            } else {
                ExpectNear(top, ReferenceMultilinear(t, std::vector<double>(n, 255.0)), "multilinear 255");
            }
            const auto bottom = Evaluate(kernel, t, std::vector<double>(n, 0.0), s);
            if (kernel == Kernel::Simplex) {
                ExpectNear(bottom, NodeValue(t, std::vector<int>(n, 0), true), "simplex 0");
            } else {
                ExpectNear(bottom, ReferenceMultilinear(t, std::vector<double>(n, 0.0)), "multilinear 0");
            }
        }
    }
}

TEST(Kernels, GridFractionAboveTheSnapLimitMovesToTheNextNode) {
    const RandomLut t = LinearTable(3, 9);
    Scratch s;
    // Grid coordinate 2.9985 on channel 1 lands on node 3; 2.9975 stays inside cell 2.
    auto input = [](double g) { return g * 255.0 / 8.0; };
    Evaluate(Kernel::Simplex, t, {0.0, input(2.9985), 0.0}, s);
    EXPECT_EQ(s.records[1].index, 3);
    EXPECT_EQ(s.records[1].fraction, 0.0);
    ExpectNear(std::vector<double>(s.vector, s.vector + 3), NodeValue(t, {0, 3, 0}, true), "snapped");
    Evaluate(Kernel::Multilinear, t, {0.0, input(2.9975), 0.0}, s);
    EXPECT_EQ(s.records[1].index, 2);
    EXPECT_NEAR(s.records[1].fraction, 0.9975, 1e-9);
}

TEST(Kernels, InputPositionAboveTheSnapLimitMovesToTheNextCurveEntry) {
    std::mt19937 rng(5);
    RandomLut t;
    t.n = 3;
    t.m = 3;
    t.G = 17;
    t.Randomise(rng, true);  // steep random curves: a missed snap shows
    Scratch s;
    const double x = (100 + 0.99995) * 255.0 / 255.0;  // E = 256: position 100.99995 on every channel
    const auto snapped = Evaluate(Kernel::Simplex, t, {x, x, x}, s);
    const auto next = Evaluate(Kernel::Simplex, t, {101.0, 101.0, 101.0}, s);
    ExpectNear(snapped, next, "input snap");
}

TEST(Kernels, EqualHalfFractionsGiveTheDiagonalForSimplexAndTheCornerMeanForMultilinear) {
    RandomLut t = LinearTable(3, 3);
    t.identity = true;  // raw grid values
    Scratch s;
    const double half = 0.5 * 255.0 / 2.0;  // grid coordinate 0.5 on a 3-point grid
    const auto simplex = Evaluate(Kernel::Simplex, t, {half, half, half}, s);
    const auto multi = Evaluate(Kernel::Multilinear, t, {half, half, half}, s);
    for (int j = 0; j < 3; ++j) {
        EXPECT_NEAR(simplex[j], (t.clut[t.Node({0, 0, 0}) + j] + t.clut[t.Node({1, 1, 1}) + j]) / 2.0, 1e-9);
        double mean = 0;
        for (int mask = 0; mask < 8; ++mask) mean += t.clut[t.Node({mask >> 2 & 1, mask >> 1 & 1, mask & 1}) + j];
        EXPECT_NEAR(multi[j], mean / 8, 1e-9);
    }
}

TEST(Kernels, UnsupportedInputCountsLeaveTheVectorAlone) {
    std::mt19937 rng(3);
    RandomLut t;
    t.n = 5;
    t.m = 4;
    t.G = 3;
    t.Randomise(rng, true);
    Scratch s;
    const auto got = Evaluate(Kernel::Simplex, t, {1, 2, 3, 4, 5}, s);
    EXPECT_EQ(got, (std::vector<double>{1, 2, 3, 4}));
}

TEST(Kernels, InputsOutsideTheDeviceRangeAreHeldToIt) {
    const RandomLut t = LinearTable(4, 9);
    Scratch s;
    const auto wild = Evaluate(Kernel::Simplex, t, {-40.0, 300.0, std::nan(""), 1e9}, s);
    const auto held = Evaluate(Kernel::Simplex, t, {0.0, 255.0, 0.0, 255.0}, s);
    EXPECT_EQ(wild, held);
}

}  // namespace
}  // namespace vantrel
