#pragma once
// The device values and measured Lab of a CMYK characterisation file, from the plain parse of
// helpers/cgats_files.h (independent of the library's own CGATS reader).

#include <array>
#include <string>
#include <vector>

#include "helpers/cgats_files.h"

namespace vantrel::test {

struct ChartPatch {
    std::array<double, 4> cmyk{};
    std::array<double, 3> lab{};
};

// Rows of another length than the data format are left out; a file without all seven columns
// gives no patches.
inline std::vector<ChartPatch> ReadCmykChart(const std::string& path) {
    const PlainTable table = ParsePlain(path);
    int columns[7];
    const char* names[7] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "LAB_L", "LAB_A", "LAB_B"};
    for (int k = 0; k < 7; ++k)
        if ((columns[k] = table.Column(names[k])) < 0) return {};
    std::vector<ChartPatch> patches;
    for (std::size_t r = 0; r < table.rows.size(); ++r) {
        if (table.rows[r].size() != table.fields.size()) continue;
        ChartPatch p;
        for (int k = 0; k < 7; ++k) (k < 4 ? p.cmyk[k] : p.lab[k - 4]) = table.Value(r, columns[k]);
        patches.push_back(p);
    }
    return patches;
}

}  // namespace vantrel::test
