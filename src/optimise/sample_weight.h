#pragma once

namespace vantrel {

// The weight of a chart patch in a correction run, from its device values in percent (seven
// channels, absent ones 0) and the minimum tone values of the parameter file (its first seven
// numbers, percent per channel):
//   100 paper white; 0 when a channel is inked below its minimum tone value (the patch is
//   skipped); 75 a single full-tone ink; 25 a single tint; 1 any mixture.
int SampleWeight(const double percent[7], const int minimumTone[7]);

}  // namespace vantrel
