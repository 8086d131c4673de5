#pragma once
// A CMYK chart with its Lab: read from a characterisation file, written as the CGATS (".ti3")
// measurement that both the library's reader and Argyll's tools take.

#include <string>
#include <vector>

#include "argyll_tools.h"

namespace vantrel::proofloop {

struct Chart {
    std::vector<Quad> cmyk;   // percent
    std::vector<Triple> lab;  // D50

    size_t size() const { return cmyk.size(); }
    // Index of the unprinted paper patch (all four channels zero); -1 when the chart has none.
    int PaperPatch() const;
};

// The CMYK_C..CMYK_K and LAB_L..LAB_B columns of a CGATS file; an empty chart when the file is
// missing or has no such columns.
Chart ReadChart(const std::string& path);

// Writes a CTI3 file with device percent, XYZ (from the Lab, D50) and Lab columns. false on a write
// failure.
bool WriteChart(const Chart& chart, const std::string& path, const std::string& descriptor);

// Every step-th patch of the chart, starting with the first, plus the paper patch when the
// selection missed it.
Chart ThinChart(const Chart& chart, size_t step);

}  // namespace vantrel::proofloop
