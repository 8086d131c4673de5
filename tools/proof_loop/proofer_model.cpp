#include "proofer_model.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <sstream>
#include <unistd.h>

namespace vantrel::proofloop {
namespace {

double PaperL(const Chart& chart) {
    int paper = chart.PaperPatch();
    return paper >= 0 ? chart.lab[paper][0] : 100.0;
}

// Weight of the paper-white terms: 1 at paper, falling fast toward the shadows.
double PaperWeight(double L, double paperL) {
    double u = std::clamp(L / paperL, 0.0, 1.0);
    return u * u * u;
}

std::uint64_t Fnv1a(const std::string& text) {
    std::uint64_t hash = 1469598103934665603ull;
    for (unsigned char c : text) {
        hash ^= c;
        hash *= 1099511628211ull;
    }
    return hash;
}

}  // namespace

std::string ProoferModel::Key() const {
    std::ostringstream key;
    key.precision(10);
    for (double g : midtoneGamma) key << g << ' ';
    key << blackDepth << ' ' << chromaGain << ' ';
    for (double s : paperShift) key << s << ' ';
    key << gainChannel << ' ' << gainGamma << ' ';
    for (double c : midtoneCast) key << c << ' ';
    for (double d : paperDrift) key << d << ' ';
    return key.str();
}

Chart ProoferData(const Chart& press, const ProoferModel& model) {
    Chart proofer = press;
    double paperL = PaperL(press);
    for (size_t i = 0; i < press.size(); ++i) {
        for (int k = 0; k < 4; ++k)
            proofer.cmyk[i][k] = 100.0 * std::pow(std::clamp(press.cmyk[i][k] / 100.0, 0.0, 1.0), model.midtoneGamma[k]);
        Triple lab = press.lab[i];
        double shadow = 1.0 - std::clamp(lab[0] / paperL, 0.0, 1.0);
        double paper = PaperWeight(lab[0], paperL);
        lab[0] -= model.blackDepth * shadow * shadow;
        lab[1] *= model.chromaGain;
        lab[2] *= model.chromaGain;
        for (int k = 0; k < 3; ++k) lab[k] += model.paperShift[k] * paper;
        proofer.lab[i] = lab;
    }
    return proofer;
}

Chart DriftedData(const Chart& proofer, const ProoferModel& model) {
    Chart today = proofer;
    double paperL = PaperL(proofer);
    int c = std::clamp(model.gainChannel, 0, 3);
    for (size_t i = 0; i < proofer.size(); ++i) {
        // Today the channel prints at x what it printed at x^gamma, so the proofer's data point
        // d now belongs to x = d^(1/gamma).
        today.cmyk[i][c] = 100.0 * std::pow(std::clamp(proofer.cmyk[i][c] / 100.0, 0.0, 1.0), 1.0 / model.gainGamma);
        Triple lab = proofer.lab[i];
        double u = std::clamp(lab[0] / 100.0, 0.0, 1.0);
        double mid = 4.0 * u * (1.0 - u);
        double paper = PaperWeight(lab[0], paperL);
        for (int k = 0; k < 3; ++k) lab[k] += model.midtoneCast[k] * mid + model.paperDrift[k] * paper;
        today.lab[i] = lab;
    }
    return today;
}

ModelProfiles BuildModelProfiles(const ArgyllTools& tools, const std::string& pressTi3, const ProoferModel& model,
                                 char quality, const std::string& cacheDir) {
    ModelProfiles result;
    if (tools.colprof.empty()) {
        result.error = "Argyll's colprof is not on PATH";
        return result;
    }
    Chart press = ReadChart(pressTi3);
    if (press.size() == 0) {
        result.error = "no CMYK and Lab patches in " + pressTi3;
        return result;
    }
    std::error_code ec;
    std::filesystem::create_directories(cacheDir, ec);
    char tag[32];
    std::snprintf(tag, sizeof tag, "%016llx",
                  static_cast<unsigned long long>(Fnv1a(model.Key() + quality + pressTi3)));
    Chart proofer = ProoferData(press, model);
    struct Job {
        const char* role;
        Chart data;
        std::string* path;
    } jobs[] = {{"P", proofer, &result.proofer}, {"T", DriftedData(proofer, model), &result.today}};
    for (Job& job : jobs) {
        std::string base = std::string("proofer-") + job.role + "-" + tag;
        std::string final = cacheDir + "/" + base + ".icc";
        if (std::filesystem::exists(final)) {
            *job.path = final;
            continue;
        }
        // Built in a private directory and renamed into place, so that a parallel run never sees
        // half a profile.
        std::string work = cacheDir + "/" + base + ".build-" + std::to_string(getpid());
        std::filesystem::create_directories(work, ec);
        if (!WriteChart(job.data, work + "/" + base + ".ti3", base)) {
            result.error = "cannot write " + work + "/" + base + ".ti3";
            return result;
        }
        std::vector<std::string> argv{tools.colprof, std::string("-q") + quality, "-D",
                                      std::string("proof loop ") + job.role, work + "/" + base};
        int status = RunProgram(argv);
        std::filesystem::rename(work + "/" + base + ".icc", final, ec);
        std::filesystem::remove_all(work, ec);
        if (status != 0 || !std::filesystem::exists(final)) {
            result.error = "colprof failed on the " + std::string(job.role) + " data (status " +
                           std::to_string(status) + ")";
            return result;
        }
        *job.path = final;
    }
    return result;
}

}  // namespace vantrel::proofloop
