#include "it8/cgats_number.h"

#include <charconv>
#include <cstddef>
#include <limits>

namespace vantrel {
namespace {

bool IsDigit(char c) { return c >= '0' && c <= '9'; }

std::size_t SkipDigits(std::string_view text, std::size_t i) {
    while (i < text.size() && IsDigit(text[i])) ++i;
    return i;
}

// The power of ten of a number's first significant digit; only its sign matters to the caller,
// which meets numbers too large or too small for a double.
int64_t DecimalExponent(std::string_view number) {
    int64_t position = 0;  // power of ten of the digit being looked at, relative to the point
    std::size_t i = 0;
    std::size_t integerDigits = 0;
    while (i < number.size() && IsDigit(number[i])) ++integerDigits, ++i;
    int64_t first = 0;
    bool found = false;
    for (std::size_t k = 0; k < integerDigits; ++k) {
        if (number[k] != '0') {
            first = static_cast<int64_t>(integerDigits - k) - 1;
            found = true;
            break;
        }
    }
    if (i < number.size() && number[i] == '.') {
        ++i;
        for (position = -1; i < number.size() && IsDigit(number[i]); ++i, --position) {
            if (!found && number[i] != '0') {
                first = position;
                found = true;
            }
        }
    }
    if (!found) return 0;
    int64_t exponent = 0;
    if (i < number.size() && (number[i] == 'E' || number[i] == 'e')) {
        ++i;
        bool negative = false;
        if (i < number.size() && (number[i] == '+' || number[i] == '-')) negative = number[i++] == '-';
        for (; i < number.size() && IsDigit(number[i]); ++i)
            if (exponent < 1000000000) exponent = exponent * 10 + (number[i] - '0');
        if (negative) exponent = -exponent;
    }
    return first + exponent;
}

}  // namespace

double LeadingDouble(std::string_view text) {
    std::size_t i = 0;
    bool negative = false;
    if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
    const std::size_t start = i;
    std::size_t end = SkipDigits(text, i);
    bool digits = end > start;
    if (end < text.size() && text[end] == '.') {
        const std::size_t fractionEnd = SkipDigits(text, end + 1);
        digits = digits || fractionEnd > end + 1;
        end = fractionEnd;
    }
    if (!digits) return 0.0;
    if (end < text.size() && (text[end] == 'E' || text[end] == 'e')) {
        std::size_t e = end + 1;
        if (e < text.size() && (text[e] == '+' || text[e] == '-')) ++e;
        const std::size_t exponentEnd = SkipDigits(text, e);
        if (exponentEnd > e) end = exponentEnd;
    }
    double value = 0.0;
    const std::errc ec = std::from_chars(text.data() + start, text.data() + end, value).ec;
    if (ec == std::errc::result_out_of_range) {
        value = DecimalExponent(text.substr(start, end - start)) > 0 ? std::numeric_limits<double>::max() : 0.0;
    } else if (ec != std::errc()) {
        return 0.0;
    }
    return negative ? -value : value;
}

int32_t LeadingInt(std::string_view text) {
    std::size_t i = 0;
    bool negative = false;
    if (i < text.size() && (text[i] == '+' || text[i] == '-')) negative = text[i++] == '-';
    int64_t value = 0;
    constexpr int64_t kLimit = int64_t{std::numeric_limits<int32_t>::max()} + 1;
    for (; i < text.size() && IsDigit(text[i]); ++i) {
        value = value * 10 + (text[i] - '0');
        if (value > kLimit) value = kLimit;
    }
    if (negative) value = -value;
    if (value > std::numeric_limits<int32_t>::max()) value = std::numeric_limits<int32_t>::max();
    return static_cast<int32_t>(value);
}

}  // namespace vantrel
