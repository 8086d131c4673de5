#pragma once
// The figures an operator reads for a measurement against its reference, computed here from the
// charts themselves: CIE 1976 differences, paper white from the patches without ink, x 1000
// rounded the host's way.

#include <algorithm>
#include <cmath>
#include <string>
#include <vector>

#include "helpers/ti3_chart.h"

namespace vantrel::test {

inline double Dist(const std::array<double, 3>& p, const std::array<double, 3>& q) {
    return std::sqrt((p[0] - q[0]) * (p[0] - q[0]) + (p[1] - q[1]) * (p[1] - q[1]) + (p[2] - q[2]) * (p[2] - q[2]));
}

inline int HostValue(double v) { return static_cast<int>(v * 1000.0 + 0.5); }

// Paper: no C, M or Y and less than 1 % black.
inline std::array<double, 3> PaperWhite(const std::vector<ChartPatch>& chart) {
    std::array<double, 3> sum{};
    int count = 0;
    for (const ChartPatch& p : chart)
        if (p.cmyk[0] == 0 && p.cmyk[1] == 0 && p.cmyk[2] == 0 && p.cmyk[3] < 1) {
            for (int c = 0; c < 3; ++c) sum[c] += p.lab[c];
            ++count;
        }
    for (double& v : sum) v /= std::max(count, 1);
    return sum;
}

struct ChartFigures {
    int mean, maximum, white;
};

// Patch i of `meas` against patch i of `ref`; a total below 0.02 is no difference at all.
inline ChartFigures Figures(const std::vector<ChartPatch>& ref, const std::vector<ChartPatch>& meas) {
    double sum = 0, maximum = 0;
    for (std::size_t i = 0; i < ref.size(); ++i) {
        const double d = Dist(ref[i].lab, meas[i].lab);
        sum += d;
        maximum = std::max(maximum, d);
    }
    const double mean = sum >= 0.02 ? sum / static_cast<double>(ref.size()) : 0.0;
    return {HostValue(mean), HostValue(maximum), HostValue(Dist(PaperWhite(meas), PaperWhite(ref)))};
}

// A CMYK + Lab chart as CGATS text, values written as given.
inline std::string ChartText(const std::vector<ChartPatch>& chart) {
    std::string text = "CGATS.17\nBEGIN_DATA_FORMAT\nSAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
                       "END_DATA_FORMAT\nNUMBER_OF_SETS " + std::to_string(chart.size()) + "\nBEGIN_DATA\n";
    char line[256];
    for (std::size_t i = 0; i < chart.size(); ++i) {
        const ChartPatch& p = chart[i];
        std::snprintf(line, sizeof line, "%zu %.17g %.17g %.17g %.17g %.17g %.17g %.17g\n", i + 1, p.cmyk[0],
                      p.cmyk[1], p.cmyk[2], p.cmyk[3], p.lab[0], p.lab[1], p.lab[2]);
        text += line;
    }
    return text + "END_DATA\n";
}

}  // namespace vantrel::test
