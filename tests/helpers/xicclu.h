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

// What xicclu gives for each row (device values on 0..100), with `options` ("-ff -ir", "-fb -ir");
// empty when xicclu fails.
inline std::vector<std::vector<double>> XiccluRows(const std::string& options, const std::string& profile,
                                                   const std::vector<std::vector<double>>& rows) {
    TempDir dir;
    std::ofstream(dir.File("in.txt")) << [&] {
        std::ostringstream text;
        text.precision(10);
        for (const auto& row : rows) {
            for (double v : row) text << v << ' ';
            text << '\n';
        }
        return text.str();
    }();
    std::vector<std::vector<double>> out;
    const std::string command =
        "xicclu " + options + " -pl -s 100 '" + profile + "' < '" + dir.File("in.txt") + "' 2>/dev/null";
    FILE* pipe = popen(command.c_str(), "r");
    for (char line[1024]; pipe && fgets(line, sizeof line, pipe);) {
        const std::string text(line);
        const size_t arrow = text.rfind("->");
        if (arrow == std::string::npos) continue;
        std::istringstream values(text.substr(arrow + 2, text.find('[', arrow) - arrow - 2));
        out.emplace_back();
        for (double v; values >> v;) out.back().push_back(v);
    }
    if (pipe) pclose(pipe);
    if (out.size() != rows.size()) out.clear();
    return out;
}

// Argyll's round trip of a CMYK output profile over a steps^4 grid (0..100 %): A2B1 to Lab, B2A1
// back to CMYK, A2B1 again, relative colorimetric. The mean CIE 1976 difference; -1 on failure.
inline double XiccluRoundTripMean(const std::string& profile, int steps) {
    std::vector<std::vector<double>> grid;
    for (int n = 0; n < steps * steps * steps * steps; ++n) {
        grid.emplace_back();
        for (int d = 0, rest = n; d < 4; ++d, rest /= steps)
            grid.back().push_back(100.0 * (rest % steps) / (steps - 1));
    }
    const auto first = XiccluRows("-ff -ir", profile, grid);
    const auto back = XiccluRows("-ff -ir", profile, XiccluRows("-fb -ir", profile, first));
    if (first.empty() || back.empty()) return -1.0;
    double sum = 0.0;
    for (size_t i = 0; i < first.size(); ++i)
        sum += std::hypot(first[i][0] - back[i][0], first[i][1] - back[i][1], first[i][2] - back[i][2]);
    return sum / static_cast<double>(first.size());
}

}  // namespace vantrel::test
