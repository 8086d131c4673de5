#include "interface/parameter_file.h"

#include <cmath>
#include <cstdio>

#include "support/platform.h"
#include "support/rounding.h"

namespace vantrel {
namespace {

// Lines are read in pieces of this many characters.
constexpr int kLinePiece = 255;

bool ParseValue(const char* line, int& value) {
    if (line[0] == '#' || line[0] == '\r' || line[0] == '\n' || line[0] == '\0') return false;
    double number = 0;
    if (std::sscanf(line, "%lf", &number) != 1 || std::isnan(number)) return false;
    value = TruncatedInt(number);
    return true;
}

// Reads the values from an open file, and closes it; nothing from a null one.
int ReadParameters(std::FILE* file, int* values, int limit) {
    if (!file) return 0;
    int stored = 0;
    // The first 255 characters of a line decide; the rest of an over-long line
    // belongs to that line and is passed over, not read as a further value.
    char line[kLinePiece + 1];
    int c = 0;
    while (stored < limit && c != EOF) {
        size_t length = 0;
        while ((c = std::fgetc(file)) != EOF && c != '\n')
            if (length < kLinePiece) line[length++] = static_cast<char>(c);
        if (c == EOF && length == 0) break;
        line[length] = '\0';
        int value = 0;
        if (ParseValue(line, value)) values[stored++] = value;
    }
    std::fclose(file);
    return stored;
}

}  // namespace

int ReadParameterFile(const std::string& path, int* values, int limit) {
    return ReadParameters(std::fopen(path.c_str(), "r"), values, limit);
}

int ReadFixedParameterFile(int* values, int limit) {
    return ReadParameters(platform::OpenFixedFile(platform::ParameterFilePath()), values, limit);
}

}  // namespace vantrel
