// The comparison of a measurement with its reference, patch by patch, and in profiling mode the
// correction of the device link the measured chart was printed through.
#include <algorithm>
#include <cmath>
#include <memory>
#include <string>
#include <vector>

#include "analysis/device_index.h"
#include "analysis/it8_kind.h"
#include "colour/colour_math.h"
#include "eval/grid_location.h"
#include "eval/table_nodes.h"
#include "interface/tool_object.h"
#include "it8/patch_record.h"

namespace vantrel {
namespace {

constexpr const char* kMergedSuffix = "_merged.it8";
constexpr const char* kAnalyze = "Analyze Measurements...";
constexpr const char* kFinished = "Finished ...";
// Figures of files whose patches cannot be paired.
constexpr double kUnaligned = 100.0;
// Below this total difference the files count as equal: the mean is 0.
constexpr double kNoDifference = 0.02;
// A patch counts as sitting on a node of the link closer than this (grid units).
constexpr double kOnNode = 0.01;
// A node whose patch got worse than in the previous run by more than this is put back.
constexpr double kWorseBy = 0.2;

DeviceKey WholeDevice(const Measured_IT8& it8, const It8Kind& kind, int patch) {
    DeviceKey v = PatchDevice(it8, kind, patch);
    for (double& x : v) x = std::trunc(x + 0.5);
    return v;
}

// The comparison takes its colour sources from the first patch of each file.
bool ColourFromXyz(const Measured_IT8& it8) { return It8ColourFromXyz(it8, 0); }

// Device values of a patch as the link takes them: CMYK without a negative black.
DeviceKey LinkDevice(const Measured_IT8& it8, const It8Kind& kind, int patch) {
    DeviceKey v = PatchDevice(it8, kind, patch);
    if (kind.device == It8Kind::kCmyk && v[3] < 0) v[3] = 0;
    return v;
}

// The link correction of one merged analysis: m_Outprof's direction-1 table, fed the chart's
// device values. Only a table taking and giving exactly the chart's four or more channels is
// touched; any other (a Lab correction table, another kind of link) leaves the records with the
// reference's device values and nodes unchanged.
class LinkCorrection {
public:
    LinkCorrection(CProfil* link, const It8Kind& kind) : link_(link), channels_(ComparedChannels(kind)) {
        scale_ = kind.device == It8Kind::kRgb ? 1.0 : kPercentToDevice;
        usable_ = link_ && link_->SlotHolds(1) && channels_ >= 4 && link_->m_Lut[1].inputChannels == channels_ &&
                  link_->m_Lut[1].outputChannels == channels_;
    }

    // Where the device values fall: true when on a node other than the paper white's, with the
    // node's indices placed where the node accessors read them.
    bool OnNode(const DeviceKey& device, double* record) const {
        if (!usable_) return false;
        std::fill(record, record + CProfil::kEvalSize, 0.0);
        for (int c = 0; c < channels_; ++c) record[c] = device[static_cast<std::size_t>(c)] * scale_;
        const double distance = LocateNearestNode(*link_, record, 1);
        if (!(distance < kOnNode)) return false;
        bool paper = true;
        for (int c = 0; c < channels_; ++c) {
            if (c >= 3 && record[c] != 0) return false;  // only nodes without black and extra colours
            if (record[c] != 0) paper = false;
        }
        if (paper) return false;
        PlaceLocatedNode(*link_, record, 1, NodeFields::kDevice);
        return true;
    }

    // The link's output at the node (no output curves), on the chart's scale.
    void ReadNode(double* record, double* device) const {
        ReadNodeDevice(*link_, record, false);
        for (int c = 0; c < channels_; ++c) device[c] = record[c] / scale_;
    }

