#include "it8/cgats_number.h"

#include <charconv>
#include <cmath>
#include <cstddef>
#include <limits>

namespace vantrel {
namespace {

bool IsDigit(char c) { return c >= '0' && c <= '9'; }

std::size_t SkipDigits(std::string_view text, std::size_t i) {
    while (i < text.size() && IsDigit(text[i])) ++i;
    return i;
}

// Whether a number from_chars finds out of range is too large rather than too small: its first
// significant digit, moved by the exponent, stands at a positive power of ten.
bool TooLarge(std::string_view number) {
    const std::size_t integerEnd = SkipDigits(number, 0);
    const std::size_t mantissaEnd =
        integerEnd < number.size() && number[integerEnd] == '.' ? SkipDigits(number, integerEnd + 1) : integerEnd;
    const std::size_t first = number.substr(0, mantissaEnd).find_first_of("123456789");
    if (first == std::string_view::npos) return false;
    const int64_t power = static_cast<int64_t>(integerEnd) - static_cast<int64_t>(first) - (first < integerEnd ? 1 : 0);
    const int64_t exponent = mantissaEnd < number.size() ? LeadingInt(number.substr(mantissaEnd + 1)) : 0;
    return power + exponent > 0;
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
        value = TooLarge(text.substr(start, end - start)) ? std::numeric_limits<double>::max() : 0.0;
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
