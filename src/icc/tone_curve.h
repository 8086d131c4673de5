#pragma once

#include <cstdint>
#include <vector>

namespace vantrel {

// Tone curves of matrix/TRC profiles: 256 doubles on 0..255 per channel.

// Device to PCS: the curve through `count` (>= 2) 16-bit samples.
void BuildSampledCurve(const uint16_t* samples, int count, std::vector<double>& curve);
// PCS to device: the inverse of the curve through `count` (>= 2) 16-bit samples.
void BuildInverseCurve(const uint16_t* samples, int count, std::vector<double>& curve);
// A gamma curve (g <= 0 is taken as 0.001; g == 1 gives curve[i] = i). Direction 0 builds the
// forward curve, any other slot its inverse.
void BuildGammaCurveFor(double gamma, int slot, std::vector<double>& curve);

}  // namespace vantrel
