#include "eval/table_nodes.h"

#include <cmath>
#include <cstdlib>

#include "colour/colour_math.h"
#include "colour/matrix3.h"
#include "eval/grid_coordinate.h"
#include "eval/interpolation.h"
#include "eval/node_index.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr int kFirstIndexField = 4;
// NodePcsValue tries input values 0, 0.1, .. 254.9.
constexpr int kCandidates = 2550;

// The input value x (a multiple of 0.1) whose grid coordinate lies closest to `index` among
// those that round to it; the first such on ties.
double InputForNode(const LutView& t, int channel, int index) {
    auto coordinate = [&](int k) { return GridCoordinate(t, channel, k / 10.0, true); };
    const uint16_t* curve = t.inputCurves + channel * t.inputEntries;
    bool rising = true;
    for (int k = 1; k < t.inputEntries && rising; ++k) rising = curve[k] >= curve[k - 1];

    int from = 0;
    if (rising) {
        // A rising curve reaches the node's neighbourhood in one stretch: find where it starts.
        int lo = 0, hi = kCandidates;
        while (lo < hi) {
            const int mid = (lo + hi) / 2;
            if (coordinate(mid) + 0.5 < index) {
                lo = mid + 1;
            } else {
                hi = mid;
            }
        }
        from = lo > 0 ? lo - 1 : 0;
    }
    int bestK = -1;
    double bestDistance = 0.0;
    int closestK = 0;
    double closest = -1.0;
    for (int k = from; k < kCandidates; ++k) {
        const double g = coordinate(k);
        const double d = (g - index) * (g - index);
        if (closest < 0.0 || d < closest) {
            closest = d;
            closestK = k;
        }
        if (static_cast<int>(g + 0.5) == index) {
            if (bestK < 0 || d < bestDistance) {
                bestK = k;
                bestDistance = d;
            }
        } else if (rising && g > index) {
            break;  // past the node on a rising curve: nothing later rounds to it
        }
    }
    // A curve that skips the node entirely gives the closest value it reaches.
    return (bestK >= 0 ? bestK : closestK) / 10.0;
}

// Scaled Lab into record fields 0..2, L* x 2.55 unclamped.
void PutLab(const Lab& lab, double* record) {
    record[0] = lab.L * kLightnessScale;
    record[1] = lab.a;
    record[2] = lab.b;
}

// Output j of the node at `node`: the CLUT value, through the output curve when `curves`, on
// 0..255.
double NodeOutput(const CProfil& p, const LutView& t, int slot, int32_t node, int j, bool curves) {
    double v = t.clut[node + j];
    if (curves) v = t.OutputCurveAt(j, v);
    return p.SixteenBit(slot) ? v * CProfil::kInv257 : v;
}

uint16_t Store(double value, double bound) {
    if (!(value > 0.0)) return 0;
    if (value >= bound) return static_cast<uint16_t>(bound);
    return static_cast<uint16_t>(value);
}

// First record field of the node indices of a slot-1 node.
int DeviceIndexField(int inputs) { return inputs >= 4 ? inputs : kFirstIndexField; }

}  // namespace

void NodePcsValue(CProfil& p, double* record) {
    const LutView t = SlotView(p, 1);
    if (t.inputs < 1) return;
    double x[4] = {0, 0, 0, 0};
    const int channels = t.inputs < 4 ? t.inputs : 4;
    for (int c = 0; c < channels; ++c) {
        const int wanted = RecordIndex(record[c], t.grid, true);
        x[c] = InputForNode(t, c, wanted);
    }
    if (t.inputs >= 4) {
        for (int c = 0; c < 4; ++c) record[c] = x[c];
        return;
    }
    const LutSlot& lut = p.m_Lut[1];
    if (IsXyzPcs(lut)) {
        // Table units back to XYZ on the 0..100 scale, through the inverse of the table's matrix.
        const double y[3] = {x[0] * 257.0 / 327.68, x[1] * 257.0 / 327.68, x[2] * 257.0 / 327.68};
        double xyz[3];
        SolveMatrix3(lut.matrix, y, xyz);
        PutLab(LabOfTableXyz(p, 1, XYZ{xyz[0] / 100.0, xyz[1] / 100.0, xyz[2] / 100.0}), record);
    } else {
        PutLab(LabOfTableLab(p, 1, x, LabHalf(p, 1)), record);
    }
}

int ReadNodeLab(CProfil& p, double* record, int slot, bool throughCurves) {
    const LutView t = SlotView(p, slot);
    if (t.inputs < 1 || t.outputs < 3) return 1;
    const int32_t node = NodeOffset(t, record + kFirstIndexField, true);
    const bool curves = throughCurves && t.outputEntries >= 256;
    double v[3];
    for (int j = 0; j < 3; ++j) v[j] = NodeOutput(p, t, slot, node, j, curves);
    PutLab(DecodePcs(p, slot, v), record);
    return 1;
}

