#pragma once

#include "support/rounding.h"

namespace vantrel {

// A value as the host receives it: x 1000, plus 0.5, truncated toward zero
// (-2.5 becomes -2499, 2.5 becomes 2500). Values beyond the int range keep its ends.
inline int ToHostInt(double value) { return TruncatedInt(value * 1000.0 + 0.5); }

// x 1000 truncated toward zero, without the 0.5.
inline int ToHostIntTruncated(double value) { return TruncatedInt(value * 1000.0); }

}  // namespace vantrel
