#include "eval/gamut_record.h"

#include <algorithm>
#include <cmath>

#include "colour/colour_math.h"
#include "eval/forward.h"
#include "eval/inverse.h"
#include "eval/pcs_encoding.h"
#include "eval/table_nodes.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr int kBins = GamutRecord::kBins;
constexpr int kLastBin = kBins - 1;
constexpr double kHueBin = 11.25;
constexpr double kLightnessBin = 7.96875;
constexpr int kMaxChroma = 182;
// A chroma sweep stops once the reproduced lightness drifts this far from the wanted one.
constexpr double kLightnessDrift = 3.3;
constexpr int kEmpty = 255;

// The device channel count a record is built for, from the direction-1 data colour space:
// 3, 4 or 5..7; 0 for spaces without a gamut variant.
int GamutChannels(const LutSlot& lut) {
    const std::string& s = lut.colourSpace;
    if (SpaceIs(s, "RGB ")) return 3;
    if (SpaceIs(s, "CMYK") || SpaceIs(s, "4CLR")) return 4;
    if (SpaceIs(s, "5CLR") || SpaceIs(s, "MCH5")) return 5;
    if (SpaceIs(s, "6CLR") || SpaceIs(s, "MCH6")) return 6;
    if (SpaceIs(s, "7CLR") || SpaceIs(s, "MCH7")) return 7;
    return 0;
}

int Bin(double value, double width) {
    const int bin = static_cast<int>(value / width);
    return bin < 0 ? 0 : (bin > kLastBin ? kLastBin : bin);
}

class GamutBuilder {
public:
    GamutBuilder(CProfil& p, int channels) : p_(p), channels_(channels) {
        for (auto& row : table_)
            for (auto& cell : row) cell = -1;
        paper_ = p.WhiteLab(0);
        lightnessMax_ = paper_.L * kLightnessScale;
    }

    GamutRecord Build() {
        if (channels_ == 3) {
            Lattice(false);
            Lattice(true);
            RgbSweeps();
        } else {
            Direction0Nodes();
            Direction1Nodes();
            Lattice(false);
            HueSweeps();
        }
        EdgeSearch();
        return Finish();
    }

private:
    // Scaled Lab in v[0..2] to device values and back.
    void RoundTrip(double* v) {
        for (int k = 3; k < CProfil::kEvalSize; ++k) v[k] = 0.0;
        LabToDevice(p_, v, channels_);
        DeviceToLab(p_, v, channels_);
    }

    LCh Record(const double* lab) {
        const LCh c = LabToLCh(lab[0], lab[1], lab[2]);
        Note(Bin(c.h, kHueBin), Bin(c.L, kLightnessBin), c);
        return c;
    }

    void Note(int hue, int lightness, const LCh& c) {
        int32_t& cell = table_[hue][lightness];
        cell = std::max(cell, static_cast<int32_t>(c.C + 0.5));
        lightnessMax_ = std::max(lightnessMax_, c.L);
        lightnessMin_ = std::min(lightnessMin_, c.L);
    }

    // Every node of the direction-0 table: its Lab, through the tables and back.
    void Direction0Nodes() {
        const LutSlot& lut = p_.m_Lut[0];
        ForEachNode(lut.inputChannels, lut.gridPoints, 4, [&](double* record) {
            ReadNodeLab(p_, record, 0, true);
            double v[CProfil::kEvalSize] = {record[0], record[1], record[2]};
            RoundTrip(v);
            Record(v);
        });
    }

    // Every node of the direction-1 table: its device values, forward.
    void Direction1Nodes() {
        const LutSlot& lut = p_.m_Lut[1];
        const int n = lut.inputChannels;
        const int m = std::min<int>(lut.outputChannels, CProfil::kEvalSize);
        ForEachNode(n, lut.gridPoints, n >= 4 ? n : 4, [&](double* record) {
            ReadNodeDevice(p_, record, true);
            double v[CProfil::kEvalSize] = {};
            for (int k = 0; k < m; ++k) v[k] = record[k];
            DeviceToLab(p_, v, channels_);
            Record(v);
        });
    }

    template <typename Visit>
    void ForEachNode(int inputs, int grid, int firstField, Visit visit) {
        if (inputs < 1 || inputs > CProfil::kMaxInputs || grid < 1) return;
        int index[CProfil::kMaxInputs] = {};
        for (;;) {
            double record[24] = {};
            for (int i = 0; i < inputs; ++i) record[firstField + i] = index[i];
            visit(record);
            int i = inputs - 1;
            while (i >= 0 && ++index[i] == grid) index[i--] = 0;
            if (i < 0) return;
        }
    }

    // The 21 x 21 x 21 lattice of step 12.75: Lab (a*, b* from -128), or RGB device values
    // taken forward first.
    void Lattice(bool device) {
        const double ab = device ? 0.0 : -128.0;
        for (int i = 0; i <= 20; ++i)
            for (int j = 0; j <= 20; ++j)
                for (int k = 0; k <= 20; ++k) {
                    double v[CProfil::kEvalSize] = {12.75 * i, 12.75 * j + ab, 12.75 * k + ab};
                    if (device) RgbToLab(p_, v);
                    RoundTrip(v);
                    Record(v);
                }
    }

