#include "eval/grid_location.h"

#include <cmath>

#include "eval/grid_coordinate.h"
#include "eval/interpolation.h"
#include "eval/pcs_encoding.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr double kCornerBoost = 1.25;

// The slot's inputs for a record (0..255, negatives raised to 0), or false for a matrix/TRC
// slot, which has no grid.
bool RecordInputs(CProfil& p, double* record, int slot, const LutView& t, double* inputs) {
    if (IsMatrixTrc(p.m_Lut[slot]) || t.inputs < 1) {
        record[3] = 0.0;
        record[4] = 1.0;
        record[5] = 2.0;
        return false;
    }
    if (t.inputs >= 4) {
        for (int i = 0; i < t.inputs; ++i) inputs[i] = record[i];
    } else {
        EncodePcs(p, slot, record, -128.0, inputs);
        record[3] = 0.0;
    }
    for (int i = 0; i < t.inputs; ++i)
        if (inputs[i] < 0.0) inputs[i] = 0.0;
    return true;
}

int SecondField(const LutView& t) { return t.inputs >= 4 ? t.inputs : 3; }

}  // namespace

double LocateNearestNode(CProfil& p, double* record, int slot) {
    const LutView t = SlotView(p, slot);
    double inputs[7];
    if (!RecordInputs(p, record, slot, t, inputs)) return 0.0;
    const int second = SecondField(t);
    double sum = 0.0;
    for (int i = 0; i < t.inputs; ++i) {
        const double g = GridCoordinate(t, i, inputs[i], false);
        const int nearest = static_cast<int>(g + 0.5);
        record[i] = nearest;
        record[second + i] = g - nearest;
        sum += (g - nearest) * (g - nearest);
    }
    return std::sqrt(sum);
}

double LocateCell(CProfil& p, double* record, int slot, CornerWeights& weights) {
    const LutView t = SlotView(p, slot);
    double inputs[7];
    if (!RecordInputs(p, record, slot, t, inputs)) return 0.0;
    const int n = t.inputs;
    const int second = SecondField(t);
    double f[7];
    double sum = 0.0;
    for (int i = 0; i < n; ++i) {
        const double g = GridCoordinate(t, i, inputs[i], true);
        WorkRecord& r = p.m_WorkRecords[i];
        SplitGridCoordinate(t, g, r.index, r.fraction);
        p.m_Complement[i] = 1.0 - r.fraction;
        f[i] = r.fraction;
        record[i] = r.index;
        record[second + i] = r.index;
        sum += f[i] * f[i];
    }

    if (n == 1) {
        weights[0] = WeightingPolynomial(1.0 - f[0]);
        weights[1] = WeightingPolynomial(f[0]);
    } else {
        // Corner k in counting order raises channel i when bit n-1-i of k is set.
        const double root = 1.0 / n;
        const int corners = 1 << n;
        for (int k = 0; k < corners; ++k) {
            double w = 1.0;
            for (int i = 0; i < n; ++i) w *= ((k >> (n - 1 - i)) & 1) ? f[i] : 1.0 - f[i];
            p.m_CornerWeights[k] = w;
            weights[k] = std::pow(w, root) * kCornerBoost;
        }
    }
    return std::sqrt(sum);
}

double LocateNearestDeviceNode(CProfil& p, int slot, const double* device, int32_t* indices) {
    if (!p.SlotHolds(slot) || IsMatrixTrc(p.m_Lut[slot])) return -1.0;
    const LutView t = SlotView(p, slot);
    double sum = 0.0;
    for (int i = 0; i < t.inputs; ++i) {
        const double g = GridCoordinate(t, i, device[i], false);
        indices[i] = static_cast<int32_t>(g + 0.5);
        sum += (g - indices[i]) * (g - indices[i]);
    }
    return std::sqrt(sum);
}

void PlaceLocatedNode(const CProfil& p, double* record, int slot, NodeFields fields) {
    const int n = (slot == 0 || slot == 1) ? p.m_Lut[slot].inputChannels : 0;
    if (n < 1 || n > CProfil::kMaxInputs) return;
    double indices[CProfil::kMaxInputs];
    for (int i = 0; i < n; ++i) indices[i] = record[i];
    const int first = fields == NodeFields::kDevice && n >= 4 ? n : 4;
    for (int i = 0; i < n; ++i) record[first + i] = indices[i];
}

double WeightingPolynomial(double w) {
    static const double kX[5] = {1.0, 0.75, 0.5, 0.25, 0.0};
    static const double kY[5] = {1.0, 1.25, 1.0, 0.25, 0.0};
    w = Clamp(w, 0.0, 1.0);
    // Neville's scheme over the five points.
    double q[5];
    for (int i = 0; i < 5; ++i) q[i] = kY[i];
    for (int level = 1; level < 5; ++level) {
        for (int i = 0; i + level < 5; ++i) {
            double den = kX[i] - kX[i + level];
            if (den == 0.0) den = 1e-25;
            q[i] = ((w - kX[i + level]) * q[i] - (w - kX[i]) * q[i + 1]) / den;
        }
    }
    return Clamp(q[0], 0.0, 1.25);
}

}  // namespace vantrel
