#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {

// The steps every loader shares: both directions' directories and tables, with the media
// white in use on both sides.
struct LoadPlan {
    const char* tag0;
    const char* tag1;
};

bool Skips(const std::string& name, const char* defaultLabel) { return name.empty() || name == defaultLabel; }

}  // namespace

void CIterativtoolDlg::LoadOutprof() {
    if (!m_Outprof || Skips(m_OutprofName, kNo3ccSelected)) return;
    // An abstract 3CC profile or a device link carries only its forward table; it serves both ways.
    const LoadPlan plan = m_AbstractOutprof == 1 ? LoadPlan{"A2B0", "A2B0"} : LoadPlan{"A2B1", "B2A1"};
    Progress("m_Outprof", 0, 4);
    m_Outprof->ReadTagTable(0, m_OutprofName);
    m_Outprof->m_UseMediaWhite[0] = 1;
    m_Outprof->LoadLut(0, plan.tag0, m_OutprofName);
    m_Outprof->ReadTagTable(1, m_OutprofName);
    m_Outprof->m_UseMediaWhite[1] = 1;
    m_Outprof->LoadLut(1, plan.tag1, m_OutprofName);
    Progress("Finished ...", 1, 1);
}

void CIterativtoolDlg::LoadISDProfile() {
    if (!m_ISDprof || Skips(m_ISDName, kNoIsdSelected)) return;
    const LoadPlan plan = m_UseIntent0 ? LoadPlan{"A2B0", "B2A0"} : LoadPlan{"A2B1", "B2A1"};
    Progress("load ISD", 0, 4);
    m_ISDprof->ReadTagTable(0, m_ISDName);
    m_ISDprof->m_UseMediaWhite[0] = 1;
    m_ISDprof->LoadLut(0, plan.tag0, m_ISDName);
    m_ISDprof->ReadTagTable(1, m_ISDName);
    m_ISDprof->m_UseMediaWhite[1] = 1;
    m_ISDprof->LoadLut(1, plan.tag1, m_ISDName);
    Progress("Finished ...", 1, 1);
}

void CIterativtoolDlg::LoadRefProfile() {
    if (!m_Refprof || Skips(m_RefName, kNoProfileSelected)) return;
    Progress("load Ref", 0, 4);
    m_Refprof->ReadTagTable(0, m_RefName);
    m_Refprof->m_UseMediaWhite[0] = 1;
    m_Refprof->LoadLut(0, "A2B1", m_RefName);
    m_Refprof->ReadTagTable(1, m_RefName);
    m_Refprof->m_UseMediaWhite[1] = 1;
    m_Refprof->LoadLut(1, "B2A1", m_RefName);
    Progress("Finished ...", 1, 1);
}

void CIterativtoolDlg::LoadPaperProfile(bool computeGamut) {
    if (!m_Paperprof || Skips(m_PaperName, kNoProfileSelected)) return;
    const LoadPlan plan = m_AbstractOutprof == 1 ? LoadPlan{"A2B0", "A2B0"}
                          : m_UseIntent0         ? LoadPlan{"A2B0", "B2A0"}
                                                 : LoadPlan{"A2B1", "B2A1"};
    CProfil& paper = *m_Paperprof;
    Progress("load paper profile", 0, 4);
    paper.ReadTagTable(0, m_PaperName);
    paper.m_UseMediaWhite[0] = 1;
    paper.LoadLut(0, plan.tag0, m_PaperName);
    Progress("load paper profile", 1, 4);
    paper.ReadTagTable(1, m_PaperName);
    Progress("load paper profile", 2, 4);
    paper.m_UseMediaWhite[1] = 1;
    paper.LoadLut(1, plan.tag1, m_PaperName);
    m_PaperWhite = paper.WhiteLab(0);
    if (computeGamut) {
        m_Gamut = BuildGamutRecord(paper);
        Progress("load paper profile", 3, 4);
    }
    // A record from an earlier call stays in use when the gamut is not rebuilt.
    m_Gamut.valid = 1;
    Progress("Finished ...", 4, 4);
}

void CIterativtoolDlg::LoadPaperProfilePerceptual() {
    if (!m_PaperprofPerceptual || Skips(m_PaperName, kNoProfileSelected)) return;
    CProfil& copy = *m_PaperprofPerceptual;
    Progress("load copies of paper profile", 0, 5);
    copy.ReadTagTable(0, m_PaperName);
    copy.m_UseMediaWhite[0] = 1;
    copy.LoadLut(0, "A2B0", m_PaperName);
    Progress("load copies of paper profile", 3, 5);
    copy.ReadTagTable(1, m_PaperName);
    Progress("load copies of paper profile", 4, 5);
    copy.m_UseMediaWhite[1] = 1;
    copy.LoadLut(1, m_AbstractOutprof == 1 ? "A2B0" : "B2A0", m_PaperName);
    Progress("Finished ...", 5, 5);
}

XYZ CIterativtoolDlg::LabToXYZ(double L, double a, double b) const {
    for (const CProfil* profile : {m_Refprof.get(), m_Paperprof.get(), m_Outprof.get(), m_ISDprof.get()}) {
        if (profile && profile->HoldsTables()) {
            const XYZ xyz = profile->LabToXYZ(L, a, b);
            return {xyz.X * 100, xyz.Y * 100, xyz.Z * 100};
        }
    }
    // No profile loaded: the same formula against D50.
    static constexpr double kD50[3] = {0.9642, 1.0, 0.8249};
    const XYZ xyz = LabToXYZAgainst({L, a, b}, kD50);
    return {xyz.X * 100, xyz.Y * 100, xyz.Z * 100};
}

}  // namespace vantrel
