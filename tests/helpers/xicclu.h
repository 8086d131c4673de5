#pragma once
// Argyll's xicclu as an oracle: device values through a profile's forward table, absolute
// colorimetric, Lab out.

#include <array>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "helpers/test_paths.h"

namespace vantrel::test {

inline bool HaveXicclu() { return std::system("command -v xicclu >/dev/null 2>&1") == 0; }

// One Lab per input row; rows hold device values on 0..scale. Empty when xicclu fails.
inline std::vector<std::array<double, 3>> XiccluAbsoluteLab(const std::string& profile,
                                                           const std::vector<std::vector<double>>& rows,
                                                           double scale) {
    TempDir dir;
    {
        std::ofstream in(dir.File("in.txt"));
        for (const auto& row : rows) {
            for (double v : row) in << v << ' ';
            in << '\n';
        }
    }
    const std::string command = "xicclu -ff -ia -pl -s " + std::to_string(scale) + " '" + profile + "' < '" +
                                dir.File("in.txt") + "' 2>/dev/null";
    std::vector<std::array<double, 3>> labs;
    FILE* pipe = popen(command.c_str(), "r");
    if (!pipe) return labs;
    char line[1024];
    while (fgets(line, sizeof line, pipe)) {
        std::string text(line);
        const size_t arrow = text.rfind("->");
        if (arrow == std::string::npos || text.find("[Lab]") == std::string::npos) continue;
        std::istringstream values(text.substr(arrow + 2));
        std::array<double, 3> lab{};
        if (values >> lab[0] >> lab[1] >> lab[2]) labs.push_back(lab);
    }
    pclose(pipe);
    if (labs.size() != rows.size()) labs.clear();
    return labs;
}

// The values xicclu gives for each row (device values on 0..100, Lab as it stands), with the
// options given ("-ff -ir", "-fb -ir"); empty when xicclu fails.
inline std::vector<std::vector<double>> XiccluRows(const std::string& options, const std::string& profile,
                                                   const std::vector<std::vector<double>>& rows) {
    TempDir dir;
    {
        std::ofstream in(dir.File("in.txt"));
        in.precision(10);
        for (const auto& row : rows) {
            for (double v : row) in << v << ' ';
            in << '\n';
        }
    }
    const std::string command = "xicclu " + options + " -pl -s 100 '" + profile + "' < '" + dir.File("in.txt") +
                                "' 2>/dev/null";
    std::vector<std::vector<double>> out;
    FILE* pipe = popen(command.c_str(), "r");
    if (!pipe) return out;
    char line[1024];
    while (fgets(line, sizeof line, pipe)) {
        std::string text(line);
        const size_t arrow = text.rfind("->");
        if (arrow == std::string::npos) continue;
        std::istringstream values(text.substr(arrow + 2, text.find('[', arrow) - arrow - 2));
        std::vector<double> row;
        for (double v; values >> v;) row.push_back(v);
        out.push_back(row);
    }
    pclose(pipe);
    if (out.size() != rows.size()) out.clear();
    return out;
}

// Argyll's round trip of a CMYK output profile over a steps^4 grid (0..100 %): the A2B1 table
// to Lab, the B2A1 table back to CMYK and the A2B1 table again, all relative colorimetric. The
// mean CIE 1976 difference, or -1 when xicclu fails.
inline double XiccluRoundTripMean(const std::string& profile, int steps) {
    std::vector<std::vector<double>> grid;
    for (int n = 0; n < steps * steps * steps * steps; ++n) {
        std::vector<double> cmyk;
        for (int d = 0, rest = n; d < 4; ++d, rest /= steps) cmyk.push_back(100.0 * (rest % steps) / (steps - 1));
        grid.push_back(cmyk);
    }
    const auto first = XiccluRows("-ff -ir", profile, grid);
    const auto device = XiccluRows("-fb -ir", profile, first);
    const auto back = XiccluRows("-ff -ir", profile, device);
    if (first.empty() || back.empty()) return -1.0;
    double sum = 0.0;
    for (size_t i = 0; i < first.size(); ++i) {
        double d2 = 0.0;
        for (int c = 0; c < 3; ++c) d2 += (first[i][c] - back[i][c]) * (first[i][c] - back[i][c]);
        sum += std::sqrt(d2);
    }
    return sum / static_cast<double>(first.size());
}

}  // namespace vantrel::test
