// optimize4: a calibration run's correction of a device link, written back in place.
#include "optimise/optimize4.h"

#include <string>

#include "interface/tool_object.h"

namespace vantrel {
namespace {

constexpr int kOut1 = 255000;
constexpr int kOut2 = 300000;

std::string Text(const char* s) { return s ? std::string(s) : std::string(); }

// Words the host's buffer takes for a three-input table of g points: head, values, size.
std::size_t ExportWords(const CProfil& link) {
    const std::size_t g = static_cast<std::size_t>(link.m_Lut[1].gridPoints);
    return 13 + 3 * g * g * g;
}

}  // namespace

int Optimize4(CIterativtoolDlg& tool, const char* outprof3CC, int* out1, int* out2, unsigned short* table,
              const char* paperProfile, int option) {
    const std::string link = Text(outprof3CC);
    if (link.empty()) return kOptimize4BadArgument;
    // The link (and a model read from it) carries only its forward table, which serves both ways.
    tool.m_CorrectOutprof = 1;
    tool.m_AbstractOutprof = 1;
    tool.m_OutprofName = link;
    tool.m_Outprof->Release();
    tool.LoadOutprof();
    const std::string paper = Text(paperProfile);
    tool.m_PaperName = paper.empty() ? link : paper;
    tool.m_Paperprof->Release();
    tool.LoadPaperProfile(false);
    if (paper.empty()) FillModelFromMeasurement(tool);

    int result = kOptimize4NotLoaded;
    if (tool.m_Outprof->SlotHolds(1) && tool.m_Outprof->m_Lut[1].type != "MATR") {
        const int corrected = OptimizeLink(tool, option);
        // The table goes back into the link in place (a copy of the file onto itself would change
        // nothing), and into the host's buffer where it takes the three-input layout.
        const bool written = tool.m_Outprof->ExportClut3(link, table, table ? ExportWords(*tool.m_Outprof) : 0);
        result = !written ? kOptimize4NotWritten : corrected == kOptimize4OutOfMemory ? kOptimize4OutOfMemory : 0;
        if (out1) *out1 = kOut1;
        if (out2) *out2 = kOut2;
    }
    tool.m_Paperprof->Release();
    tool.m_Outprof->Release();
    return result;
}

}  // namespace vantrel
