#pragma once

namespace vantrel {

// Scaled Lab carries L* x 2.55, so that L* 100 meets the 0..255 of the tables.
constexpr double kLightnessScale = 2.55;
// The host and measurement files give device values in percent; inside they are on 0..255.
constexpr double kPercentToDevice = 2.55;
// The white, D50 with Y = 1, that the library falls back on when no profile gives one.
constexpr double kD50White[3] = {0.9642, 1.0, 0.8249};

// The colour triples every subsystem exchanges, all in double precision.
// L* 0..100 (or L* x 2.55 where a caller says scaled Lab), a* and b* nominally -128..127.
struct Lab {
    double L = 0;
    double a = 0;
    double b = 0;
};

// XYZ relative to a white whose Y is 1.0.
struct XYZ {
    double X = 0;
    double Y = 0;
    double Z = 0;
};

// Lightness, chroma (>= 0) and hue in degrees (0 <= h < 360).
struct LCh {
    double L = 0;
    double C = 0;
    double h = 0;
};

}  // namespace vantrel
