// The fourteen functions a host calls. Each checks the handle, then hands over to
// the tool object and its workers.
#define VANTREL_BUILDING 1
#include "vantrel.h"

#include <memory>
#include <new>

#include "interface/parameter_file.h"
#include "interface/tool_object.h"
#include "support/platform.h"

using vantrel::CIterativtoolDlg;

namespace {

// Result of an export whose worker the library does not have yet.
constexpr int kNotAvailable = -1;
constexpr int kNullHandle = 1;

CIterativtoolDlg* Tool(void* handle) { return static_cast<CIterativtoolDlg*>(handle); }

}  // namespace

extern "C" {

VANTREL_API int VANTREL_CALL dllInit(ProgressCallback progress, void** handleOut, const char* dir) {
    if (!handleOut) return -1;
    *handleOut = nullptr;
    std::unique_ptr<CIterativtoolDlg> tool;
    try {
        tool = std::make_unique<CIterativtoolDlg>(dir);
    } catch (const std::bad_alloc&) {
        return -1;
    }
    // The library works only with all its slots; without them the host gets no handle.
    if (!tool->SlotsCreated()) return -1;
    for (auto* profile : {tool->m_Outprof.get(), tool->m_ISDprof.get(), tool->m_Refprof.get(),
                          tool->m_Paperprof.get(), tool->m_PaperprofPerceptual.get()})
        profile->MarkReleased();
    tool->m_SavedTable.clear();
    tool->m_Progress = progress;
    vantrel::ReadParameterFile(vantrel::platform::ParameterFilePath(), tool->m_Params.data(),
                               CIterativtoolDlg::kParamCount);
    *handleOut = tool.release();
    return 0;
}

VANTREL_API int VANTREL_CALL dllFree(void* handle) {
    delete Tool(handle);
    return 0;
}

VANTREL_API int VANTREL_CALL analyse1(void* handle, const char*, int*, int*) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL analyse2(void* handle, const char*, const char*, const char*, int*, int*) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL analyse3(void* handle, const char*, const char*, const char*, const char*, int*,
                                      int*) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL analyse4(void* handle, const char*, const char*, const char*, const char*, int*, int*,
                                      int*, int*) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL optimize1(void* handle, const char*, int*, int*) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL optimize2(void* handle, const char*, int*, int*, int) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL optimize3(void* handle, const char*, int*, int*, int) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL optimize4(void* handle, const char*, int*, int*, unsigned short*, const char*, int) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL mergeMCHintoCMYK(void* handle, const char*, const char*, const char*) {
    if (!handle) return kNullHandle;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL Cmyk2Lab_Double(void* handle, const char* profile, int, const int*, int, int*, int,
                                             int*) {
    if (!handle || !profile || !*profile) return -1;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL RGB2Lab_Double(void* handle, const char* profile, int, const int*, int, int*, int,
                                            int*) {
    if (!handle || !profile || !*profile) return -1;
    return kNotAvailable;
}

VANTREL_API int VANTREL_CALL Cmykrgb2Lab_Double(void* handle, const char* profile, int, const int*, int, int*,
                                                int, int*) {
    if (!handle || !profile || !*profile) return -1;
    return kNotAvailable;
}

}  // extern "C"
