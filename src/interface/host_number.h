#pragma once

#include <climits>
#include <cmath>

namespace vantrel {

// A value as the host receives it: x 1000, plus 0.5, truncated toward zero
// (-2.5 becomes -2499, 2.5 becomes 2500). Values beyond the int range keep its ends.
inline int ToHostInt(double value) {
    const double scaled = value * 1000.0 + 0.5;
    if (std::isnan(scaled)) return 0;
    if (scaled >= static_cast<double>(INT_MAX)) return INT_MAX;
    if (scaled <= static_cast<double>(INT_MIN)) return INT_MIN;
    return static_cast<int>(scaled);
}

// x 1000 truncated toward zero, without the 0.5.
inline int ToHostIntTruncated(double value) {
    const double scaled = value * 1000.0;
    if (std::isnan(scaled)) return 0;
    if (scaled >= static_cast<double>(INT_MAX)) return INT_MAX;
    if (scaled <= static_cast<double>(INT_MIN)) return INT_MIN;
    return static_cast<int>(scaled);
}

}  // namespace vantrel
