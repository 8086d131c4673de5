#include "chart.h"

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>

namespace vantrel::proofloop {
namespace {

Triple LabToXyzD50(const Triple& lab) {
    const double white[3] = {96.42, 100.0, 82.49};
    double fy = (lab[0] + 16.0) / 116.0;
    double f[3] = {fy + lab[1] / 500.0, fy, fy - lab[2] / 200.0};
    Triple xyz{};
    for (int k = 0; k < 3; ++k) {
        double cube = f[k] * f[k] * f[k];
        double t = cube > 216.0 / 24389.0 ? cube : (116.0 * f[k] - 16.0) * 27.0 / 24389.0;
        xyz[k] = t * white[k];
    }
    return xyz;
}

}  // namespace

int Chart::PaperPatch() const {
    for (size_t i = 0; i < cmyk.size(); ++i)
        if (cmyk[i][0] == 0 && cmyk[i][1] == 0 && cmyk[i][2] == 0 && cmyk[i][3] == 0) return static_cast<int>(i);
    return -1;
}

Chart ReadChart(const std::string& path) {
    static const char* const kNames[7] = {"CMYK_C", "CMYK_M", "CMYK_Y", "CMYK_K", "LAB_L", "LAB_A", "LAB_B"};
    std::ifstream in(path);
    Chart chart;
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
            continue;
        }
        if (!data) continue;
        std::vector<std::string> row;
        while (words >> word) row.push_back(word);
        if (row.size() != fields.size()) continue;
        double values[7];
        int found = 0;
        for (size_t f = 0; f < fields.size(); ++f)
            for (int k = 0; k < 7; ++k)
                if (fields[f] == kNames[k]) {
                    values[k] = std::strtod(row[f].c_str(), nullptr);
                    ++found;
                }
        if (found != 7) continue;
        chart.cmyk.push_back({values[0], values[1], values[2], values[3]});
        chart.lab.push_back({values[4], values[5], values[6]});
    }
    return chart;
}

bool WriteChart(const Chart& chart, const std::string& path, const std::string& descriptor) {
    std::ofstream out(path);
    out << "CTI3\n\nDESCRIPTOR \"" << descriptor << "\"\nORIGINATOR \"vantrel proof loop\"\n"
        << "KEYWORD \"DEVICE_CLASS\"\nDEVICE_CLASS \"OUTPUT\"\nKEYWORD \"COLOR_REP\"\nCOLOR_REP \"CMYK_LAB\"\n\n"
        << "NUMBER_OF_FIELDS 11\nBEGIN_DATA_FORMAT\n"
        << "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K XYZ_X XYZ_Y XYZ_Z LAB_L LAB_A LAB_B\n"
        << "END_DATA_FORMAT\n\nNUMBER_OF_SETS " << chart.size() << "\nBEGIN_DATA\n";
    char row[256];
    for (size_t i = 0; i < chart.size(); ++i) {
        const Quad& d = chart.cmyk[i];
        const Triple& lab = chart.lab[i];
        Triple xyz = LabToXyzD50(lab);
        std::snprintf(row, sizeof row, "%zu %.4f %.4f %.4f %.4f %.4f %.4f %.4f %.4f %.4f %.4f\n", i + 1, d[0], d[1],
                      d[2], d[3], xyz[0], xyz[1], xyz[2], lab[0], lab[1], lab[2]);
        out << row;
    }
    out << "END_DATA\n";
    out.close();
    return static_cast<bool>(out);
}

Chart ThinChart(const Chart& chart, size_t step) {
    Chart thin;
    if (step == 0) step = 1;
    int paper = chart.PaperPatch();
    bool paperTaken = false;
    for (size_t i = 0; i < chart.size(); i += step) {
        thin.cmyk.push_back(chart.cmyk[i]);
        thin.lab.push_back(chart.lab[i]);
        paperTaken = paperTaken || static_cast<int>(i) == paper;
    }
    if (paper >= 0 && !paperTaken) {
        thin.cmyk.push_back(chart.cmyk[paper]);
        thin.lab.push_back(chart.lab[paper]);
    }
    return thin;
}

}  // namespace vantrel::proofloop
