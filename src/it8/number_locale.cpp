#include "it8/number_locale.h"

#include <string>

#include "support/platform.h"

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

std::locale MeasurementNumberLocale() { return MeasurementNumberLocale(platform::UserDecimalPoint()); }

}  // namespace vantrel
