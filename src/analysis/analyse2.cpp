// analyse2: a measurement sent through the Lab-to-Lab table of an ISD profile.
#include "analysis/analyse2.h"

#include <cmath>
#include <memory>
#include <string>
#include <vector>

#include "analysis/it8_kind.h"
#include "eval/forward.h"
#include "interface/tool_object.h"
#include "it8/patch_record.h"
#include "support/cfile.h"

namespace vantrel {
namespace {

constexpr const char* kIsdSuffix = "isd.it8";
constexpr int kOut1 = 255000;
constexpr int kOut2 = 300000;

std::string Text(const char* s) { return s ? std::string(s) : std::string(); }

// Whole percent: add 0.5 and truncate toward zero.
double WholePercent(double value) { return std::trunc(value + 0.5); }

// The ISD profile's direction-1 table is used as Lab to Lab: it must be there and take three inputs.
bool HoldsLabTable(const CProfil& profile) {
    return profile.SlotHolds(1) && profile.m_Lut[1].inputChannels == 3 && profile.m_Lut[1].outputChannels >= 3;
}

}  // namespace

void CIterativtoolDlg::IsdAnalysis() {
    if (m_ISDName == kNoIsdSelected || m_ISDName.empty() || !m_ISDMode) return;
    if (!m_MeasIT8 || !m_ISDprof || !HoldsLabTable(*m_ISDprof)) return;
    const int n = m_MeasIT8->PatchCount();
    if (n < 1) return;

    std::vector<PatchRecord> records(static_cast<std::size_t>(n));
    records[0].kind = 4;
    const bool fromXyz = It8ColourFromXyz(*m_MeasIT8, kScanProbePatch);
    for (int i = 0; i < n; ++i) {
        PatchRecord& record = records[static_cast<std::size_t>(i)];
        const Lab measured = PatchLab(*m_MeasIT8, i, fromXyz);
        double values[CProfil::kEvalSize] = {measured.L * kLightnessScale, measured.a, measured.b};
        LabThroughTable(*m_ISDprof, values, 1);
        const Lab converted{values[0] / kLightnessScale, values[1], values[2]};

        record.sampleNumber = static_cast<uint32_t>(i + 1);
        for (int c = 0; c < 4; ++c) record.device[c] = WholePercent(m_MeasIT8->GetCmyk(i, c));
        SetRecordColour(record, converted);
    }

    const std::string outName = m_MeasIT8Name + kIsdSuffix;
    m_MeasIT8->WriteIt8(outName, records, n, 0, 0, 0);
    m_MeasIT8Name = outName;
    m_MeasIT8 = std::make_unique<Measured_IT8>();
    m_MeasIT8->ReadIt8(outName);
    m_MeasWhite = ScanIt8ForWhitePoint(*m_MeasIT8);
}

int Analyse2(CIterativtoolDlg& tool, const char* isdProfile, const char* outIT8, const char* measIT8, int* out1,
             int* out2) {
    tool.m_ISDMode = 1;
    tool.m_ISDName = Text(isdProfile);
    // The tables of the previous call go first, so that a profile that fails to load cannot leave
    // them in use; the new ones stay loaded after the call.
    if (tool.m_ISDprof) tool.m_ISDprof->Release();
    tool.LoadISDProfile();
    tool.m_ReferenceIT8Name = Text(outIT8);
    tool.m_MeasIT8Name = Text(measIT8);
    tool.m_MeasIT8 = std::make_unique<Measured_IT8>();
    tool.m_MeasIT8->ReadIt8(tool.m_MeasIT8Name);
    tool.IsdAnalysis();
    // A source that cannot be read is not copied: outIT8 stays as it was.
    if (outIT8) CopyWholeFile(tool.m_MeasIT8Name, outIT8);
    if (out1) *out1 = kOut1;
    if (out2) *out2 = kOut2;
    return 0;
}

}  // namespace vantrel
