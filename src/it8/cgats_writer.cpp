// Writes measurement files in the four fixed layouts.
#include "it8/cgats_writer.h"

#include <fstream>
#include <iomanip>

#include "colour/colour_values.h"
#include "it8/color_ctrl_errors.h"
#include "it8/measured_it8.h"
#include "it8/number_locale.h"
#include "support/rounding.h"

namespace vantrel {
namespace {

constexpr int32_t kOtherWriteFailure = -1;

struct Layout {
    const char* countLine;
    const char* fieldLine;
};

Layout LayoutFor(uint32_t kind) {
    switch (kind) {
        case 3:
            return {"NUMBER_OF_FIELDS 10",
                    "Sample_Name\tRGB_R\tRGB_G\tRGB_B\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z"};
        case 7:
            return {"NUMBER_OF_FIELDS 14",
                    "Sample_Name\t7CLR_1\t7CLR_2\t7CLR_3\t7CLR_4\t7CLR_5\t7CLR_6\t7CLR_7\tLab_L\tLab_a\tLab_b\tXYZ_X\t"
                    "XYZ_Y\tXYZ_Z"};
        case 6:
            return {"NUMBER_OF_FIELDS 13",
                    "Sample_Name\t6CLR_1\t6CLR_2\t6CLR_3\t6CLR_4\t6CLR_5\t6CLR_6\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\t"
                    "XYZ_Z"};
        default:
            return {"NUMBER_OF_FIELDS 11",
                    "Sample_Name\tCMYK_C\tCMYK_M\tCMYK_Y\tCMYK_K\tLab_L\tLab_a\tLab_b\tXYZ_X\tXYZ_Y\tXYZ_Z"};
    }
}

void WriteColour(std::ostream& out, const PatchRecord& record) {
    for (double v : record.lab) out << '\t' << v;
    for (double v : record.xyz) out << '\t' << v;
}

void WriteRow(std::ostream& out, uint32_t layoutKind, const PatchRecord& record, bool percentRgb) {
    if (layoutKind == 4) {
        out << std::setw(3) << record.sampleNumber << std::fixed << std::setprecision(2);
        for (int c = 0; c < 4; ++c) out << '\t' << record.device[c];
        out << std::setprecision(4);
        WriteColour(out, record);
        out << std::defaultfloat << std::setprecision(6) << '\n';
        return;
    }
    out << record.sampleNumber;
    for (uint32_t c = 0; c < layoutKind; ++c) {
        // RGB percentages, inverted onto 0..255 (100 % is 0).
        if (layoutKind == 3 && percentRgb)
            out << '\t' << 255 - TruncatedInt(record.device[c] * kPercentToDevice);
        else
            out << '\t' << record.device[c];
    }
    WriteColour(out, record);
    out << '\n';
}

}  // namespace

int32_t WriteCgats(const std::string& path, const PatchRecord* records, std::size_t recordCount,
                   int32_t setCount, int32_t strips, int32_t columns, int32_t borderFlag,
                   const std::locale& numbers) {
    if (!records) return kIt8WriteNoRecords;
    if (setCount < 0) setCount = 0;
    if (static_cast<std::size_t>(setCount) > recordCount) return kOtherWriteFailure;

    std::ofstream out(path, std::ios::out | std::ios::trunc);
    if (!out.is_open()) return kIt8WriteCannotCreate;
    out.imbue(numbers);

    const uint32_t kind = recordCount > 0 ? records[0].kind : 0;
    const uint32_t layoutKind = (kind == 3 || kind == 6 || kind == 7) ? kind : 4;
    const Layout layout = LayoutFor(layoutKind);
    out << "IT8\n";
    out << layout.countLine << '\n' << "BEGIN_DATA_FORMAT\n" << layout.fieldLine << '\n' << "END_DATA_FORMAT\n";
    if (borderFlag != 0) out << "BORDER_PATCHES " << 1 << '\n';
    if (columns != 0) out << "NUMBER_OF_COLS " << columns << '\n';
    if (strips != 0) out << "NUMBER_OF_STRIPS " << strips << '\n';
    if (setCount != 0) out << "NUMBER_OF_SETS " << setCount << '\n';
    out << "BEGIN_DATA\n";
    for (int32_t i = 0; i < setCount && out; ++i) WriteRow(out, layoutKind, records[i], borderFlag < 0);
    out << "END_DATA\n";
    out.close();
    return out.fail() ? kOtherWriteFailure : 0;
}

int32_t Measured_IT8::WriteIt8(const std::string& path, const PatchRecord* records, std::size_t recordCount,
                               int32_t setCount, int32_t strips, int32_t columns, int32_t borderFlag) const {
    if (setCount == 0) setCount = m_Header.numberOfSets;
    return WriteCgats(path, records, recordCount, setCount, strips, columns, borderFlag,
                      MeasurementNumberLocale());
}

}  // namespace vantrel
