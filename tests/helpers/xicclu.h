#pragma once
// Argyll's xicclu as an oracle: device values through a profile's forward table, absolute
// colorimetric, Lab out.

#include <array>
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

}  // namespace vantrel::test
