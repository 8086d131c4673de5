#include "proof_loop.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <random>

#include "chart.h"

namespace vantrel::proofloop {
namespace {

double DeltaE76(const Triple& a, const Triple& b) {
    return std::sqrt((a[0] - b[0]) * (a[0] - b[0]) + (a[1] - b[1]) * (a[1] - b[1]) + (a[2] - b[2]) * (a[2] - b[2]));
}

PassFigures Compare(const Chart& proof, const Chart& reference) {
    PassFigures figures;
    std::vector<double> errors(proof.size());
    for (size_t i = 0; i < proof.size(); ++i) errors[i] = DeltaE76(proof.lab[i], reference.lab[i]);
    if (errors.empty()) return figures;
    double sum = 0;
    for (double e : errors) sum += e;
    figures.mean = sum / errors.size();
    std::sort(errors.begin(), errors.end());
    figures.maximum = errors.back();
    size_t rank = static_cast<size_t>(std::ceil(0.95 * errors.size()));
    figures.p95 = errors[std::max<size_t>(rank, 1) - 1];
    int paper = reference.PaperPatch();
    if (paper >= 0) figures.paper = DeltaE76(proof.lab[paper], reference.lab[paper]);
    return figures;
}

// The RIP: reference Lab, the Lab correction, then P's B2A1 with absolute colorimetry.
std::vector<Quad> Rip(const std::string& xicclu, const RipSetup& rip, const std::vector<Triple>& referenceLab,
                      const std::string& scratch) {
    std::vector<Triple> lab = referenceLab;
    if (!rip.labCorrection.empty()) {
        // The 3CC's direction-1 table is its B2A1; refine's abstract profile is used forward.
        std::vector<std::string> flags = rip.labCorrectionIs3cc ? std::vector<std::string>{"-fb", "-ir"}
                                                                : std::vector<std::string>{"-ff", "-ir"};
        lab = LookUpLabToLab(xicclu, rip.labCorrection, flags, lab, scratch);
        if (lab.empty()) return {};
    }
    return LookUpCmyk(xicclu, rip.prooferProfile, {"-fb", "-ia"}, lab, scratch);
}

}  // namespace

LoopResult RunProofLoop(const LoopSettings& settings, const ArgyllTools& tools,
                        const std::function<void(const PassFigures&)>& onPass) {
    LoopResult result;
    if (tools.xicclu.empty()) {
        result.error = "Argyll's xicclu is not on PATH";
        return result;
    }
    std::error_code ec;
    std::filesystem::create_directories(settings.workDir, ec);
    if (ec) {
        result.error = "cannot create " + settings.workDir + ": " + ec.message();
        return result;
    }
    Chart chart = ThinChart(ReadChart(settings.pressTi3), settings.chartStep);
    if (chart.size() == 0 || chart.PaperPatch() < 0) {
        result.error = "no CMYK chart with a paper patch in " + settings.pressTi3;
        return result;
    }
    const std::string& scratch = settings.workDir;

    // The press reference: what R predicts for the chart, absolute colorimetric.
    Chart reference = chart;
    reference.lab = LookUpLab(tools.xicclu, settings.referenceProfile, {"-ff", "-ia"}, chart.cmyk, scratch);
    if (reference.lab.empty()) {
        result.error = "xicclu could not evaluate " + settings.referenceProfile;
        return result;
    }
    PassFiles files;
    files.workDir = settings.workDir;
    files.referenceProfile = settings.referenceProfile;
    files.referenceIt8 = settings.workDir + "/reference.ti3";
    if (!WriteChart(reference, files.referenceIt8, "press reference")) {
        result.error = "cannot write " + files.referenceIt8;
        return result;
    }

    RipSetup rip;
    result.error = InitialRip(settings.corrector, settings.prooferProfile, settings.workDir, &rip);
    if (!result.error.empty()) return result;
    CorrectionStep correct = MakeCorrectionStep(settings.corrector, tools, settings.optimizeOption);
    std::mt19937 random(settings.seed);
    std::normal_distribution<double> noise(0.0, settings.noise > 0 ? settings.noise : 1.0);

    for (int pass = 1; pass <= settings.passes; ++pass) {
        std::vector<Quad> printed = Rip(tools.xicclu, rip, reference.lab, scratch);
        Chart proof = chart;
        if (!printed.empty()) proof.lab = LookUpLab(tools.xicclu, settings.todayProfile, {"-ff", "-ia"}, printed, scratch);
        if (printed.empty() || proof.lab.empty()) {
            result.error = "pass " + std::to_string(pass) + ": xicclu failed on the RIP or the print";
            return result;
        }
        if (settings.noise > 0)
            for (Triple& lab : proof.lab)
                for (double& v : lab) v += noise(random);
        files.pass = pass;
        files.proofIt8 = settings.workDir + "/proof-pass" + std::to_string(pass) + ".ti3";
        if (!WriteChart(proof, files.proofIt8, "proof pass " + std::to_string(pass))) {
            result.error = "cannot write " + files.proofIt8;
            return result;
        }
        PassFigures figures = Compare(proof, reference);
        figures.pass = pass;
        if (pass < settings.passes && settings.corrector != Corrector::None) {
            auto start = std::chrono::steady_clock::now();
            std::string error = correct(files, rip);
            figures.correctionSeconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
            if (!error.empty()) result.error = "pass " + std::to_string(pass) + ": " + error;
        }
        result.passes.push_back(figures);
        if (onPass) onPass(figures);
        if (!result.error.empty()) return result;
    }
    return result;
}

std::string FormatHeader(const std::string& title) {
    char line[160];
    std::snprintf(line, sizeof line, "%s\n%4s %8s %8s %8s %8s %10s\n", title.c_str(), "pass", "mean", "p95", "max",
                  "paper", "correct s");
    return line;
}

std::string FormatRow(const PassFigures& f) {
    char line[160];
    if (f.correctionSeconds >= 0)
        std::snprintf(line, sizeof line, "%4d %8.3f %8.3f %8.3f %8.3f %10.2f\n", f.pass, f.mean, f.p95, f.maximum,
                      f.paper, f.correctionSeconds);
    else
        std::snprintf(line, sizeof line, "%4d %8.3f %8.3f %8.3f %8.3f %10s\n", f.pass, f.mean, f.p95, f.maximum,
                      f.paper, "-");
    return line;
}

}  // namespace vantrel::proofloop
