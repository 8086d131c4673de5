#include "correction_step.h"

#include <filesystem>

#include "vantrel.h"

namespace vantrel::proofloop {
namespace {

int VANTREL_CALL NoProgress(const char*, int, int) { return 0; }

// A fresh tool object for one correction; freed when the object goes.
class ToolHandle {
public:
    explicit ToolHandle(const std::string& dir) {
        std::filesystem::create_directories(dir, ignored_);
        status_ = dllInit(NoProgress, &handle_, (dir + "/").c_str());
    }
    ~ToolHandle() { dllFree(handle_); }
    ToolHandle(const ToolHandle&) = delete;
    ToolHandle& operator=(const ToolHandle&) = delete;

    void* get() const { return handle_; }
    bool ok() const { return status_ == 0 && handle_ != nullptr; }
    int status() const { return status_; }

private:
    std::error_code ignored_;
    void* handle_ = nullptr;
    int status_ = -1;
};

std::string PassName(const PassFiles& files, const char* stem, const char* extension) {
    return files.workDir + "/" + stem + "-pass" + std::to_string(files.pass) + extension;
}

std::string RefineStep(const ArgyllTools& tools, const PassFiles& files, RipSetup& rip) {
    if (tools.refine.empty()) return "Argyll's refine is not on PATH";
    std::string out = PassName(files, "refine", ".icc");
    std::vector<std::string> argv{tools.refine};
    if (rip.labCorrection.empty()) argv.push_back("-c");
    argv.insert(argv.end(), {files.referenceIt8, files.proofIt8, rip.prooferProfile});
    if (!rip.labCorrection.empty()) argv.push_back(rip.labCorrection);
    argv.push_back(out);
    int status = RunProgram(argv);
    if (status != 0 || !std::filesystem::exists(out)) return "refine failed (status " + std::to_string(status) + ")";
    rip.labCorrection = out;
    rip.labCorrectionIs3cc = false;
    return {};
}

// analyse4 leaves the measurements and white points that optimize2 and optimize3 work from.
std::string Analyse(void* handle, const PassFiles& files, const RipSetup& rip) {
    int mean = 0, maximum = 0, white = 0, inGamut = 0;
    int status = analyse4(handle, rip.prooferProfile.c_str(), files.referenceProfile.c_str(),
                          files.referenceIt8.c_str(), files.proofIt8.c_str(), &mean, &maximum, &white, &inGamut);
    if (status != 0) return "analyse4 returned " + std::to_string(status) + " (is it in this build?)";
    return {};
}

std::string Optimize2Step(int option, const PassFiles& files, RipSetup& rip) {
    ToolHandle tool(files.workDir + "/library");
    if (!tool.ok()) return "dllInit returned " + std::to_string(tool.status());
    if (std::string error = Analyse(tool.get(), files, rip); !error.empty()) return error;
    std::string out = PassName(files, "proofer", ".icc");
    int out1 = 0, out2 = 0;
    int status = optimize2(tool.get(), out.c_str(), &out1, &out2, option);
    if (status != 0) return "optimize2 returned " + std::to_string(status) + " (is it in this build?)";
    if (!std::filesystem::exists(out)) return "optimize2 wrote no " + out;
    rip.prooferProfile = out;
    return {};
}

std::string Optimize3Step(int option, const PassFiles& files, RipSetup& rip) {
    ToolHandle tool(files.workDir + "/library");
    if (!tool.ok()) return "dllInit returned " + std::to_string(tool.status());
    if (std::string error = Analyse(tool.get(), files, rip); !error.empty()) return error;
    // optimize3 corrects the 3CC in place: each pass works on its own copy.
    std::string out = PassName(files, "correction", ".3cc");
    std::error_code ec;
    std::filesystem::copy_file(rip.labCorrection, out, std::filesystem::copy_options::overwrite_existing, ec);
    if (ec) return "cannot copy " + rip.labCorrection + ": " + ec.message();
    int out1 = 0, out2 = 0;
    int status = optimize3(tool.get(), out.c_str(), &out1, &out2, option);
    if (status != 0) return "optimize3 returned " + std::to_string(status) + " (is it in this build?)";
    rip.labCorrection = out;
    rip.labCorrectionIs3cc = true;
    return {};
}

}  // namespace

const char* CorrectorName(Corrector corrector) {
    switch (corrector) {
        case Corrector::None: return "none";
        case Corrector::Refine: return "refine";
        case Corrector::Optimize2: return "optimize2";
        case Corrector::Optimize3: return "optimize3";
    }
    return "?";
}

bool ParseCorrector(const std::string& name, Corrector* corrector) {
    for (Corrector c : {Corrector::None, Corrector::Refine, Corrector::Optimize2, Corrector::Optimize3})
        if (name == CorrectorName(c)) {
            *corrector = c;
            return true;
        }
    return false;
}

CorrectionStep MakeCorrectionStep(Corrector corrector, const ArgyllTools& tools, int optimizeOption) {
    switch (corrector) {
        case Corrector::None: return [](const PassFiles&, RipSetup&) { return std::string(); };
        case Corrector::Refine:
            return [tools](const PassFiles& files, RipSetup& rip) { return RefineStep(tools, files, rip); };
        case Corrector::Optimize2:
            return [optimizeOption](const PassFiles& files, RipSetup& rip) {
                return Optimize2Step(optimizeOption, files, rip);
            };
        case Corrector::Optimize3:
            return [optimizeOption](const PassFiles& files, RipSetup& rip) {
                return Optimize3Step(optimizeOption, files, rip);
            };
    }
    return {};
}

std::string InitialRip(Corrector corrector, const std::string& prooferProfile, const std::string& workDir,
                       RipSetup* rip) {
    *rip = RipSetup{prooferProfile, {}, false};
    if (corrector != Corrector::Optimize3) return {};
    std::string dir = workDir + "/library";
    ToolHandle tool(dir);
    if (!tool.ok()) return "dllInit returned " + std::to_string(tool.status());
    std::string neutral = dir + "/neutral.3cc", start = workDir + "/correction-start.3cc";
    std::error_code ec;
    std::filesystem::copy_file(neutral, start, std::filesystem::copy_options::overwrite_existing, ec);
    if (ec) return "dllInit wrote no " + neutral;
    rip->labCorrection = start;
    rip->labCorrectionIs3cc = true;
    return {};
}

}  // namespace vantrel::proofloop
