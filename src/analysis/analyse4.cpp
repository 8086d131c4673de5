// analyse4: a proof judged against its reference, and the reference simulated from its profile
// when it was not measured.
#include "analysis/analyse4.h"

#include <cmath>
#include <memory>
#include <string>
#include <vector>

#include "analysis/analyse2.h"
#include "analysis/device_index.h"
#include "analysis/it8_kind.h"
#include "eval/forward.h"
#include "interface/host_number.h"
#include "interface/tool_object.h"
#include "it8/patch_record.h"
#include "support/platform.h"

namespace vantrel {
namespace {

constexpr const char* kSimulatedSuffix = ".it8";
// The sizes of the ISD profiles the analysis applies by itself: 714612 bytes is the embedded
// neutral profile.
constexpr uint64_t kIsdSizes[] = {564220, 714612};
constexpr int kNoMean = 255000;
constexpr int kNoMaximum = 300000;

std::string Text(const char* s) { return s ? std::string(s) : std::string(); }

// Only a file the platform layer trusts counts: anyone may write to the folder it stands in.
bool IsdProfileWaiting() {
    uint64_t size = 0;
    if (!platform::FixedFileTrusted(platform::IsdProfilePath(), size)) return false;
    for (uint64_t known : kIsdSizes)
        if (size == known) return true;
    return false;
}

// The reference profile's forward table must take the chart's channels: four for CMYK, three (or a
// matrix/TRC set) for RGB, six or seven for multi-channel charts.
bool TakesChannels(const CProfil& profile, int channels) {
    if (!profile.SlotHolds(0)) return false;
    const LutSlot& lut = profile.m_Lut[0];
    if (channels == 3 && lut.type == "MATR") return true;
    return lut.inputChannels == channels;
}

void Put(int* out, int value) {
    if (out) *out = value;
}

}  // namespace

void CIterativtoolDlg::SimulateReference() {
    if (m_RefName == kNoProfileSelected || m_RefName.empty()) return;
    const int n = m_MeasIT8 ? m_MeasIT8->PatchCount() : 0;
    if (n < 1) return;
    const It8Kind kind = ProbeIt8Kind(*m_MeasIT8, kScanProbePatch);
    const int channels = ComparedChannels(kind);
    if (channels == 0 || !TakesChannels(*m_Refprof, channels)) return;
    const double scale = kind.device == It8Kind::kRgb ? 1.0 : kPercentToDevice;

    std::vector<PatchRecord> records(static_cast<std::size_t>(n));
    for (int i = 0; i < n; ++i) {
        const DeviceKey device = PatchDevice(*m_MeasIT8, kind, i);
        // Twenty entries: the multi-colourant evaluation reads them all.
        double values[CProfil::kEvalSize] = {};
        for (int c = 0; c < channels; ++c) values[c] = device[static_cast<std::size_t>(c)] * scale;
        if (kind.device == It8Kind::kCmyk)
            CmykToLab(*m_Refprof, values);
        else if (kind.device == It8Kind::kRgb)
            RgbToLab(*m_Refprof, values);
        else
            MultiToLab(*m_Refprof, values);

        PatchRecord& record = records[static_cast<std::size_t>(i)];
        record.kind = static_cast<uint32_t>(channels);
        record.sampleNumber = static_cast<uint32_t>(i + 1);
        for (int c = 0; c < channels; ++c) record.device[c] = std::trunc(device[static_cast<std::size_t>(c)] + 0.5);
        SetRecordColour(record, Lab{values[0] / kLightnessScale, values[1], values[2]});
    }

    const std::string name = m_RefName + kSimulatedSuffix;
    m_MeasIT8->WriteIt8(name, records, n, 0, 0, 0);
    m_ReferenceIT8Name = name;
    m_ReferenceIT8 = std::make_unique<Measured_IT8>();
    m_ReferenceIT8->ReadIt8(name);
    m_RefWhite = ScanIt8ForWhitePoint(*m_ReferenceIT8);
}

int Analyse4(CIterativtoolDlg& tool, const char* paperProfile, const char* refProfile, const char* referenceIT8,
             const char* measIT8, int* out1, int* out2, int* out3, int* out4) {
    const std::string meas = Text(measIT8);
    if (meas.empty()) return 0;
    // The measurement file itself is replaced by its copy through the ISD profile.
    if (IsdProfileWaiting()) Analyse2(tool, platform::IsdProfilePath(), measIT8, measIT8, out1, out2);

    const std::string reference = Text(referenceIT8);
    tool.m_RefName = Text(refProfile);
    tool.m_PaperName = Text(paperProfile);
    tool.m_ReferenceIT8Name = reference;
    tool.m_MeasIT8Name = meas;
    tool.m_MeasIT8 = std::make_unique<Measured_IT8>();
    tool.m_MeasIT8->ReadIt8(meas);
    tool.m_Paperprof->Release();
    tool.LoadPaperProfile(true);
    tool.m_Refprof->Release();
    tool.LoadRefProfile();
    tool.m_MeasWhite = tool.ScanIt8ForWhitePoint(*tool.m_MeasIT8);

    tool.m_ReferenceIT8 = std::make_unique<Measured_IT8>();
    if (!reference.empty()) {
        tool.m_ReferenceIT8->ReadIt8(reference);
        tool.m_RefWhite = tool.ScanIt8ForWhitePoint(*tool.m_ReferenceIT8);
    } else {
        // Without a simulation there is nothing to compare with: an earlier call's reference is
        // not taken for this proof's.
        tool.m_RefWhite = tool.m_Refprof->HoldsTables() ? tool.m_Refprof->WhiteLab(0) : Lab{};
        tool.SimulateReference();
    }

    const AnalysisFigures figures = tool.MergedAnalysis();
    Put(out1, figures.differences ? ToHostInt(figures.mean) : kNoMean);
    Put(out2, figures.differences ? ToHostInt(figures.maximum) : kNoMaximum);
    Put(out3, ToHostInt(figures.white));
    Put(out4, figures.differences ? ToHostInt(figures.gamut) : 0);
    tool.m_Paperprof->Release();
    tool.m_Refprof->Release();
    return 0;
}

}  // namespace vantrel
