#pragma once

#include <locale>

namespace vantrel {

// The locale measurement files are written with: the decimal separator of the user's default
// locale, no digit grouping. A locale setting that names no installed locale gives the classic point.
std::locale MeasurementNumberLocale();

// The same for a given decimal separator; anything but a point or a comma becomes a point.
std::locale MeasurementNumberLocale(char decimalPoint);

}  // namespace vantrel
