#pragma once

namespace vantrel {

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
