// Folding a multi-colourant separation into a CMYK profile: mergeMCHintoCMYK.
#include "optimise/merge_into_cmyk.h"

#include <string>

#include "colour/colour_values.h"
#include "eval/forward.h"
#include "eval/inverse.h"
#include "eval/table_nodes.h"
#include "interface/tool_object.h"
#include "optimise/merge_extra_channels.h"
#include "support/cfile.h"

namespace vantrel {
namespace {

constexpr int kCmykChannels = 4;
// Colour records: node indices from field 4 on (three for the Lab side, four for the device
// side), device values or scaled Lab in fields 0..3.
constexpr int kIndexField = 4;

// The folded reference separation of a scaled Lab: channels 0..3 of `device` on 0..255.
void FoldedSeparation(CProfil& reference, const double* lab, double* device) {
    double s[CProfil::kEvalSize] = {lab[0], lab[1], lab[2]};
    LabToMulti(reference, s);
    MergeExtraChannels(s);
    for (int c = 0; c < kCmykChannels; ++c) device[c] = s[c];
}

bool HoldsCmykPair(const CProfil& p) {
    return p.SlotHolds(0) && p.SlotHolds(1) && p.m_Lut[0].inputChannels == kCmykChannels &&
           p.m_Lut[1].inputChannels == 3 && p.m_Lut[1].outputChannels == kCmykChannels;
}

// Every node of the PCS-to-device table: the CMYK it holds, the colour that prints, and the
// reference's folded separation of that colour in its place (written raw, as the node read the
// curves).
void MergeSeparationTable(CProfil& p, CProfil& reference) {
    const int n = p.m_Lut[1].gridPoints;
    double record[CProfil::kEvalSize] = {};
    for (int i = 0; i < n; ++i)
        for (int j = 0; j < n; ++j)
            for (int k = 0; k < n; ++k) {
                record[kIndexField] = i;
                record[kIndexField + 1] = j;
                record[kIndexField + 2] = k;
                ReadNodeDevice(p, record, true);
                double lab[CProfil::kEvalSize] = {record[0], record[1], record[2], record[3]};
                CmykToLab(p, lab);
                FoldedSeparation(reference, lab, record);
                WriteNodeDevice(p, record, false);
            }
}

// Every node of the device-to-PCS table: the colour it stands for, the reference's folded
// separation of it, and the colour that separation prints through the table as it stands now
// (nodes already rewritten take part).
void MergeColourTable(CProfil& p, CProfil& reference) {
    const int n = p.m_Lut[0].gridPoints;
    double record[CProfil::kEvalSize] = {};
    for (int i = 0; i < n; ++i)
        for (int j = 0; j < n; ++j)
            for (int k = 0; k < n; ++k)
                for (int l = 0; l < n; ++l) {
                    record[kIndexField] = i;
                    record[kIndexField + 1] = j;
                    record[kIndexField + 2] = k;
                    record[kIndexField + 3] = l;
                    ReadNodeLab(p, record, 0, true);
                    double cmyk[CProfil::kEvalSize] = {};
                    FoldedSeparation(reference, record, cmyk);
                    CmykToLab(p, cmyk);
                    for (int c = 0; c < 3; ++c) record[c] = cmyk[c];
                    WriteNodeLab(p, record, 0);
                }
}

void MergePair(CProfil& p, CProfil& reference) {
    MergeSeparationTable(p, reference);
    MergeColourTable(p, reference);
}

std::string Text(const char* s) { return s ? std::string(s) : std::string(); }

}  // namespace

bool MergeIntoCmyk(CIterativtoolDlg& tool) {
    CProfil& paper = *tool.m_Paperprof;
    CProfil& perceptual = *tool.m_PaperprofPerceptual;
    CProfil& reference = *tool.m_Refprof;
    // Without the reference's separation, or a whole CMYK profile to rebuild, every node would be
    // replaced by nothing: refuse before anything changes.
    if (!reference.SlotHolds(1) || !HoldsCmykPair(paper)) return false;
    paper.m_UseMediaWhite[0] = paper.m_UseMediaWhite[1] = 0;
    reference.m_UseMediaWhite[0] = reference.m_UseMediaWhite[1] = 0;
    MergePair(paper, reference);
    tool.m_UseIntent0 = 1;
    if (HoldsCmykPair(perceptual)) MergePair(perceptual, reference);
    return true;
}

int MergeMchIntoCmyk(CIterativtoolDlg& tool, const char* refProfile, const char* paperProfile,
                     const char* outProfile) {
    const std::string out = Text(outProfile);
    tool.m_RefName = Text(refProfile);
    tool.m_PaperName = Text(paperProfile);
    CProfil* const slots[] = {tool.m_Refprof.get(), tool.m_Paperprof.get(), tool.m_PaperprofPerceptual.get()};
    for (CProfil* p : slots) p->Release();
    tool.LoadRefProfile();
    tool.LoadPaperProfile(false);
    tool.LoadPaperProfilePerceptual();

    bool written = false;
    if (!out.empty() && MergeIntoCmyk(tool) && CopyWholeFile(tool.m_PaperName, out)) {
        // Each table goes back into the tag it was loaded from; tags that share one table get the
        // last one written, the perceptual.
        written = tool.m_Paperprof->WriteClut(0, out) && tool.m_Paperprof->WriteClut(1, out);
        if (tool.m_PaperprofPerceptual->SlotHolds(0)) written = tool.m_PaperprofPerceptual->WriteClut(0, out) && written;
        if (tool.m_PaperprofPerceptual->SlotHolds(1)) written = tool.m_PaperprofPerceptual->WriteClut(1, out) && written;
    }
    for (CProfil* p : slots) p->Release();
    return written ? 0 : -1;
}

}  // namespace vantrel
