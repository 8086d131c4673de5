// optimize1: an output profile's PCS-to-device table made to invert its device-to-PCS table more
// closely, each correction kept only when it measurably helps.
#include <new>
#include <string>
#include <vector>

#include "eval/gamut_record.h"
#include "interface/host_number.h"
#include "interface/tool_object.h"
#include "optimise/optimize1.h"

namespace vantrel {
namespace {

// A step may let the worst colour get this much worse (ΔE) if the mean improves.
constexpr double kMaxWorsening = 0.25;

// Takes a fresh copy of the slot-1 table; false when the memory cannot be had.
bool Backup(CIterativtoolDlg& tool) {
    try {
        tool.m_SavedTable = tool.m_Paperprof->SnapshotClut(1);
    } catch (const std::bad_alloc&) {
        return false;
    }
    return true;
}

void DropBackup(CIterativtoolDlg& tool) { std::vector<uint16_t>().swap(tool.m_SavedTable); }

}  // namespace

int CIterativtoolDlg::OptimizeOutputProfile() {
    double keptMean = 0.0, keptMax = 0.0;
    // Without a first measurement there is nothing to compare with.
    if (AnalyzeOutputProfile(keptMean, keptMax) != kOptimiseDone) return kOptimiseFailed;
    m_Score1 = keptMean;
    m_Score2 = keptMax;
    // The gamut as the relative tables see it, now that the analysis cleared the media-white flags.
    m_Gamut = BuildGamutRecord(*m_Paperprof);
    m_GamutComputed = true;

    int result = kOptimiseDone;
    for (int step = 1; step <= 2; ++step) {
        if (!Backup(*this)) {
            result = kOptimiseOutOfMemory;
            break;
        }
        const int done = step == 1 ? OptimizeStep1() : OptimizeStep2();
        double mean = 0.0, max = 0.0;
        const int measured = done == kOptimiseOutOfMemory ? done : AnalyzeOutputProfile(mean, max);
        if (measured == kOptimiseDone && mean < keptMean && max <= keptMax + kMaxWorsening) {
            keptMean = mean;
            keptMax = max;
        } else {
            m_Paperprof->RestoreClut(1, m_SavedTable);
            if (measured != kOptimiseDone) result = kOptimiseOutOfMemory;
        }
        m_Score1 = keptMean;
        m_Score2 = keptMax;
        if (result != kOptimiseDone) break;
    }
    DropBackup(*this);
    return result;
}

int Optimize1(CIterativtoolDlg& tool, const char* paperProfile, int* out1, int* out2) {
    if (!paperProfile || !*paperProfile) return kOptimize1BadArgument;
    tool.m_PaperName = paperProfile;
    CProfil& paper = *tool.m_Paperprof;
    paper.Release();
    tool.LoadPaperProfile(true);

    const int result = paper.SlotHolds(0) && paper.SlotHolds(1) ? tool.OptimizeOutputProfile()
                                                                : CIterativtoolDlg::kOptimiseFailed;
    int status = 0;
    if (result == CIterativtoolDlg::kOptimiseFailed) {
        status = kOptimize1NotLoaded;
    } else {
        if (out1) *out1 = ToHostInt(tool.m_Score1);
        if (out2) *out2 = ToHostInt(tool.m_Score2);
        if (!paper.WriteClut(1, tool.m_PaperName)) {
            status = kOptimize1NotWritten;
        } else if (result == CIterativtoolDlg::kOptimiseOutOfMemory) {
            status = kOptimize1OutOfMemory;
        }
    }
    paper.Release();
    return status;
}

}  // namespace vantrel
