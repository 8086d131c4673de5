// Sorted-fraction (Kuhn) interpolation of tables of one to four inputs.
//
// A cell of n inputs is cut into n! simplices; the point lies in the one found by raising
// the channels in the order of their fractions, largest first. Corners whose weight is 0
// are never read: a channel with fraction 0 is never raised, and the corner between two
// equal fractions is skipped, so a point on the last grid point reads no node past it.
#include "eval/interpolation.h"

#include "eval/grid_coordinate.h"

namespace vantrel {
namespace {

// At most five corners of a four-input simplex.
struct SimplexWalk {
    int32_t node[5];
    double weight[5];
    int count = 0;

    void Add(int32_t n, double w) {
        if (w > 0.0) {
            node[count] = n;
            weight[count] = w;
            ++count;
        }
    }
};

template <bool kCurves>
void Accumulate(const LutView& t, const SimplexWalk& walk, double* out) {
    const int m = t.outputs;
    const int entries = t.outputEntries;
    const double scale = t.outputScale;
    const uint16_t* clut = t.clut;
    for (int j = 0; j < m; ++j) {
        const uint16_t* curve = t.outputCurves + j * entries;
        double sum = 0.0;
        for (int k = 0; k < walk.count; ++k) {
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

void Finish(const LutView& t, const SimplexWalk& walk, double* out) {
    if (t.UsesOutputCurves()) {
        Accumulate<true>(t, walk, out);
    } else {
        Accumulate<false>(t, walk, out);
    }
}

// Walks from the first corner raising channels a, b, c, d (fractions fa >= fb >= fc >= fd).
void Walk4(const LutView& t, int32_t base, const double* f, int a, int b, int c, int d, SimplexWalk& walk) {
    const int32_t* s = t.clutStrides;
    walk.Add(base, 1.0 - f[a]);
    const int32_t p1 = base + s[a];
    walk.Add(p1, f[a] - f[b]);
    const int32_t p2 = p1 + s[b];
    walk.Add(p2, f[b] - f[c]);
    const int32_t p3 = p2 + s[c];
    walk.Add(p3, f[c] - f[d]);
    walk.Add(p3 + s[d], f[d]);
}

void Walk3(const LutView& t, int32_t base, const double* f, int a, int b, int c, SimplexWalk& walk) {
    const int32_t* s = t.clutStrides;
    walk.Add(base, 1.0 - f[a]);
    const int32_t p1 = base + s[a];
    walk.Add(p1, f[a] - f[b]);
    const int32_t p2 = p1 + s[b];
    walk.Add(p2, f[b] - f[c]);
    walk.Add(p2 + s[c], f[c]);
}

void Simplex1(const LutView& t, int32_t base, const double* f, SimplexWalk& walk) {
    walk.Add(base, 1.0 - f[0]);
    if (f[0] > 0.0) walk.Add(base + t.clutStrides[0], f[0]);
}

void Simplex2(const LutView& t, int32_t base, const double* f, SimplexWalk& walk) {
    const int32_t* s = t.clutStrides;
    const double f0 = f[0], f1 = f[1];
    if (f0 == f1) {
        walk.Add(base, 1.0 - f0);
        if (f0 > 0.0) walk.Add(base + s[0] + s[1], f0);
        return;
    }
    const int a = f0 > f1 ? 0 : 1;
    const int b = 1 - a;
    walk.Add(base, 1.0 - f[a]);
    const int32_t p1 = base + s[a];
    walk.Add(p1, f[a] - f[b]);
    walk.Add(p1 + s[b], f[b]);
}

void Simplex3(const LutView& t, int32_t base, const double* f, SimplexWalk& walk) {
    const double f0 = f[0], f1 = f[1], f2 = f[2];
    if (f0 == 0.0 && f1 == 0.0 && f2 == 0.0) {
        walk.Add(base, 1.0);
        return;
    }
    if (f0 == f1 && f1 == f2) {
        walk.Add(base, 1.0 - f0);
        walk.Add(base + t.cornerOffsets[7], f0);
        return;
    }
    if (f0 >= f1) {
        if (f1 >= f2) {
            Walk3(t, base, f, 0, 1, 2, walk);
        } else if (f0 >= f2) {
            Walk3(t, base, f, 0, 2, 1, walk);
        } else {
            Walk3(t, base, f, 2, 0, 1, walk);
        }
    } else {
        if (f0 >= f2) {
            Walk3(t, base, f, 1, 0, 2, walk);
        } else if (f1 >= f2) {
            Walk3(t, base, f, 1, 2, 0, walk);
        } else {
            Walk3(t, base, f, 2, 1, 0, walk);
        }
    }
}

void Simplex4(const LutView& t, int32_t base, const double* f, SimplexWalk& walk) {
    const double f0 = f[0], f1 = f[1], f2 = f[2], f3 = f[3];
    if (f0 == 0.0 && f1 == 0.0 && f2 == 0.0 && f3 == 0.0) {
        walk.Add(base, 1.0);
        return;
    }
    if (f0 == f1 && f1 == f2 && f2 == f3) {
        walk.Add(base, 1.0 - f0);
        walk.Add(base + t.cornerOffsets[15], f0);
        return;
    }
    // Order the four channels by fraction, largest first, with a five-comparison network.
    int o[4] = {0, 1, 2, 3};
    auto order = [&](int x, int y) {
        if (f[o[y]] > f[o[x]]) {
            const int keep = o[x];
            o[x] = o[y];
            o[y] = keep;
        }
    };
    order(0, 1);
    order(2, 3);
    order(0, 2);
    order(1, 3);
    order(1, 2);
    Walk4(t, base, f, o[0], o[1], o[2], o[3], walk);
}

}  // namespace

void InterpolateSimplex(const LutView& t, KernelScratch& s) {
    if (t.inputs < 1 || t.inputs > 4 || t.outputs < 1 || t.outputs > KernelScratch::kVectorSize) return;
    const int32_t base = LocateKernelCell(t, s);
    double f[4];
    for (int i = 0; i < t.inputs; ++i) f[i] = s.records[i].fraction;
    SimplexWalk walk;
    switch (t.inputs) {
        case 1: Simplex1(t, base, f, walk); break;
        case 2: Simplex2(t, base, f, walk); break;
        case 3: Simplex3(t, base, f, walk); break;
        default: Simplex4(t, base, f, walk); break;
    }
    Finish(t, walk, s.vector);
}

}  // namespace vantrel
