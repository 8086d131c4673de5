#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {

struct LoadPlan {
    const char* tag0;  // direction 0, device to PCS
    const char* tag1;  // direction 1, PCS to device
};

bool Skips(const std::string& name, const char* defaultLabel) { return name.empty() || name == defaultLabel; }

// What every loader does: both directions' directories and tables, with the media white in
// use on both sides. `between(k)` runs after the direction-0 table (k = 0) and after the
// direction-1 directory (k = 1), where the paper loaders report progress.
template <typename Between>
void LoadDirections(CProfil& profile, const std::string& name, const LoadPlan& plan, Between between) {
    profile.ReadTagTable(0, name);
    profile.m_UseMediaWhite[0] = 1;
    profile.LoadLut(0, plan.tag0, name);
    between(0);
    profile.ReadTagTable(1, name);
    between(1);
    profile.m_UseMediaWhite[1] = 1;
    profile.LoadLut(1, plan.tag1, name);
}

void LoadDirections(CProfil& profile, const std::string& name, const LoadPlan& plan) {
    LoadDirections(profile, name, plan, [](int) {});
}

}  // namespace

void CIterativtoolDlg::LoadOutprof() {
    if (!m_Outprof || Skips(m_OutprofName, kNo3ccSelected)) return;
    // An abstract 3CC profile or a device link carries only its forward table; it serves both ways.
    const LoadPlan plan = m_AbstractOutprof == 1 ? LoadPlan{"A2B0", "A2B0"} : LoadPlan{"A2B1", "B2A1"};
    Progress("m_Outprof", 0, 4);
    LoadDirections(*m_Outprof, m_OutprofName, plan);
    Progress("Finished ...", 1, 1);
}

void CIterativtoolDlg::LoadISDProfile() {
    if (!m_ISDprof || Skips(m_ISDName, kNoIsdSelected)) return;
    Progress("load ISD", 0, 4);
    LoadDirections(*m_ISDprof, m_ISDName, m_UseIntent0 ? LoadPlan{"A2B0", "B2A0"} : LoadPlan{"A2B1", "B2A1"});
    Progress("Finished ...", 1, 1);
}

void CIterativtoolDlg::LoadRefProfile() {
    if (!m_Refprof || Skips(m_RefName, kNoProfileSelected)) return;
    Progress("load Ref", 0, 4);
    LoadDirections(*m_Refprof, m_RefName, {"A2B1", "B2A1"});
    Progress("Finished ...", 1, 1);
}

void CIterativtoolDlg::LoadPaperProfile(bool computeGamut) {
    if (!m_Paperprof || Skips(m_PaperName, kNoProfileSelected)) return;
    const LoadPlan plan = m_AbstractOutprof == 1 ? LoadPlan{"A2B0", "A2B0"}
                          : m_UseIntent0         ? LoadPlan{"A2B0", "B2A0"}
                                                 : LoadPlan{"A2B1", "B2A1"};
    Progress("load paper profile", 0, 4);
    LoadDirections(*m_Paperprof, m_PaperName, plan, [this](int k) { Progress("load paper profile", k + 1, 4); });
    m_PaperWhite = m_Paperprof->WhiteLab(0);
    if (computeGamut) {
        m_Gamut = BuildGamutRecord(*m_Paperprof);
        m_GamutComputed = HoldsBothTables(*m_Paperprof);
        Progress("load paper profile", 3, 4);
    }
    // A record from an earlier call stays in use when the gamut is not rebuilt.
    m_Gamut.valid = 1;
    Progress("Finished ...", 4, 4);
}

void CIterativtoolDlg::LoadPaperProfilePerceptual() {
    if (!m_PaperprofPerceptual || Skips(m_PaperName, kNoProfileSelected)) return;
    const LoadPlan plan = {"A2B0", m_AbstractOutprof == 1 ? "A2B0" : "B2A0"};
    Progress("load copies of paper profile", 0, 5);
    LoadDirections(*m_PaperprofPerceptual, m_PaperName, plan,
                   [this](int k) { Progress("load copies of paper profile", k + 3, 5); });
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
    const XYZ xyz = LabToXYZAgainst({L, a, b}, kD50White);
    return {xyz.X * 100, xyz.Y * 100, xyz.Z * 100};
}

void CIterativtoolDlg::SetRecordColour(PatchRecord& record, const Lab& lab) const {
    record.lab[0] = lab.L;
    record.lab[1] = lab.a;
    record.lab[2] = lab.b;
    const XYZ xyz = LabToXYZ(lab.L, lab.a, lab.b);
    record.xyz[0] = xyz.X;
    record.xyz[1] = xyz.Y;
    record.xyz[2] = xyz.Z;
}

}  // namespace vantrel
