// optimize2: the proofer's output profile corrected from a measured proof and written as a copy.
#include "interface/tool_object.h"
#include "optimise/measured_corrections.h"
#include "optimise/measured_patches.h"
#include "support/cfile.h"

namespace vantrel {
namespace {

constexpr int kFixedOut1 = 255000;
constexpr int kFixedOut2 = 300000;

}  // namespace

int MeasuredResult(const CIterativtoolDlg& tool, int corrected) {
    if (corrected == CIterativtoolDlg::kOptimiseOutOfMemory) return kMeasuredOutOfMemory;
    if (PairedPatchCount(tool) < 0 || ProbePatchColumns(tool).device == It8Kind::kNoDevice)
        return kMeasuredNothingToCorrect;
    return 0;
}

int Optimize2(CIterativtoolDlg& tool, const char* outProfile, int* out1, int* out2, int option) {
    tool.m_OptimizeOption = option;
    if (!outProfile || !*outProfile) return kMeasuredBadArgument;
    CProfil& paper = *tool.m_Paperprof;
    paper.Release();
    tool.m_Refprof->Release();
    tool.LoadPaperProfile(true);
    tool.LoadRefProfile();
    if (!paper.HoldsTables() || !paper.SlotHolds(1)) {
        paper.Release();
        tool.m_Refprof->Release();
        return kMeasuredNotLoaded;
    }

    tool.CorrectPaperWhite();
    int status = MeasuredResult(tool, tool.OptimizeFromMeasurement());

    const std::string out = outProfile;
    // Correcting a profile in place needs no copy (and copying a file onto itself would empty it).
    bool written = out == tool.m_PaperName || CopyWholeFile(tool.m_PaperName, out);
    if (written && option >= 0 && tool.m_AbstractOutprof == 0 && tool.m_WriteExtra)
        written = paper.WriteWhitePoint(1, out);
    written = written && paper.WriteClut(1, out);
    paper.Release();
    tool.m_Refprof->Release();
    if (!written) return kMeasuredNotWritten;
    tool.m_PaperName = out;
    if (out1) *out1 = kFixedOut1;
    if (out2) *out2 = kFixedOut2;
    return status;
}

}  // namespace vantrel
