#pragma once

#include <cstddef>
#include <istream>
#include <string>
#include <vector>

namespace vantrel {

// Reads the text of a CGATS file one line at a time, the way the measurement reader wants it:
// a line ends at LF, CR, NUL or any byte with the high bit set; such bytes before the first
// character of a line are skipped, so empty lines never come back. Decimal commas become
// points and letters are upper-cased.
class CgatsLineReader {
public:
    // The longest line of a real measurement file is a few kilobytes (a spectral data format of
    // 401 columns); a longer line ends the readable text, so binary input is read in bounded memory.
    static constexpr std::size_t kMaxLineLength = 64 * 1024;

    explicit CgatsLineReader(std::istream& in) : buffer_(in.rdbuf()) {}

    // The next line, or false at the end of the readable text: the end of the file, or a line
    // longer than kMaxLineLength (Overlong() tells which).
    bool Next(std::string& line);
    bool Overlong() const { return overlong_; }
    // The file line (counting from 1) on which the line last returned began.
    int LineNumber() const { return lineNumber_; }

private:
    std::streambuf* buffer_;
    bool overlong_ = false;
    int breaks_ = 0;  // line breaks passed: LF, CR LF or a lone CR count one each
    int lineNumber_ = 0;
};

// The blank- and tab-separated tokens of a line, empty tokens dropped.
void SplitCgatsLine(const std::string& line, std::vector<std::string>& tokens);

}  // namespace vantrel
