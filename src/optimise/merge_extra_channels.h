#pragma once

namespace vantrel {

// Folds the extra colourants of a seven-channel device vector (0..255: C, M, Y, K, then the
// extras in channels 4..6) into cyan, magenta, yellow and black. The part the three extras share
// becomes black, as far as black has room; the rest goes to the process colourants that mix each
// extra: channel 4 (red, or orange) to magenta and yellow, channel 5 (green) to cyan and yellow,
// channel 6 (blue) to cyan and magenta. Channels 0..3 of `x` take the result, each held to 0..255;
// channels 4..6 keep what black did not take.
void MergeExtraChannels(double* x);

}  // namespace vantrel
