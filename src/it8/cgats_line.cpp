#include "it8/cgats_line.h"

namespace vantrel {
namespace {

bool EndsLine(int c) { return c == '\n' || c == '\r' || c == '\0' || c >= 0x80; }

}  // namespace

bool CgatsLineReader::Next(std::string& line) {
    line.clear();
    if (!buffer_ || overlong_) return false;
    using Traits = std::streambuf::traits_type;
    for (;;) {
        const int c = buffer_->sbumpc();
        if (c == Traits::eof()) return !line.empty();
        if (c == '\n' || (c == '\r' && buffer_->sgetc() != '\n')) ++breaks_;
        if (EndsLine(c)) {
            if (line.empty()) continue;
            return true;
        }
        if (line.empty()) lineNumber_ = breaks_ + 1;
        if (line.size() == kMaxLineLength) {
            overlong_ = true;
            line.clear();
            return false;
        }
        if (c == ',')
            line.push_back('.');
        else if (c >= 'a' && c <= 'z')
            line.push_back(static_cast<char>(c - 'a' + 'A'));
        else
            line.push_back(static_cast<char>(c));
    }
}

void SplitCgatsLine(const std::string& line, std::vector<std::string>& tokens) {
    tokens.clear();
    std::size_t i = 0;
    const std::size_t n = line.size();
    while (i < n) {
        while (i < n && (line[i] == ' ' || line[i] == '\t')) ++i;
        const std::size_t start = i;
        while (i < n && line[i] != ' ' && line[i] != '\t') ++i;
        if (i > start) tokens.emplace_back(line, start, i - start);
    }
}

}  // namespace vantrel
