#include "it8/measured_it8.h"

#include <algorithm>

#include "it8/cgats_number.h"

namespace vantrel {
namespace {

// Field names (upper-cased, as the reader sees them) and the columns they fill. "RED" is
// handled apart: it also copies the CMYK positions into channels 1 to 4.
struct KnownField {
    const char* name;
    It8Column column;
    int alsoColumn;  // a second column filled by the same name, or -1
};

constexpr KnownField kKnownFields[] = {
    {"CMYK_C", kColCyan, kColChannel1},     {"CMY_C", kColCyan, kColChannel1},
    {"CMYK_M", kColMagenta, kColChannel2},  {"CMY_M", kColMagenta, kColChannel2},
    {"CMYK_Y", kColYellow, kColChannel3},   {"CMY_Y", kColYellow, kColChannel3},
    {"CMYK_K", kColBlack, kColChannel4},
    {"6CLR_1", kColChannel1, -1}, {"7CLR_1", kColChannel1, -1}, {"PC7_1", kColChannel1, -1},
    {"PC6_1", kColChannel1, -1},  {"PC5_1", kColChannel1, -1},
    {"6CLR_2", kColChannel2, -1}, {"7CLR_2", kColChannel2, -1}, {"PC7_2", kColChannel2, -1},
    {"PC6_2", kColChannel2, -1},  {"PC5_2", kColChannel2, -1},
    {"6CLR_3", kColChannel3, -1}, {"7CLR_3", kColChannel3, -1}, {"PC7_3", kColChannel3, -1},
    {"PC6_3", kColChannel3, -1},  {"PC5_3", kColChannel3, -1},
    {"6CLR_4", kColChannel4, -1}, {"7CLR_4", kColChannel4, -1}, {"PC7_4", kColChannel4, -1},
    {"PC6_4", kColChannel4, -1},  {"PC5_4", kColChannel4, -1},
    {"6CLR_5", kColChannel5, -1}, {"7CLR_5", kColChannel5, -1}, {"PC7_5", kColChannel5, -1},
    {"PC6_5", kColChannel5, -1},  {"PC5_5", kColChannel5, -1},
    {"6CLR_6", kColChannel6, -1}, {"7CLR_6", kColChannel6, -1}, {"PC7_6", kColChannel6, -1},
    {"PC6_6", kColChannel6, -1},
    {"7CLR_7", kColChannel7, -1}, {"PC7_7", kColChannel7, -1},
    {"ORANGE", kColChannel5, -1}, {"GREEN", kColChannel6, -1}, {"BLUE", kColChannel7, -1},
    {"RGB_R", kColRgbR, -1}, {"RGB_G", kColRgbG, -1}, {"RGB_B", kColRgbB, -1},
    {"D_RED", kColDensityRed, -1}, {"D_GREEN", kColDensityGreen, -1}, {"D_BLUE", kColDensityBlue, -1},
    {"D_VIS", kColDensityVisual, -1},
    {"XYZ_X", kColXyzX, -1}, {"XYZ_Y", kColXyzY, -1}, {"XYZ_Z", kColXyzZ, -1},
    {"LAB_L", kColLabL, -1}, {"LAB_A", kColLabA, -1}, {"LAB_B", kColLabB, -1},
};

bool StartsWith(const std::string& text, const char* prefix) {
    return text.rfind(prefix, 0) == 0;
}

// The wavelength of a spectral name's suffix, or false when the suffix does not start with a digit.
bool SuffixWavelength(const std::string& name, std::size_t prefixLength, int32_t& nm) {
    if (name.size() <= prefixLength || name[prefixLength] < '0' || name[prefixLength] > '9') return false;
    nm = LeadingInt(std::string_view(name).substr(prefixLength));
    return true;
}

}  // namespace

void Measured_IT8::Reset() {
    ClearFormat();
    m_FieldNames.clear();
    m_SpotColours.clear();
    m_Rows.clear();
    m_TargetId.clear();
    m_Target.clear();
    m_LayoutId.clear();
    m_Header = It8Header{};
}

void Measured_IT8::ClearFormat() {
    m_Columns.fill(-1);
    m_Fields.clear();
    m_SpectralFields.clear();
    m_FieldMap.clear();
    m_Wavelengths.clear();
    m_SpectralScale = 1.0;
}

void Measured_IT8::TakeFieldNames(const std::vector<std::string>& names) {
    // A second data format replaces the first, so the rows always match the names.
    ClearFormat();
    m_FieldNames = names;
    m_Header.fieldNameCount = static_cast<int32_t>(names.size());
    for (std::size_t i = 0; i < names.size(); ++i) TakeColumn(static_cast<int32_t>(i), names[i]);
    std::stable_sort(m_SpectralFields.begin(), m_SpectralFields.end(),
                     [](const It8Field& x, const It8Field& y) { return x.name < y.name; });
}

void Measured_IT8::TakeColumn(int32_t column, const std::string& name) {
    m_Fields.push_back(It8Field{column, name, std::string()});
    m_FieldMap[name] = column;

    if (name == "RED") {
        // Columns are taken in file order: RED copies the CMYK positions found to its left.
        m_Columns[kColChannel5] = column;
        m_Columns[kColChannel1] = m_Columns[kColCyan];
        m_Columns[kColChannel2] = m_Columns[kColMagenta];
        m_Columns[kColChannel3] = m_Columns[kColYellow];
        m_Columns[kColChannel4] = m_Columns[kColBlack];
    }
    for (const KnownField& known : kKnownFields) {
        if (name != known.name) continue;
        m_Columns[known.column] = column;
        if (known.alsoColumn >= 0) m_Columns[known.alsoColumn] = column;
        break;
    }

    if (StartsWith(name, "SP_") || StartsWith(name, "SPECTRAL_NM_") || StartsWith(name, "NM") ||
        StartsWith(name, "SPECTRAL_")) {
        m_SpectralFields.push_back(It8Field{column, name, std::string()});
        int32_t nm = 0;
        if (StartsWith(name, "SPECTRAL_NM_") && SuffixWavelength(name, 12, nm)) {
            m_Wavelengths[nm] = column;
            m_SpectralScale = 100.0;
        } else if (StartsWith(name, "SPECTRAL_") && SuffixWavelength(name, 9, nm)) {
            m_Wavelengths[nm] = column;
            m_SpectralScale = 1.0;
        }
    }
}

bool Measured_IT8::Lookup(int set, int channel, int channels, It8Column first, double& value) const {
    if (set < 0 || set >= PatchCount()) {
        value = kBadSet;
        return false;
    }
    if (channel < 0 || channel >= channels) {
        value = kBadChannel;
        return false;
    }
    const int32_t column = m_Columns[first + channel];
    const std::vector<std::string>& row = m_Rows[static_cast<std::size_t>(set)];
    // A column past the stored values can only come from repeated field names.
    if (column < 0 || static_cast<std::size_t>(column) >= row.size()) {
        value = kNoColumn;
        return false;
    }
    value = LeadingDouble(row[static_cast<std::size_t>(column)]);
    return true;
}

double Measured_IT8::Value(int set, int channel, int channels, It8Column first) const {
    double value = 0;
    Lookup(set, channel, channels, first, value);
    return value;
}

double Measured_IT8::GetCmyk(int set, int channel) const { return Value(set, channel, 4, kColCyan); }
double Measured_IT8::GetChannel(int set, int channel) const { return Value(set, channel, 7, kColChannel1); }
double Measured_IT8::GetRgb(int set, int channel) const { return Value(set, channel, 3, kColRgbR); }
double Measured_IT8::GetXyz(int set, int channel) const { return Value(set, channel, 3, kColXyzX); }

double Measured_IT8::GetLab(int set, int channel) const {
    double value = 0;
    if (!Lookup(set, channel, 3, kColLabL, value)) return value;
    if (channel == 0) return std::clamp(value, 0.0, 100.0);
    return std::clamp(value, -128.0, 127.0);
}

}  // namespace vantrel
