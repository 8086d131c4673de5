#pragma once

#include <cstdint>

#include "colour/colour_values.h"

namespace vantrel {

class CProfil;

// A profile's gamut: the largest chroma reached per hue and lightness bin. Hue bins are 11.25°
// wide (bin 32 holds hues of 360°), lightness bins 7.96875 wide on the L* x 2.55 scale.
struct GamutRecord {
    static constexpr int kBins = 33;

    int32_t valid = 0;        // 1 once the record holds a gamut
    double lightnessMin = 0;  // L* x 2.55
    double lightnessMax = 0;  // L* x 2.55
    // [hue bin][lightness bin]: largest chroma, rounded; 0 where it stayed below 1, 255 where no
    // colour fell.
    uint8_t chroma[kBins][kBins] = {};
    double paperWhite[3] = {0, 0, 0};  // L*, a*, b*
};

// Describes the gamut of a profile with both directions loaded by pushing colours through its
// two tables and back: table nodes, a Lab lattice and chroma sweeps at every hue and lightness.
// The variant follows the direction-1 data colour space (RGB, four colourants, five to seven
// colourants); any other space, or a profile that does not hold both tables, gives the empty
// record, which holds no colour.
GamutRecord BuildGamutRecord(CProfil& profile);

// True when the profile holds both tables, so that a gamut can be built from it.
bool HoldsBothTables(const CProfil& profile);

// True when the colour (L* unscaled) lies inside the recorded gamut.
bool IsInGamut(const GamutRecord& record, double L, double a, double b);

// The colour the profile prints for a requested one (L* unscaled): the Lab through the
// direction-1 table and back through the direction-0 table. Profiles of other colour spaces,
// and profiles without both tables, give the colour back unchanged.
Lab ReproducedLab(CProfil& profile, double L, double a, double b);

}  // namespace vantrel
