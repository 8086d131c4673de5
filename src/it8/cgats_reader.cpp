// Reads an IT8/CGATS measurement file into a Measured_IT8.
#include <filesystem>
#include <fstream>
#include <string>
#include <system_error>
#include <vector>

#include "it8/cgats_line.h"
#include "it8/cgats_number.h"
#include "it8/color_ctrl_errors.h"
#include "it8/measured_it8.h"

namespace vantrel {
namespace {

// Skips lines up to and including the one whose first token is `end`.
void SkipBlock(CgatsLineReader& reader, const char* end) {
    std::string line;
    std::vector<std::string> tokens;
    while (reader.Next(line)) {
        SplitCgatsLine(line, tokens);
        if (!tokens.empty() && tokens[0] == end) return;
    }
}

// The header keywords whose value is a number, and where it goes.
int32_t* HeaderNumber(It8Header& header, const std::string& keyword) {
    if (keyword == "NUMBER_OF_STRIPS") return &header.numberOfStrips;
    if (keyword == "NUMBER_OF_COLS") return &header.numberOfCols;
    if (keyword == "PATCHES_PER_PAGE") return &header.patchesPerPage;
    if (keyword == "DEVICE") return &header.device;
    if (keyword == "BORDER_PATCHES") return &header.borderPatches;
    if (keyword == "VERTICAL_MEAS") return &header.verticalMeas;
    if (keyword == "PATCH_SIZE_X") return &header.patchSizeX;
    if (keyword == "PATCH_SIZE_Y") return &header.patchSizeY;
    if (keyword == "GAP_SIZE") return &header.gapSize;
    if (keyword == "MEASURE_ORIENTATION") return &header.measureOrientation;
    return nullptr;
}

}  // namespace

const char* It8ErrorText(int32_t code) {
    switch (code) {
        case 0: return "read";
        case kIt8WriteNoRecords: return "no records to write";
        case kIt8WriteCannotCreate: return "the file cannot be created";
        case kIt8CannotOpen: return "the file cannot be opened as a measurement file";
        case kIt8NoSets: return "NUMBER_OF_SETS is missing or not above 0";
        case kIt8NoFieldNames: return "no field names (BEGIN_DATA_FORMAT) before BEGIN_DATA";
        case kIt8NoDataBlock: return "no BEGIN_DATA";
        case kIt8EndsInDataBlock: return "the file ends before END_DATA";
        case kIt8TooFewSets: return "END_DATA comes before NUMBER_OF_SETS rows";
        case kIt8RowFieldCount: return "a row has another number of values than the data format";
        case kIt8TooManySets: return "more rows than NUMBER_OF_SETS";
        default: return "the file cannot be written";
    }
}

int32_t Measured_IT8::ReadIt8(const std::string& path) {
    Reset();
    m_FailureLine = 0;
    // Only a regular file has an end: a directory, a device such as /dev/zero or a pipe is not a
    // measurement file.
    std::error_code error;
    const std::filesystem::file_status status = std::filesystem::status(path, error);
    if (!error && status.type() != std::filesystem::file_type::regular) return kIt8CannotOpen;
    std::ifstream in(path);
    if (!in.is_open()) return kIt8CannotOpen;
    CgatsLineReader reader(in);
    const int32_t result = ReadOpened(reader);
    // Half a file is no use to anyone: a failed read leaves the object empty.
    if (result != 0) {
        Reset();
        m_FailureLine = reader.LineNumber();
    }
    return result;
}

int32_t Measured_IT8::ReadOpened(CgatsLineReader& reader) {
    std::string line;
    std::vector<std::string> tokens;

    // Header, up to BEGIN_DATA.
    bool dataBlock = false;
    while (!dataBlock && reader.Next(line)) {
        if (line.size() < 2) continue;
        SplitCgatsLine(line, tokens);
        if (tokens.empty()) continue;
        const std::string& key = tokens[0];
        const bool hasValue = tokens.size() > 1;

        if (key == "BEGIN_TARGET_FORMAT") {
            SkipBlock(reader, "END_TARGET_FORMAT");
        } else if (key == "BEGIN_REPORTING_FORMAT") {
            SkipBlock(reader, "END_REPORTING_FORMAT");
        } else if (key == "TARGET_ID" || key == "TARGET" || key == "LAYOUT_ID") {
            if (hasValue) (key == "TARGET_ID" ? m_TargetId : key == "TARGET" ? m_Target : m_LayoutId) = tokens[1];
        } else if (int32_t* number = HeaderNumber(m_Header, key)) {
            if (hasValue) *number = LeadingInt(tokens[1]);
        } else if (key == "NUMBER_OF_SETS") {
            if (hasValue) {
                m_Header.numberOfSets = LeadingInt(tokens[1]);
                if (m_Header.numberOfSets <= 0) return kIt8NoSets;
            }
        } else if (key == "BEGIN_DATA_FORMAT") {
            std::vector<std::string> names;
            if (reader.Next(line)) SplitCgatsLine(line, names);
            if (names.empty() || names[0] == "END_DATA_FORMAT") return kIt8NoFieldNames;
            TakeFieldNames(names);
        } else if (key == "BEGIN_DATA") {
            dataBlock = true;
        } else if (tokens.back() == "BEGIN_SPOTCOLOR_FORMAT") {
            if (reader.Next(line))
                SplitCgatsLine(line, m_SpotColours);
            else
                m_SpotColours.clear();
        }
    }
    if (!dataBlock) return kIt8NoDataBlock;
    if (m_FieldMap.empty()) return kIt8NoFieldNames;
    if (m_Header.numberOfSets <= 0) return kIt8NoSets;

    // Data rows. They are taken as they come, so the memory held never exceeds what the file
    // holds, whatever NUMBER_OF_SETS announces.
    const int64_t sets = m_Header.numberOfSets;
    const std::size_t fieldCount = m_FieldMap.size();
    for (int64_t r = 0; r <= sets; ++r) {
        if (!reader.Next(line)) return kIt8EndsInDataBlock;
        SplitCgatsLine(line, tokens);
        const bool endData = !tokens.empty() && tokens[0] == "END_DATA";
        if (r == sets) return endData ? 0 : kIt8TooManySets;
        if (endData) return kIt8TooFewSets;
        if (tokens.size() != fieldCount) return kIt8RowFieldCount;
        m_Rows.emplace_back();
        m_Rows.back().swap(tokens);
    }
    return 0;  // not reached: the loop ends at r == sets
}

}  // namespace vantrel