    LCh RoundTripLch(double L, double C, double h) {
        const Lab lab = LChToLab(L, C, h);
        double v[CProfil::kEvalSize] = {lab.L, lab.a, lab.b};
        RoundTrip(v);
        return LabToLCh(v[0], v[1], v[2]);
    }

    // Chroma sweeps at every hue and lightness bin: the result counts for its own cell and for
    // the hue it was asked for.
    void HueSweeps() {
        for (int i = 0; i < kBins; ++i)
            for (int j = 0; j < kBins; ++j)
                for (int c = 0; c < kMaxChroma; ++c) {
                    const LCh r = RoundTripLch(kLightnessBin * i, c, kHueBin * j);
                    const int lightness = Bin(r.L, kLightnessBin);
                    Note(Bin(r.h, kHueBin), lightness, r);
                    Note(j, lightness, r);
                }
    }

    void RgbSweeps() {
        for (int i = 0; i <= 100; ++i)
            for (int k = 0; k < 90; ++k)
                for (int c = 0; c < kMaxChroma; ++c) {
                    const LCh r = RoundTripLch(kLightnessScale * i, c, 4.0 * k);
                    Note(Bin(r.h, kHueBin), Bin(r.L, kLightnessBin), r);
                }
    }

    // From the largest chroma found in each cell, push outwards while the reproduced lightness
    // stays near the bin's, and record the last colour before it drifted.
    void EdgeSearch() {
        for (int i = 0; i < kBins; ++i)
            for (int j = 0; j < kBins; ++j) {
                const double L = kLightnessBin * i;
                int c = std::max(table_[j][i], 0);
                LCh r = RoundTripLch(L, c, kHueBin * j);
                LCh s = r;
                while (std::fabs(r.L - L) < kLightnessDrift && c < kMaxChroma) {
                    s = r;
                    ++c;
                    r = RoundTripLch(L, c, kHueBin * j);
                }
                const int lightness = Bin(s.L, kLightnessBin);
                Note(j, lightness, s);
                Note(Bin(s.h, kHueBin), lightness, s);
            }
    }

    GamutRecord Finish() const {
        GamutRecord g;
        g.valid = 1;
        for (int h = 0; h < kBins; ++h)
            for (int l = 0; l < kBins; ++l) {
                const int32_t v = table_[h][l];
                g.chroma[h][l] = v < 0 ? kEmpty : (v < 1 ? 0 : static_cast<uint8_t>(v & 0xFF));
            }
        g.lightnessMin = lightnessMin_;
        g.lightnessMax = lightnessMax_;
        g.paperWhite[0] = paper_.L;
        g.paperWhite[1] = paper_.a;
        g.paperWhite[2] = paper_.b;
        return g;
    }

    CProfil& p_;
    int channels_;
    int32_t table_[kBins][kBins];
    double lightnessMin_ = 255.0;
    double lightnessMax_ = 0.0;
    Lab paper_;
};

GamutRecord EmptyRecord() {
    GamutRecord g;
    g.valid = 1;
    g.lightnessMin = 255.0;
    g.lightnessMax = 0.0;
    for (auto& row : g.chroma)
        for (auto& cell : row) cell = kEmpty;
    return g;
}

}  // namespace

bool HoldsBothTables(const CProfil& p) { return p.SlotHolds(0) && p.SlotHolds(1); }

GamutRecord BuildGamutRecord(CProfil& p) {
    // Descriptors without tables (a failed load) describe nothing to push colours through.
    if (!HoldsBothTables(p)) return EmptyRecord();
    const int channels = GamutChannels(p.m_Lut[1]);
    if (channels == 0) return EmptyRecord();
    return GamutBuilder(p, channels).Build();
}

bool IsInGamut(const GamutRecord& g, double L, double a, double b) {
    if (!std::isfinite(L) || !std::isfinite(a) || !std::isfinite(b)) return false;
    const LCh c = LabToLCh(L, a, b);
    const double scaled = c.L * kLightnessScale;
    const int hue = static_cast<int>(c.h / kHueBin + 0.5);
    const int lightness = static_cast<int>(scaled / kLightnessBin + 0.5);
    if (lightness < 0 || lightness > kLastBin || hue < 0 || hue > kLastBin) return false;
    const int e = g.chroma[hue][lightness];
    if (e > 254 || e < 1) return false;
    const int l = static_cast<int>(scaled);
    if (static_cast<int>(g.lightnessMin) > l || static_cast<int>(g.lightnessMax) < l) return false;
    return e >= static_cast<int>(c.C + 0.5);
}

Lab ReproducedLab(CProfil& p, double L, double a, double b) {
    double v[CProfil::kEvalSize] = {L * kLightnessScale, a, b};
    const int channels = HoldsBothTables(p) ? GamutChannels(p.m_Lut[1]) : 0;
    if (channels != 0) {
        LabToDevice(p, v, channels);
        DeviceToLab(p, v, channels);
    }
    return Lab{v[0] / kLightnessScale, v[1], v[2]};
}

}  // namespace vantrel
