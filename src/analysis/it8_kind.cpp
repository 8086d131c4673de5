#include "analysis/it8_kind.h"

namespace vantrel {

bool It8ColourFromXyz(const Measured_IT8& it8, int patch) {
    return it8.GetLab(patch, 0) == Measured_IT8::kNoColumn;
}

It8Kind ProbeIt8Kind(const Measured_IT8& it8, int patch) {
    It8Kind kind;
    kind.colourFromXyz = It8ColourFromXyz(it8, patch);
    kind.seventhChannel = it8.GetChannel(patch, 6) != Measured_IT8::kNoColumn;
    if (it8.GetChannel(patch, 5) != Measured_IT8::kNoColumn)
        kind.device = It8Kind::kMultiChannel;
    else if (it8.GetCmyk(patch, 0) != Measured_IT8::kNoColumn)
        kind.device = It8Kind::kCmyk;
    else if (it8.GetRgb(patch, 0) != Measured_IT8::kNoColumn)
        kind.device = It8Kind::kRgb;
    return kind;
}

}  // namespace vantrel
