#pragma once

#include <cstdint>

namespace vantrel {

// One patch to be written to a measurement file.
struct PatchRecord {
    // Number of device channels: 3 RGB, 6 six-colour, 7 seven-colour, any other value CMYK.
    uint32_t kind = 0;
    uint32_t sampleNumber = 0;
    // CMYK and multi-channel values in percent; RGB on the caller's scale.
    double device[7] = {0, 0, 0, 0, 0, 0, 0};
    double lab[3] = {0, 0, 0};
    double xyz[3] = {0, 0, 0};  // 0..100
    // Scratch of the code that fills the records (the merged analysis marks patches here); never
    // written to a file. Small on purpose: the output-profile analysis holds two buffers of 21^4.
    uint8_t work[8] = {};
};

}  // namespace vantrel
