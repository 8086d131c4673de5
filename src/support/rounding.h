#pragma once

// The two conversions of a double to an integer the library makes: truncation toward zero, and
// rounding by adding 0.5 first and then truncating (so -2.5 becomes -2, 2.5 becomes 3).

namespace vantrel {

// A value truncated toward zero to an int; values beyond the int range keep its ends, NaN is 0.
int TruncatedInt(double value);

// value + 0.5, truncated toward zero, with TruncatedInt's ends.
inline int RoundHalfUp(double value) { return TruncatedInt(value + 0.5); }

}  // namespace vantrel
