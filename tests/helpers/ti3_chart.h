#pragma once
// The device values and measured Lab of a characterisation file, read independently of the
// library's own CGATS reader.

#include <array>
#include <cctype>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace vantrel::test {

struct ChartPatch {
    std::array<double, 4> cmyk{};
    std::array<double, 3> lab{};
};

// Field names as the library writes them ("Lab_L") or as the data files have them ("LAB_L").
inline bool SameName(const std::string& field, const char* name) {
    if (field.size() != std::char_traits<char>::length(name)) return false;
    for (std::size_t i = 0; i < field.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(field[i])) != name[i]) return false;
    return true;
}

inline std::vector<ChartPatch> ReadCmykChart(const std::string& path) {
    std::ifstream in(path);
    std::vector<ChartPatch> patches;
    std::vector<std::string> fields;
    std::string line;
    bool format = false, data = false;
    while (std::getline(in, line)) {
        if (line.rfind("BEGIN_DATA_FORMAT", 0) == 0) { format = true; continue; }
        if (line.rfind("END_DATA_FORMAT", 0) == 0) { format = false; continue; }
        if (line.rfind("BEGIN_DATA", 0) == 0) { data = true; continue; }
        if (line.rfind("END_DATA", 0) == 0) { data = false; continue; }
        std::istringstream words(line);
        std::string word;
        if (format) {
            while (words >> word) fields.push_back(word);
        } else if (data) {
            std::vector<std::string> row;
            while (words >> word) row.push_back(word);
            if (row.size() != fields.size()) continue;
            ChartPatch p;
            const char* names[7] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "LAB_L", "LAB_A", "LAB_B"};
            int found = 0;
            for (size_t f = 0; f < fields.size(); ++f)
                for (int k = 0; k < 7; ++k)
                    if (SameName(fields[f], names[k])) {
                        (k < 4 ? p.cmyk[k] : p.lab[k - 4]) = std::stod(row[f]);
                        ++found;
                    }
            if (found == 7) patches.push_back(p);
        }
    }
    return patches;
}

}  // namespace vantrel::test
