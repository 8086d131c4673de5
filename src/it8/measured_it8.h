#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <istream>
#include <map>
#include <string>
#include <vector>

#include "it8/color_ctrl_errors.h"
#include "it8/patch_record.h"

namespace vantrel {

class CgatsLineReader;

// The columns the library understands, by what they hold.
enum It8Column : int {
    kColCyan, kColMagenta, kColYellow, kColBlack,
    kColChannel1, kColChannel2, kColChannel3, kColChannel4, kColChannel5, kColChannel6, kColChannel7,
    kColRgbR, kColRgbG, kColRgbB,
    kColDensityRed, kColDensityGreen, kColDensityBlue, kColDensityVisual,
    kColXyzX, kColXyzY, kColXyzZ,
    kColLabL, kColLabA, kColLabB,
    kColumnKinds
};

// One column of the data format.
struct It8Field {
    int32_t column = -1;
    std::string name;
    std::string secondName;  // always empty in files read so far
};

// The numbers of a measurement file's header; -1 when the file does not give them
// (MEASURE_ORIENTATION: 0).
struct It8Header {
    int32_t numberOfCols = -1;
    int32_t fieldNameCount = -1;  // names on the data-format line
    int32_t numberOfSets = -1;
    int32_t numberOfStrips = -1;
    int32_t borderPatches = -1;
    int32_t patchesPerPage = -1;
    int32_t device = -1;
    int32_t verticalMeas = -1;
    int32_t patchSizeX = -1;
    int32_t patchSizeY = -1;
    int32_t gapSize = -1;
    int32_t measureOrientation = 0;
};

// One IT8/CGATS measurement file in memory. Values stay the text found in the file and are
// converted on access; the columns the library understands are located by name.
//
// A read that fails leaves the object empty (as constructed): no patches, no columns, so every
// scan and analysis sees an empty file.
class Measured_IT8 {
public:
    // Answers of the accessors for bad arguments.
    static constexpr double kBadSet = -1.0;
    static constexpr double kBadChannel = -2.0;
    static constexpr double kNoColumn = -255.0;

    Measured_IT8() { Reset(); }
    Measured_IT8(const Measured_IT8&) = delete;
    Measured_IT8& operator=(const Measured_IT8&) = delete;

    // Reads a CGATS file: 0, or one of the reader's eColorCtrlErrors codes.
    int32_t ReadIt8(const std::string& path);
    // The file line on which the last failed read stopped; 0 after a successful read or when the
    // file could not be opened.
    int FailureLine() const { return m_FailureLine; }

    // Writes records as a measurement file (cgats_writer.cpp). setCount 0 takes this object's
    // NUMBER_OF_SETS; strips and columns are written when non-zero; a non-zero borderFlag writes
    // BORDER_PATCHES 1, a negative one also writes RGB percentages as inverted 0..255 integers.
    // 0; kIt8WriteNoRecords; kIt8WriteCannotCreate; -1 on any other failure (also when fewer than
    // setCount records are given, then without creating the file).
    int32_t WriteIt8(const std::string& path, const PatchRecord* records, std::size_t recordCount,
                     int32_t setCount, int32_t strips, int32_t columns, int32_t borderFlag) const;
    int32_t WriteIt8(const std::string& path, const std::vector<PatchRecord>& records, int32_t setCount,
                     int32_t strips, int32_t columns, int32_t borderFlag) const {
        return WriteIt8(path, records.data(), records.size(), setCount, strips, columns, borderFlag);
    }

    // The value of one set's column: kBadSet for a set outside the file, kBadChannel for a channel
    // outside the accessor's range, kNoColumn when the file has no such column.
    double GetCmyk(int set, int channel) const;     // 0..3: C, M, Y, K
    double GetChannel(int set, int channel) const;  // 0..6: channels 1 to 7 of a multi-channel set
    double GetRgb(int set, int channel) const;      // 0..2
    double GetXyz(int set, int channel) const;      // 0..2
    double GetLab(int set, int channel) const;      // 0..2; L* clamped to 0..100, a*, b* to -128..127

    // Patches held: NUMBER_OF_SETS after a successful read, 0 for an empty object.
    int PatchCount() const { return static_cast<int>(m_Rows.size()); }
    // Distinct field names, the number of values in every row.
    int FieldCount() const { return static_cast<int>(m_FieldMap.size()); }

    int32_t Column(It8Column kind) const { return m_Columns[kind]; }
    const It8Header& Header() const { return m_Header; }
    const std::vector<It8Field>& Fields() const { return m_Fields; }
    const std::vector<It8Field>& SpectralFields() const { return m_SpectralFields; }
    const std::map<std::string, int32_t>& FieldMap() const { return m_FieldMap; }
    const std::map<int32_t, int32_t>& Wavelengths() const { return m_Wavelengths; }
    const std::vector<std::string>& SpotColours() const { return m_SpotColours; }
    const std::vector<std::vector<std::string>>& Rows() const { return m_Rows; }
    double SpectralScale() const { return m_SpectralScale; }
    const std::string& TargetId() const { return m_TargetId; }
    const std::string& Target() const { return m_Target; }
    const std::string& LayoutId() const { return m_LayoutId; }
    const std::vector<std::string>& FieldNames() const { return m_FieldNames; }

private:
    void Reset();
    // Forgets the columns of the data format (positions, names, spectral lists).
    void ClearFormat();
    int32_t ReadOpened(CgatsLineReader& reader);
    // Takes the names of the data-format line: field list, name map, column positions, spectral lists.
    void TakeFieldNames(const std::vector<std::string>& names);
    void TakeColumn(int32_t column, const std::string& name);
    // The value of a set's column, or false with the accessor's answer for bad arguments.
    bool Lookup(int set, int channel, int channels, It8Column first, double& value) const;
    double Value(int set, int channel, int channels, It8Column first) const;

    std::array<int32_t, kColumnKinds> m_Columns;
    std::vector<It8Field> m_Fields;
    std::vector<It8Field> m_SpectralFields;  // sorted by name
    std::map<std::string, int32_t> m_FieldMap;
    std::map<int32_t, int32_t> m_Wavelengths;  // nanometres to column
    std::vector<std::string> m_SpotColours;
    std::vector<std::vector<std::string>> m_Rows;  // FieldCount() values each
    double m_SpectralScale = 1.0;
    std::string m_TargetId;
    std::string m_Target;
    std::string m_LayoutId;
    std::vector<std::string> m_FieldNames;
    It8Header m_Header;
    int m_FailureLine = 0;
};

// What a reader or writer code means, in a few words for the user ("the file cannot be opened").
const char* It8ErrorText(int32_t code);

}  // namespace vantrel
