#pragma once

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "helpers/test_paths.h"

namespace vantrel::test::it8 {

// Writes `text` byte for byte (no line-end translation) into dir and returns the path.
inline std::string WriteFile(const TempDir& dir, const std::string& name, const std::string& text) {
    const std::string path = dir.File(name);
    std::ofstream(path, std::ios::binary) << text;
    return path;
}

inline std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// The lines of a text, cut at CR, LF or CRLF, empty lines kept.
inline std::vector<std::string> Lines(const std::string& text) {
    std::vector<std::string> lines;
    std::string line;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (c == '\r' || c == '\n') {
            lines.push_back(line);
            line.clear();
            if (c == '\r' && i + 1 < text.size() && text[i + 1] == '\n') ++i;
        } else {
            line.push_back(c);
        }
    }
    if (!line.empty()) lines.push_back(line);
    return lines;
}

// A small CMYK + Lab file: three sets, LF line ends.
inline std::string SmallCmykLabFile() {
    return "CGATS.17\n"
           "ORIGINATOR \"test\"\n"
           "NUMBER_OF_FIELDS 8\n"
           "BEGIN_DATA_FORMAT\n"
           "SAMPLE_ID CMYK_C CMYK_M CMYK_Y CMYK_K LAB_L LAB_A LAB_B\n"
           "END_DATA_FORMAT\n"
           "NUMBER_OF_SETS 3\n"
           "BEGIN_DATA\n"
           "1 0 0 0 0 95.0 0.5 -2.0\n"
           "2 100 0 0 0 55.0 -37.0 -50.0\n"
           "3 0 0 0 100 16.0 0.0 0.0\n"
           "END_DATA\n";
}

// Runs a shell command quietly; true when it exited with 0.
inline bool RunQuietly(const std::string& command) { return std::system((command + " >/dev/null 2>&1").c_str()) == 0; }

}  // namespace vantrel::test::it8