    // Puts device values (chart scale) back into the node.
    void WriteNode(double* record, const DeviceKey& device) const {
        for (int c = 0; c < channels_; ++c) {
            const double v = device[static_cast<std::size_t>(c)] * scale_;
            record[c < 4 ? c : c + 10] = v;
        }
        WriteNodeDevice(*link_, record, false);
    }

private:
    CProfil* link_;
    int channels_;
    double scale_ = kPercentToDevice;
    bool usable_ = false;
};

bool SameKind(const It8Kind& p, const It8Kind& q) {
    return p.device == q.device && (p.device != It8Kind::kMultiChannel || p.seventhChannel == q.seventhChannel);
}

}  // namespace

AnalysisFigures CIterativtoolDlg::MergedAnalysis() {
    AnalysisFigures figures;
    bool carry = m_PrevMeasIT8 && m_CorrectOutprof;
    // The whites before any alignment rewrites the files they came from.
    figures.white = DeltaE(m_MeasWhite, m_RefWhite);
    // Byte-wise: the default label and the empty name are not names of files.
    if (!(m_ReferenceIT8Name > kNoFileSelected && m_MeasIT8Name > kNoFileSelected)) return figures;
    if (!m_ReferenceIT8 || !m_MeasIT8) return figures;
    // Patches of different device kinds cannot be paired by their values.
    const It8Kind kind = ProbeIt8Kind(*m_ReferenceIT8, kScanProbePatch);
    if (!SameKind(kind, ProbeIt8Kind(*m_MeasIT8, kScanProbePatch))) return figures;
    const int channels = ComparedChannels(kind);
    if (channels == 0) return figures;

    const int countR = m_ReferenceIT8->PatchCount();
    const int countM = m_MeasIT8->PatchCount();
    if (countR == countM) {
        // One layout when the first, second and last patches agree in whole numbers: the files this
        // library derives from a chart (ISD copy, simulated reference) round its device values.
        bool differs = false;
        for (int patch : {0, 1, std::max(countR - 1, 0)})
            if (!SameDevice(WholeDevice(*m_ReferenceIT8, kind, patch), WholeDevice(*m_MeasIT8, kind, patch), channels))
                differs = true;
        if (differs && !m_CorrectOutprof && m_Refprof) AlignMeasurementToReference();
    } else if (countM < countR) {
        AlignReferenceToMeasurement();
    } else {
        AlignMeasurementToReference();
    }

    const int n = m_ReferenceIT8->PatchCount();
    if (n != m_MeasIT8->PatchCount()) {
        figures.mean = figures.maximum = kUnaligned;
        figures.differences = true;
        return figures;
    }
    if (n < 1) return figures;
    if (carry && m_PrevMeasIT8->PatchCount() != n) carry = false;

    std::vector<PatchRecord> records(static_cast<std::size_t>(n));
    records[0].kind = static_cast<uint32_t>(channels);

    const bool refFromXyz = ColourFromXyz(*m_ReferenceIT8);
    const bool measFromXyz = ColourFromXyz(*m_MeasIT8);
    const bool prevFromXyz = carry && ColourFromXyz(*m_PrevMeasIT8);
    if (carry && prevFromXyz && m_PrevMeasIT8->GetXyz(0, 0) == Measured_IT8::kNoColumn) carry = false;
    if (carry && !SameKind(ProbeIt8Kind(*m_PrevMeasIT8, kScanProbePatch), kind)) carry = false;
    const LinkCorrection link(m_CorrectOutprof ? m_Outprof.get() : nullptr, kind);

    double sum = 0;
    int inGamut = 0;
    Progress(kAnalyze, 0, n);
    for (int i = 0; i < n; ++i) {
        const Lab labR = PatchLab(*m_ReferenceIT8, i, refFromXyz);
        const Lab labM = PatchLab(*m_MeasIT8, i, measFromXyz);
        const double d = DeltaE(labR, labM);
        sum += d;
        figures.maximum = std::max(figures.maximum, d);
        if (!m_AbstractOutprof && IsInGamut(m_Gamut, labR.L, labR.a, labR.b)) ++inGamut;
        if (!m_CorrectOutprof) continue;

        PatchRecord& record = records[static_cast<std::size_t>(i)];
        record.sampleNumber = static_cast<uint32_t>(i + 1);
        const DeviceKey device = LinkDevice(*m_ReferenceIT8, kind, i);
        for (int c = 0; c < channels; ++c) record.device[c] = device[static_cast<std::size_t>(c)];
        Lab colour = labM;
        double node[CProfil::kEvalSize];
        if (link.OnNode(device, node)) {
            bool reverted = false;
            Lab labP;
            if (carry) {
                labP = PatchLab(*m_PrevMeasIT8, i, prevFromXyz);
                if (d - DeltaE(labP, labR) > kWorseBy) {
                    reverted = true;
                    ++m_RecalcFlag;
                }
            }
            if (reverted) {
                // The previous run printed this patch better: its device values go back into the node.
                const DeviceKey previous = PatchDevice(*m_PrevMeasIT8, kind, i);
                link.WriteNode(node, previous);
                for (int c = 0; c < channels; ++c) record.device[c] = previous[static_cast<std::size_t>(c)];
                colour = labP;
            } else {
                link.ReadNode(node, record.device);
            }
        }
        SetRecordColour(record, colour);
    }
    Progress(kFinished, 1, 1);

    figures.mean = sum >= kNoDifference ? sum / n : 0.0;
    figures.gamut = inGamut * 100.0 / n;
    figures.differences = true;

    if (m_CorrectOutprof && carry && m_RecalcFlag > 0) {
        // What the link now prints for each patch and how it measured: the next pass works on that.
        const std::string name = m_MeasIT8Name + kMergedSuffix;
        m_MeasIT8->WriteIt8(name, records, n, 0, 0, 0);
        m_MeasIT8Name = name;
        m_MeasIT8 = std::make_unique<Measured_IT8>();
        m_MeasIT8->ReadIt8(name);
    }
    return figures;
}

}  // namespace vantrel
