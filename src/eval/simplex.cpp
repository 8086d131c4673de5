// Sorted-fraction (Kuhn) interpolation of tables of one to four inputs.
//
// A cell of n inputs is cut into n! simplices; the point lies in the one found by raising the
// channels in the order of their fractions, largest first, and its value is the weighted sum of
// the n + 1 corners of that walk. A channel whose fraction is 0 is never raised, so a point on
// the last grid point (index G - 1, fraction 0) reads no node past it; the corner between two
// equal fractions has weight 0. Points on a node and points on the cell's diagonal take their one
// or two corners directly.
#include "eval/interpolation.h"

#include "eval/grid_coordinate.h"

namespace vantrel {
namespace {

constexpr int kMaxCorners = 5;

struct SimplexWalk {
    int32_t node[kMaxCorners];
    double weight[kMaxCorners];
    int count = 0;
};

// Output j = sum of weight x corner value. kOutputs and kCorners > 0 fix the counts at compile
// time so that the sums unroll.
template <bool kCurves, int kOutputs, int kCorners>
void Accumulate(const LutView& t, const SimplexWalk& walk, double* out) {
    const int m = kOutputs > 0 ? kOutputs : t.outputs;
    const int corners = kCorners > 0 ? kCorners : walk.count;
    const int entries = t.outputEntries;
    const double scale = t.outputScale;
    const uint16_t* clut = t.clut;
    for (int j = 0; j < m; ++j) {
        const uint16_t* curve = t.outputCurves + j * entries;
        double sum = 0.0;
        for (int k = 0; k < corners; ++k) {
            const uint16_t c = clut[walk.node[k] + j];
            if constexpr (kCurves) {
                // Each corner goes through the output curve on its own, without interpolation.
                sum += walk.weight[k] * curve[static_cast<int>(c * scale)];
            } else {
                sum += walk.weight[k] * c;
            }
        }
        out[j] = sum;
    }
}

template <int kCorners>
void Finish(const LutView& t, const SimplexWalk& walk, double* out) {
    const bool curves = t.UsesOutputCurves();
    if (t.outputs == 3) {  // device-to-Lab tables
        curves ? Accumulate<true, 3, kCorners>(t, walk, out) : Accumulate<false, 3, kCorners>(t, walk, out);
    } else if (t.outputs == 4) {  // Lab-to-CMYK tables
        curves ? Accumulate<true, 4, kCorners>(t, walk, out) : Accumulate<false, 4, kCorners>(t, walk, out);
    } else {
        curves ? Accumulate<true, 0, kCorners>(t, walk, out) : Accumulate<false, 0, kCorners>(t, walk, out);
    }
}

// A point on a node: that node alone.
void OnNode(const LutView& t, int32_t base, double* out) {
    SimplexWalk walk;
    walk.node[0] = base;
    walk.weight[0] = 1.0;
    walk.count = 1;
    Finish<1>(t, walk, out);
}

// All fractions equal to f > 0: the first corner and the corner with every channel raised.
void OnDiagonal(const LutView& t, int32_t base, double f, double* out) {
    SimplexWalk walk;
    walk.node[0] = base;
    walk.weight[0] = 1.0 - f;
    walk.node[1] = base + t.cornerOffsets[(1 << t.inputs) - 1];
    walk.weight[1] = f;
    walk.count = 2;
    Finish<2>(t, walk, out);
}

// The walk through channels o[0..N-1] (fractions largest first): weights 1 - f(1),
// f(1) - f(2), .., f(N).
template <int N>
void Walk(const LutView& t, int32_t base, const double* f, const int* o, double* out) {
    SimplexWalk walk;
    int32_t node = base;
    double previous = 1.0;
    walk.node[0] = base;
    for (int k = 0; k < N; ++k) {
        const int c = o[k];
        walk.weight[k] = previous - f[c];
        previous = f[c];
        if (f[c] > 0.0) node += t.clutStrides[c];  // never past the last grid point
        walk.node[k + 1] = node;
    }
    walk.weight[N] = previous;
    walk.count = N + 1;
    Finish<N + 1>(t, walk, out);
}

void Simplex1(const LutView& t, int32_t base, const double* f, double* out) {
    if (f[0] == 0.0) return OnNode(t, base, out);
    const int o[1] = {0};
    Walk<1>(t, base, f, o, out);
}

void Simplex2(const LutView& t, int32_t base, const double* f, double* out) {
    if (f[0] == f[1]) return f[0] == 0.0 ? OnNode(t, base, out) : OnDiagonal(t, base, f[0], out);
    const int o[2] = {f[0] > f[1] ? 0 : 1, f[0] > f[1] ? 1 : 0};
    Walk<2>(t, base, f, o, out);
}

void Simplex3(const LutView& t, int32_t base, const double* f, double* out) {
    const double f0 = f[0], f1 = f[1], f2 = f[2];
    if (f0 == f1 && f1 == f2) return f0 == 0.0 ? OnNode(t, base, out) : OnDiagonal(t, base, f0, out);
    // Each channel's place is the number of channels ahead of it (the lower channel first
    // among equal fractions).
    int o[3];
    o[(f1 > f0) + (f2 > f0)] = 0;
    o[(f0 >= f1) + (f2 > f1)] = 1;
    o[(f0 >= f2) + (f1 >= f2)] = 2;
    Walk<3>(t, base, f, o, out);
}

void Simplex4(const LutView& t, int32_t base, const double* f, double* out) {
    const double f0 = f[0], f1 = f[1], f2 = f[2], f3 = f[3];
    if (f0 == f1 && f1 == f2 && f2 == f3) return f0 == 0.0 ? OnNode(t, base, out) : OnDiagonal(t, base, f0, out);
    int o[4];
    o[(f1 > f0) + (f2 > f0) + (f3 > f0)] = 0;
    o[(f0 >= f1) + (f2 > f1) + (f3 > f1)] = 1;
    o[(f0 >= f2) + (f1 >= f2) + (f3 > f2)] = 2;
    o[(f0 >= f3) + (f1 >= f3) + (f2 >= f3)] = 3;
    Walk<4>(t, base, f, o, out);
}

}  // namespace

void InterpolateSimplex(const LutView& t, KernelScratch& s) {
    if (t.inputs < 1 || t.inputs > 4 || t.outputs < 1 || t.outputs > KernelScratch::kVectorSize) return;
    double f[4];
    switch (t.inputs) {
        case 1: Simplex1(t, LocateKernelCell<1>(t, s, f), f, s.vector); break;
        case 2: Simplex2(t, LocateKernelCell<2>(t, s, f), f, s.vector); break;
        case 3: Simplex3(t, LocateKernelCell<3>(t, s, f), f, s.vector); break;
        default: Simplex4(t, LocateKernelCell<4>(t, s, f), f, s.vector); break;
    }
}

}  // namespace vantrel
