#pragma once

#include <cstdint>
#include <string_view>

namespace vantrel {

// The value of the leading decimal number of a CGATS value ("12.5", "-3E-2", "+7"); 0 when the text
// does not start with one. Independent of the C locale: the reader has already turned commas into
// points. Words such as "INF" or "NAN" are not numbers here.
double LeadingDouble(std::string_view text);

// The value of the leading integer of a header value (optional sign, digits); 0 when there is none.
// Values beyond the 32-bit range keep its ends.
int32_t LeadingInt(std::string_view text);

}  // namespace vantrel
