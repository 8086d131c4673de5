#include "interface/tool_object.h"

#include <new>

#include "resources/identity_profiles.h"
#include "support/cfile.h"
#include "support/platform.h"

namespace vantrel {
namespace {

// Each slot is created in its own guarded step: a slot that cannot be created stays
// empty and the others are still made.
template <typename T>
std::unique_ptr<T> CreateSlot() {
    try {
        return std::make_unique<T>();
    } catch (const std::bad_alloc&) {
        return nullptr;
    }
}

}  // namespace

CIterativtoolDlg::CIterativtoolDlg(const char* dir) {
    m_Outprof = CreateSlot<CProfil>();
    m_ISDprof = CreateSlot<CProfil>();
    m_Refprof = CreateSlot<CProfil>();
    m_Paperprof = CreateSlot<CProfil>();
    m_PaperprofPerceptual = CreateSlot<CProfil>();
    m_ReferenceIT8 = CreateSlot<Measured_IT8>();
    m_MeasIT8 = CreateSlot<Measured_IT8>();

    if (dir && *dir) {
        m_WorkDir = dir;
        WriteEmbeddedProfiles();
    }
}

CIterativtoolDlg::~CIterativtoolDlg() {
    m_Outprof.reset();
    m_ISDprof.reset();
    m_Paperprof.reset();
    m_PaperprofPerceptual.reset();
    m_Refprof.reset();
    m_ReferenceIT8.reset();
    m_MeasIT8.reset();
    m_PrevMeasIT8.reset();
}

bool CIterativtoolDlg::SlotsCreated() const {
    return m_Outprof && m_ISDprof && m_Refprof && m_Paperprof && m_PaperprofPerceptual && m_ReferenceIT8 &&
           m_MeasIT8;
}

void CIterativtoolDlg::WriteEmbeddedProfiles() {
    platform::ModuleResources module;
    if (!module.IsOpen()) return;
    for (const IdentityProfileInfo& info : IdentityProfiles()) {
        const std::vector<uint8_t> bytes = EmbeddedIdentityProfile(module, info.id);
        if (bytes.empty()) continue;
        CFile file(m_WorkDir + info.fileName, CFile::kBinary | CFile::kWrite);
        if (file.IsOpen()) file.Write(bytes.data(), bytes.size());
    }
}

int CIterativtoolDlg::Progress(const char* text, int step, int steps) const {
    return m_Progress ? m_Progress(text, step, steps) : 0;
}

}  // namespace vantrel
