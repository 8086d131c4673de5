// The fourteen functions a host calls. Each checks the handle, then hands over to
// the tool object and its workers.
#define VANTREL_BUILDING 1
#include "vantrel.h"

#include <memory>
#include <new>

#include "analysis/analyse1_search.h"
#include "analysis/analyse2.h"
#include "analysis/analyse3.h"
#include "analysis/analyse4.h"
#include "interface/device_conversion.h"
#include "interface/host_number.h"
#include "interface/parameter_file.h"
#include "interface/tool_object.h"
#include "optimise/merge_into_cmyk.h"
#include "optimise/optimize4.h"
#include "optimise/measured_corrections.h"
#include "optimise/optimize1.h"
#include "support/platform.h"

using vantrel::CIterativtoolDlg;
using vantrel::DeviceRecord;

namespace {

// Result of an export whose worker the library does not have yet.
constexpr int kNotAvailable = -1;
// Result of an export given a null pointer it needs.
constexpr int kBadArgument = -1;
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
    vantrel::ReadFixedParameterFile(tool->m_Params.data(), CIterativtoolDlg::kParamCount);
    *handleOut = tool.release();
    return 0;
}

VANTREL_API int VANTREL_CALL dllFree(void* handle) {
    delete Tool(handle);
    return 0;
}

VANTREL_API int VANTREL_CALL analyse1(void* handle, const char* paperProfile, int* lab, int* values) {
    if (!handle) return kNullHandle;
    if (!paperProfile || !lab || !values) return kBadArgument;
    CIterativtoolDlg& tool = *Tool(handle);
    const double target[3] = {lab[0] / 1000.0, lab[1] / 1000.0, lab[2] / 1000.0};
    double start[7];
    for (int c = 0; c < 7; ++c) start[c] = values[c] / 1000.0;
    tool.m_PaperName = paperProfile;
    tool.m_Paperprof->Release();
    tool.LoadPaperProfile(false);
    double found[7];
    double deltaE = 1000;
    vantrel::Analyse1Search(*tool.m_Paperprof, target, start, deltaE, true, found);
    for (int c = 0; c < 7; ++c) values[c] = vantrel::ToHostIntTruncated(found[c]);
    tool.m_Paperprof->Release();
    return 0;
}

VANTREL_API int VANTREL_CALL analyse2(void* handle, const char* isdProfile, const char* outIT8, const char* measIT8,
                                      int* out1, int* out2) {
    if (!handle) return kNullHandle;
    return vantrel::Analyse2(*Tool(handle), isdProfile, outIT8, measIT8, out1, out2);
}

VANTREL_API int VANTREL_CALL analyse3(void* handle, const char* paperProfile, const char* outprof3CC,
                                      const char* referenceIT8, const char* measIT8, int* out1, int* out2) {
    if (!handle) return kNullHandle;
    return vantrel::Analyse3(*Tool(handle), paperProfile, outprof3CC, referenceIT8, measIT8, out1, out2);
}

VANTREL_API int VANTREL_CALL analyse4(void* handle, const char* paperProfile, const char* refProfile,
                                      const char* referenceIT8, const char* measIT8, int* out1, int* out2, int* out3,
                                      int* out4) {
    if (!handle) return kNullHandle;
    return vantrel::Analyse4(*Tool(handle), paperProfile, refProfile, referenceIT8, measIT8, out1, out2, out3,
                             out4);
}

VANTREL_API int VANTREL_CALL optimize1(void* handle, const char* paperProfile, int* out1, int* out2) {
    if (!handle) return kNullHandle;
    return vantrel::Optimize1(*Tool(handle), paperProfile, out1, out2);
}

VANTREL_API int VANTREL_CALL optimize2(void* handle, const char* outProfile, int* out1, int* out2, int option) {
    if (!handle) return kNullHandle;
    return vantrel::Optimize2(*Tool(handle), outProfile, out1, out2, option);
}

VANTREL_API int VANTREL_CALL optimize3(void* handle, const char* outprof3CC, int* out1, int* out2, int option) {
    if (!handle) return kNullHandle;
    return vantrel::Optimize3(*Tool(handle), outprof3CC, out1, out2, option);
}

VANTREL_API int VANTREL_CALL optimize4(void* handle, const char* outprof3CC, int* out1, int* out2,
                                       unsigned short* table, const char* paperProfile, int option) {
    if (!handle) return kNullHandle;
    return vantrel::Optimize4(*Tool(handle), outprof3CC, out1, out2, table, paperProfile, option);
}

VANTREL_API int VANTREL_CALL mergeMCHintoCMYK(void* handle, const char* refProfile, const char* paperProfile,
                                              const char* outProfile) {
    if (!handle) return kNullHandle;
    return vantrel::MergeMchIntoCmyk(*Tool(handle), refProfile, paperProfile, outProfile);
}

VANTREL_API int VANTREL_CALL Cmyk2Lab_Double(void* handle, const char* profile, int count, const int* cmyk, int,
                                             int* lab, int, int* xyz) {
    if (!handle) return -1;
    return vantrel::ConvertDeviceRecords(*Tool(handle), profile, count, cmyk, lab, xyz, DeviceRecord::Cmyk);
}

VANTREL_API int VANTREL_CALL RGB2Lab_Double(void* handle, const char* profile, int count, const int* rgb, int,
                                             int* lab, int, int* xyz) {
    if (!handle) return -1;
    return vantrel::ConvertDeviceRecords(*Tool(handle), profile, count, rgb, lab, xyz, DeviceRecord::Rgb);
}

VANTREL_API int VANTREL_CALL Cmykrgb2Lab_Double(void* handle, const char* profile, int count, const int* values, int,
                                             int* lab, int, int* xyz) {
    if (!handle) return -1;
    return vantrel::ConvertDeviceRecords(*Tool(handle), profile, count, values, lab, xyz, DeviceRecord::Cmykrgb);
}

}  // extern "C"
