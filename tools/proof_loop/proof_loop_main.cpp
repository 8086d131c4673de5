// vantrel_proof_loop: runs the simulated proof loop with one or more correctors and prints the
// per-pass table of each.
//   vantrel_proof_loop [--passes N] [--corrector refine,optimize2,optimize3,none] [--full-chart]
//                      [--chart-step N] [--noise SIGMA] [--seed N] [--quality l|m|h]
//                      [--fixtures DIR] [--work DIR]

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <sstream>
#include <string>
#include <vector>

#include "proof_loop.h"
#include "proofer_model.h"

using namespace vantrel::proofloop;

namespace {

int Usage() {
    std::fprintf(stderr,
                 "usage: vantrel_proof_loop [--passes N] [--corrector refine,optimize2,optimize3,none]\n"
                 "                          [--full-chart | --chart-step N] [--noise SIGMA] [--seed N]\n"
                 "                          [--quality l|m|h] [--fixtures DIR] [--work DIR]\n");
    return 2;
}

}  // namespace

int main(int argc, char** argv) {
    LoopSettings settings;
    settings.passes = 8;
    settings.noise = 0.2;
    std::string correctors = "refine", fixtures = VANTREL_FIXTURE_DIR, work;
    char quality = 'm';
    for (int i = 1; i < argc; ++i) {
        std::string arg = argv[i];
        bool hasValue = i + 1 < argc;
        if (arg == "--full-chart") settings.chartStep = 1;
        else if (!hasValue) return Usage();
        else if (arg == "--passes") settings.passes = std::atoi(argv[++i]);
        else if (arg == "--corrector") correctors = argv[++i];
        else if (arg == "--chart-step") settings.chartStep = std::strtoul(argv[++i], nullptr, 10);
        else if (arg == "--noise") settings.noise = std::atof(argv[++i]);
        else if (arg == "--seed") settings.seed = static_cast<unsigned>(std::strtoul(argv[++i], nullptr, 10));
        else if (arg == "--quality") quality = argv[++i][0];
        else if (arg == "--fixtures") fixtures = argv[++i];
        else if (arg == "--work") work = argv[++i];
        else return Usage();
    }
    if (settings.passes < 1 || settings.chartStep < 1) return Usage();

    ArgyllTools tools = FindArgyllTools();
    if (!tools.Complete()) {
        std::fprintf(stderr, "vantrel_proof_loop: Argyll's %s not found on PATH; the proof loop needs them\n",
                     tools.Missing().c_str());
        return 77;
    }
    settings.referenceProfile = fixtures + "/FOGRA39L.icc";
    if (!std::filesystem::exists(settings.referenceProfile)) {
        std::fprintf(stderr, "vantrel_proof_loop: no %s; run tools/make_fixtures.sh %s first\n",
                     settings.referenceProfile.c_str(), fixtures.c_str());
        return 1;
    }
    ModelProfiles model = BuildModelProfiles(tools, settings.pressTi3, ProoferModel{}, quality, fixtures + "/proof_loop");
    if (!model.error.empty()) {
        std::fprintf(stderr, "vantrel_proof_loop: %s\n", model.error.c_str());
        return 1;
    }
    settings.prooferProfile = model.proofer;
    settings.todayProfile = model.today;
    if (work.empty()) work = (std::filesystem::temp_directory_path() / "vantrel-proof-loop").string();

    int status = 0;
    std::stringstream names(correctors);
    std::string name;
    while (std::getline(names, name, ',')) {
        if (!ParseCorrector(name, &settings.corrector)) return Usage();
        settings.workDir = work + "/" + name;
        std::printf("%s", FormatHeader("corrector " + name + ", step " + std::to_string(settings.chartStep) +
                                       ", noise " + std::to_string(settings.noise) + ", seed " +
                                       std::to_string(settings.seed))
                              .c_str());
        LoopResult result = RunProofLoop(settings, tools, [](const PassFigures& f) {
            std::printf("%s", FormatRow(f).c_str());
            std::fflush(stdout);
        });
        if (!result.error.empty()) {
            std::printf("  stopped: %s\n", result.error.c_str());
            status = 1;
        }
        std::printf("\n");
    }
    return status;
}