int WriteNodeLab(CProfil& p, double* record, int slot) {
    const LutView t = SlotView(p, slot);
    if (t.inputs < 1) return 1;
    const int32_t node = NodeOffset(t, record + kFirstIndexField, true);
    double v[4] = {0, 0, 0, 0};
    EncodePcs(p, slot, record, -127.5, v);
    const bool wide = p.SixteenBit(slot);
    const double bound = wide ? 65535.0 : 255.0;
    uint16_t* clut = p.m_Clut[slot].data();
    for (int j = 0; j < t.outputs; ++j) {
        const double value = j < 4 ? (wide ? v[j] * 257.0 + 0.5 : v[j] + 0.5) : 0.0;
        clut[node + j] = Store(value, bound);
    }
    return 1;
}

int WriteNodeChannelLab(CProfil& p, double* record, int slot) {
    const LutView t = SlotView(p, slot);
    if (t.inputs < 1) return 1;
    const LutSlot& lut = p.m_Lut[slot];
    const int32_t node = NodeOffset(t, record + kFirstIndexField, false);
    const int channel = static_cast<int>(record[3]);
    const bool wide = p.SixteenBit(slot);
    const double bound = wide ? 65535.0 : 255.0;
    uint16_t* clut = p.m_Clut[slot].data();

    if (IsXyzPcs(lut)) {
        // All three outputs, from XYZ without the table's matrix.
        const Lab in{Clamp(record[0], 0.0, 255.0) / kLightnessScale, Clamp(record[1], -128.0, 127.0),
                     Clamp(record[2], -128.0, 127.0)};
        XYZ xyz = p.LabToXYZ(in.L, in.a, in.b);
        if (p.m_UseMediaWhite[slot]) xyz = p.AdaptToRelative(xyz.X, xyz.Y, xyz.Z, slot);
        const double v[3] = {xyz.X * kXyzToTable, xyz.Y * kXyzToTable, xyz.Z * kXyzToTable};
        for (int j = 0; j < 3 && j < t.outputs; ++j) clut[node + j] = Store(wide ? v[j] * 257.0 : v[j] + 0.5, bound);
        return 1;
    }
    if (channel < 0 || channel > 2 || channel >= t.outputs) return 1;
    double v[3];
    EncodePcs(p, slot, record, -128.0, v);
    double stored;
    if (!wide) {
        stored = v[channel] + 0.5;
    } else if (t.inputs >= 4) {
        stored = v[channel] * 257.0;
    } else {
        stored = v[channel] * 257.0 + 0.5;
    }
    clut[node + channel] = Store(stored, bound);
    return 1;
}

int ReadNodeDevice(CProfil& p, double* record, bool throughCurves) {
    const LutView t = SlotView(p, 1);
    if (t.inputs < 1) return 1;
    const int32_t node = NodeOffset(t, record + DeviceIndexField(t.inputs), true);
    for (int j = 0; j < t.outputs; ++j) record[j] = NodeOutput(p, t, 1, node, j, throughCurves);
    return 1;
}

namespace {

// The CLUT value k whose image through output curve j (interpolated, truncated) is `wanted`:
// halving steps while far off, then single steps up and down. A flat stretch at zero leaves k
// at its upper end, a flat stretch at the top at its lower end.
int32_t ValueForCurve(const LutView& t, int j, int32_t wanted, int32_t bound) {
    auto image = [&](int32_t k) { return static_cast<int32_t>(t.OutputCurveAt(j, k)); };
    constexpr int32_t kFar = 4097;
    constexpr int kMaxHalvings = 100;
    constexpr int kMaxFlatSteps = 4096;
    int32_t k = wanted;
    int32_t previous = 0;
    bool havePrevious = false;
    for (int steps = 0; steps < kMaxHalvings; ++steps) {
        const int32_t diff = wanted - image(k);
        if (std::abs(diff) < kFar || k == 0 || k == bound) break;
        if (havePrevious && diff == -previous - 1) break;  // swinging back and forth
        previous = diff;
        havePrevious = true;
        k += diff / 2;
        if (k < 0) k = 0;
        if (k > bound) k = bound;
    }
    int flat = 0;
    while (k < bound && (image(k) < wanted || (image(k) == wanted && wanted == 0 && flat++ < kMaxFlatSteps))) ++k;
    flat = 0;
    while (k > 0 && (image(k) > wanted || (image(k) == wanted && wanted == bound && flat++ < kMaxFlatSteps))) --k;
    return k;
}

}  // namespace

int WriteNodeDevice(CProfil& p, double* record, bool throughCurves) {
    const LutView t = SlotView(p, 1);
    if (t.inputs < 1) return 1;
    const int32_t node = NodeOffset(t, record + DeviceIndexField(t.inputs), true);
    const bool wide = p.SixteenBit(1);
    const int32_t bound = wide ? 65535 : 255;
    uint16_t* clut = p.m_Clut[1].data();
    const int outputs = t.outputs < 7 ? t.outputs : 7;
    for (int j = 0; j < outputs; ++j) {
        const double value = j < 4 ? record[j] : record[j + 10];
        const int32_t target = Store(wide ? value * 257.0 : value + 0.5, bound);
        clut[node + j] = static_cast<uint16_t>(throughCurves ? ValueForCurve(t, j, target, bound) : target);
    }
    return 1;
}

}  // namespace vantrel
