// analyse3: a print's measurement against its reference, or against itself; in profiling mode the
// device link it was printed through is corrected on the way.
#include "analysis/analyse3.h"

#include <climits>
#include <cstring>
#include <memory>
#include <string>

#include "interface/host_number.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {

// Results of an analysis that stopped before it had a mean and a maximum.
constexpr int kNoMean = 255000;
constexpr int kNoMaximum = 300000;

std::string Text(const char* s) { return s ? std::string(s) : std::string(); }

void Give(const AnalysisFigures& figures, int* out1, int* out2) {
    if (out1) *out1 = figures.differences ? ToHostInt(figures.mean) : kNoMean;
    if (out2) *out2 = figures.differences ? ToHostInt(figures.maximum) : kNoMaximum;
}

// The measurement slot before a new file is read: in a calibration run the last measurement
// stays as the previous one to compare with.
void RenewMeasurement(CIterativtoolDlg& tool) {
    if (tool.m_MeasIT8 && tool.m_MeasIT8->PatchCount() > 1 && tool.m_CalRun > 0)
        tool.m_PrevMeasIT8 = std::move(tool.m_MeasIT8);
    tool.m_MeasIT8 = std::make_unique<Measured_IT8>();
}

}  // namespace

int CalibrationRun(const char* name) {
    const char* at = name ? std::strstr(name, "_cal") : nullptr;
    if (!at) return -1;
    long run = 0;
    for (const char* p = at + 4; *p >= '0' && *p <= '9'; ++p) {
        run = run * 10 + (*p - '0');
        if (run > INT_MAX) return INT_MAX;
    }
    return static_cast<int>(run);
}

int Analyse3(CIterativtoolDlg& tool, const char* paperProfile, const char* outprof3CC, const char* referenceIT8,
             const char* measIT8, int* out1, int* out2) {
    const std::string outprof = Text(outprof3CC), paper = Text(paperProfile), reference = Text(referenceIT8),
                      meas = Text(measIT8);
    Give(AnalysisFigures{}, out1, out2);

    if (outprof.empty() && !meas.empty()) {
        tool.m_MeasIT8Name = meas;
        tool.m_MeasIT8 = std::make_unique<Measured_IT8>();
        tool.m_MeasIT8->ReadIt8(meas);
        Give(tool.RepeatabilityAnalysis(*tool.m_MeasIT8), out1, out2);
        tool.m_Paperprof->Release();
        tool.m_Outprof->Release();
        return 0;
    }

    tool.m_OutprofName = outprof;
    tool.m_AbstractOutprof = 1;
    tool.m_CorrectOutprof = 1;
    tool.m_Outprof->Release();
    tool.LoadOutprof();
    if (!paper.empty()) {
        tool.m_PaperName = paper;
        tool.m_Paperprof->Release();
        tool.LoadPaperProfile(false);
    }
    tool.m_ReferenceIT8Name = reference;
    tool.m_MeasIT8Name = meas;
    const int run = CalibrationRun(measIT8);
    if (run >= 0) tool.m_CalRun = run;

    RenewMeasurement(tool);
    tool.m_MeasIT8->ReadIt8(meas);
    tool.m_MeasWhite = tool.ScanIt8ForWhitePoint(*tool.m_MeasIT8);
    if (!reference.empty()) {
        tool.m_ReferenceIT8 = std::make_unique<Measured_IT8>();
        tool.m_ReferenceIT8->ReadIt8(reference);
        tool.m_RefWhite = tool.ScanIt8ForWhitePoint(*tool.m_ReferenceIT8);
    }

    AnalysisFigures figures = tool.MergedAnalysis();
    if (tool.m_RecalcFlag > 0 && tool.m_CalRun > 0) {
        // Nodes went back to the previous run's values: measure the merged file against the
        // reference once more and keep the corrected link.
        tool.m_RecalcFlag = 0;
        tool.m_MeasWhite = tool.ScanIt8ForWhitePoint(*tool.m_MeasIT8);
        figures = tool.MergedAnalysis();
        tool.m_Outprof->WriteClut(1, tool.m_OutprofName);
    }
    Give(figures, out1, out2);
    tool.m_Paperprof->Release();
    tool.m_Outprof->Release();
    return 0;
}

}  // namespace vantrel
