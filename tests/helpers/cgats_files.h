#pragma once
// Measurement files for the reader, writer and analysis tests: written byte for byte, read back
// as text, and parsed independently of the library's own CGATS reader.

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "helpers/test_paths.h"

namespace vantrel::test {

// Writes `text` byte for byte (no line-end translation) into dir and returns the path.
inline std::string WriteText(const TempDir& dir, const std::string& name, const std::string& text) {
    const std::string path = dir.File(name);
    std::ofstream(path, std::ios::binary) << text;
    return path;
}

inline std::string ReadText(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// The lines of a text written with LF line ends.
inline std::vector<std::string> Lines(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) lines.push_back(line);
    return lines;
}

inline std::vector<std::string> Words(const std::string& line) {
    std::istringstream in(line);
    std::vector<std::string> words;
    for (std::string w; in >> w;) words.push_back(w);
    return words;
}

// A CGATS file of the given data-format line and rows, lines joined by `eol`.
inline std::string Cgats(const std::string& fields, const std::vector<std::string>& rows,
                         const std::string& eol = "\n", const std::string& header = "") {
    std::string text = "CGATS.17" + eol + header + "BEGIN_DATA_FORMAT" + eol + fields + eol + "END_DATA_FORMAT" +
                       eol + "NUMBER_OF_SETS " + std::to_string(rows.size()) + eol + "BEGIN_DATA" + eol;
    for (const std::string& row : rows) text += row + eol;
    return text + "END_DATA" + eol;
}

// A small CMYK + Lab file: three sets, LF line ends.
inline std::string SmallCmykLabFile() {
    return Cgats("SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B",
                 {"1 0 0 0 0 95.0 0.5 -2.0", "2 100 0 0 0 55.0 -37.0 -50.0", "3 0 0 0 100 16.0 0.0 0.0"});
}

// A plain parse with the standard library: field names between BEGIN_DATA_FORMAT and
// END_DATA_FORMAT, rows as whitespace-separated words up to the first END_DATA.
struct PlainTable {
    std::vector<std::string> fields;
    std::vector<std::vector<std::string>> rows;
    int announcedSets = -1;

    // Field names compare as the library's reader compares them, ignoring case ("Lab_L" as the
    // library writes it, "LAB_L" as data files have it).
    int Column(const std::string& name) const {
        auto same = [&name](const std::string& field) {
            return field.size() == name.size() &&
                   std::equal(field.begin(), field.end(), name.begin(), [](char a, char b) {
                       return std::toupper(static_cast<unsigned char>(a)) == std::toupper(static_cast<unsigned char>(b));
                   });
        };
        for (std::size_t i = 0; i < fields.size(); ++i)
            if (same(fields[i])) return static_cast<int>(i);
        return -1;
    }
    double Value(std::size_t row, int column) const {
        return std::strtod(rows[row][static_cast<std::size_t>(column)].c_str(), nullptr);
    }
};

inline PlainTable ParsePlain(const std::string& path) {
    PlainTable table;
    std::istringstream in(ReadText(path));
    enum { kHeader, kFormat, kData } state = kHeader;
    for (std::string line; std::getline(in, line);) {
        const std::vector<std::string> w = Words(line);
        if (w.empty()) continue;
        if (state == kFormat) {
            if (w[0] == "END_DATA_FORMAT")
                state = kHeader;
            else
                table.fields.insert(table.fields.end(), w.begin(), w.end());
        } else if (state == kData) {
            if (w[0] == "END_DATA") break;
            table.rows.push_back(w);
        } else if (w[0] == "BEGIN_DATA_FORMAT") {
            state = kFormat;
        } else if (w[0] == "BEGIN_DATA") {
            state = kData;
        } else if (w[0] == "NUMBER_OF_SETS" && w.size() > 1) {
            table.announcedSets = std::atoi(w[1].c_str());
        }
    }
    return table;
}

}  // namespace vantrel::test
