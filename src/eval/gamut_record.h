#pragma once

#include <cstdint>

namespace vantrel {

// A profile's gamut: the largest chroma reached per hue and lightness bin.
struct GamutRecord {
    static constexpr int kBins = 33;

    int32_t valid = 0;
    double lightnessMin = 0;  // L* x 2.55
    double lightnessMax = 0;  // L* x 2.55
    // [hue bin][lightness bin]: largest chroma, rounded; 255 where no colour fell.
    uint8_t chroma[kBins][kBins] = {};
    double paperWhite[3] = {0, 0, 0};  // L*, a*, b*
};

}  // namespace vantrel
