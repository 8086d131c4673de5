#include "analysis/it8_kind.h"

namespace vantrel {
namespace {
constexpr int kProbe = 1;
}  // namespace

bool It8ColourFromXyz(const Measured_IT8& it8) { return it8.GetLab(kProbe, 0) == Measured_IT8::kNoColumn; }

It8Kind ProbeIt8Kind(const Measured_IT8& it8) {
    It8Kind kind;
    kind.colourFromXyz = It8ColourFromXyz(it8);
    kind.seventhChannel = it8.GetChannel(kProbe, 6) != Measured_IT8::kNoColumn;
    if (it8.GetChannel(kProbe, 5) != Measured_IT8::kNoColumn)
        kind.device = It8Kind::kMultiChannel;
    else if (it8.GetCmyk(kProbe, 0) != Measured_IT8::kNoColumn)
        kind.device = It8Kind::kCmyk;
    else if (it8.GetRgb(kProbe, 0) != Measured_IT8::kNoColumn)
        kind.device = It8Kind::kRgb;
    return kind;
}

}  // namespace vantrel
