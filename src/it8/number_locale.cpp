#include "it8/number_locale.h"

#include <stdexcept>
#include <string>

namespace vantrel {
namespace {

// Keeps the user's decimal separator but drops digit grouping: a reader would take
// "NUMBER_OF_SETS 1,617" as one set, and any CGATS reader splits "1.234,5" wrongly.
class DecimalOnly : public std::numpunct<char> {
public:
    explicit DecimalOnly(char point) : point_(point) {}

protected:
    char do_decimal_point() const override { return point_; }
    std::string do_grouping() const override { return std::string(); }

private:
    char point_;
};

}  // namespace

std::locale MeasurementNumberLocale(char decimalPoint) {
    if (decimalPoint != '.' && decimalPoint != ',') decimalPoint = '.';
    // The locale owns and reference-counts its facets: handing it a new one is the standard protocol.
    return std::locale(std::locale::classic(), new DecimalOnly(decimalPoint));
}

std::locale MeasurementNumberLocale() {
    char point = '.';
    try {
        point = std::use_facet<std::numpunct<char>>(std::locale("")).decimal_point();
    } catch (const std::runtime_error&) {
        // LANG or LC_ALL names a locale that is not installed: write with the classic point.
    }
    return MeasurementNumberLocale(point);
}

}  // namespace vantrel
