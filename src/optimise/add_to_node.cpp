#include "optimise/add_to_node.h"

#include <cmath>

#include "eval/interpolation.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr int kFirstCorrection = 3;
constexpr int kChannelField = 7;
constexpr int kCorrections = 4;

}  // namespace

int AddToNode(CProfil& p, const double* record) {
    const LutView t = SlotView(p, 1);
    if (t.inputs < 1 || !std::isfinite(record[kChannelField])) return 1;
    const int channel = static_cast<int>(record[kChannelField]);
    if (channel < 0 || channel >= t.outputs || channel >= kCorrections) return 1;

    // Indices beyond the third address the first node of those axes.
    int64_t entry = channel;
    for (int axis = 0; axis < 3 && axis < t.inputs; ++axis) {
        const double index = record[axis];
        if (!(index >= 0.0) || index >= t.grid) return 1;
        entry += static_cast<int64_t>(index) * t.clutStrides[axis];
    }

    const bool wide = p.m_Precision[1] != 0;
    double step = record[kFirstCorrection + channel];
    if (!std::isfinite(step)) return 1;
    if (wide) step /= CProfil::kInv257;
    step = std::trunc(step > 0.0 ? step + 0.5 : step - 0.5);
    const double bound = wide ? 65535.0 : 255.0;
    uint16_t& value = p.m_Clut[1][static_cast<std::size_t>(entry)];
    double sum = value + step;
    if (sum < 0.0) sum = 0.0;
    if (sum > bound) sum = bound;
    value = static_cast<uint16_t>(sum);
    return 1;
}

}  // namespace vantrel
