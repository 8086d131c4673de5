// optimize3: the 3CC correction profile in front of the proofer corrected from a measured proof.
#include "interface/tool_object.h"
#include "optimise/measured_corrections.h"

namespace vantrel {
namespace {

constexpr int kFixedOut1 = 255000;
constexpr int kFixedOut2 = 300000;

}  // namespace

int Optimize3(CIterativtoolDlg& tool, const char* outprof3CC, int* out1, int* out2, int option) {
    tool.m_OptimizeOption = option;
    if (!outprof3CC || !*outprof3CC) return kMeasuredBadArgument;
    tool.m_OutprofName = outprof3CC;
    CProfil& table = *tool.m_Outprof;
    tool.m_Paperprof->Release();
    tool.m_Refprof->Release();
    table.Release();
    // The in-gamut tests need the paper's gamut; a fresh tool object has none yet.
    tool.LoadPaperProfile(!tool.m_GamutComputed);
    tool.LoadRefProfile();
    tool.LoadOutprof();

    int status = kMeasuredNotLoaded;
    if (table.HoldsTables() && table.SlotHolds(1)) {
        tool.CorrectOutprofWhite();
        status = MeasuredResult(tool, tool.OptimizeOutprof());
        if (!table.WriteClut(1, tool.m_OutprofName)) {
            status = kMeasuredNotWritten;
        } else {
            if (out1) *out1 = kFixedOut1;
            if (out2) *out2 = kFixedOut2;
        }
    }
    tool.m_Paperprof->Release();
    tool.m_Refprof->Release();
    table.Release();
    return status;
}

}  // namespace vantrel
