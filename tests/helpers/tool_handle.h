#pragma once
// A tool handle for the length of a test, and a record of what the library tells the host's
// progress function.

#include <string>
#include <vector>

#include "interface/tool_object.h"
#include "vantrel.h"

namespace vantrel::test {

// Every progress report as "text step/steps". The host's function is a plain one, so it writes to
// the log that is open. From step `cancelAt` on it answers non-zero, except to "Finished ...".
struct ProgressLog {
    std::vector<std::string> calls;
    int cancelAt = -1;

    ProgressLog() { Open() = this; }
    ~ProgressLog() { Open() = nullptr; }
    ProgressLog(const ProgressLog&) = delete;
    ProgressLog& operator=(const ProgressLog&) = delete;

    static ProgressLog*& Open() {
        static ProgressLog* open = nullptr;
        return open;
    }
    static int Report(const char* text, int step, int steps) {
        ProgressLog* log = Open();
        if (!log) return 0;
        log->calls.push_back(std::string(text) + " " + std::to_string(step) + "/" + std::to_string(steps));
        return log->cancelAt >= 0 && step >= log->cancelAt && std::string(text) != "Finished ..." ? 1 : 0;
    }
};

// dllInit for dir, dllFree at the end; reports go to the open ProgressLog, if there is one.
struct ToolHandle {
    void* h = nullptr;
    int result;

    explicit ToolHandle(const char* dir = nullptr) : result(dllInit(ProgressLog::Report, &h, dir)) {}
    ~ToolHandle() { dllFree(h); }
    ToolHandle(const ToolHandle&) = delete;
    ToolHandle& operator=(const ToolHandle&) = delete;

    CIterativtoolDlg& Tool() const { return *static_cast<CIterativtoolDlg*>(h); }
};

}  // namespace vantrel::test
