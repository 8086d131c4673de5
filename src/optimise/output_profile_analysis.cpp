// The quality measure of an output profile: how far a colour moves when it goes through the
// PCS-to-device table and back through the device-to-PCS table.
#include <memory>
#include <new>
#include <string>
#include <vector>

#include "colour/colour_math.h"
#include "interface/tool_object.h"
#include "it8/patch_record.h"
#include "optimise/paper_round_trip.h"

namespace vantrel {
namespace {

// 21 values per channel; 255 / 20 in integer arithmetic is 12, so the grid ends at 240.
constexpr int kSteps = 21;
constexpr int kStep = 255 / 20;
constexpr int kPairs = kSteps * kSteps;
constexpr std::size_t kSamples = std::size_t{kSteps} * kSteps * kSteps * kSteps;
constexpr const char* kText = "Analyzing Output Profile";
constexpr const char* kInputSuffix = "_inputvalues_big.it8";
constexpr const char* kOutputSuffix = "_outputvalues_big.it8";
constexpr uint32_t kCmykKind = 4;

double WholePercent(double device) { return static_cast<double>(static_cast<int>(device / kLightnessScale + 0.5)); }

void FillRecord(const CIterativtoolDlg& tool, PatchRecord& r, std::size_t index, const double* device,
                const Lab& lab) {
    r.sampleNumber = static_cast<uint32_t>(index + 1);
    for (int c = 0; c < 4; ++c) r.device[c] = WholePercent(device[c]);
    tool.SetRecordColour(r, lab);
}

}  // namespace

int CIterativtoolDlg::AnalyzeOutputProfile(double& mean, double& max) {
    if (!m_Paperprof) return kOptimiseFailed;
    CProfil& paper = *m_Paperprof;
    // Measuring a device link needs the printer it drives: an empty reference slot gives nothing
    // to measure against.
    const bool profiling = m_AbstractOutprof != 0;
    if (profiling) {
        if (!m_Refprof || !m_Refprof->SlotHolds(0) || !paper.SlotHolds(1)) return kOptimiseFailed;
        m_Refprof->m_UseMediaWhite[0] = m_Refprof->m_UseMediaWhite[1] = 0;
    } else if (!paper.SlotHolds(0) || !paper.SlotHolds(1)) {
        return kOptimiseFailed;
    }
    paper.m_UseMediaWhite[0] = paper.m_UseMediaWhite[1] = 0;

    std::vector<PatchRecord> inputs, outputs;
    if (profiling) {
        try {
            inputs.resize(kSamples);
            outputs.resize(kSamples);
            if (!m_ReferenceIT8) m_ReferenceIT8 = std::make_unique<Measured_IT8>();
        } catch (const std::bad_alloc&) {
            return kOptimiseOutOfMemory;
        }
        inputs[0].kind = kCmykKind;
        outputs[0].kind = kCmykKind;
    }

    CProfil& printer = profiling ? *m_Refprof : paper;
    const int channels = DeviceChannels(printer);
    const int paperChannels = DeviceChannels(paper);
    double sum = 0.0;
    double largest = 0.0;
    std::size_t index = 0;
    for (int pair = 0; pair < kPairs; ++pair) {
        Progress(kText, pair, kPairs);
        for (int yk = 0; yk < kSteps * kSteps; ++yk, ++index) {
            double x[CProfil::kEvalSize] = {double(pair / kSteps * kStep), double(pair % kSteps * kStep),
                                            double(yk / kSteps * kStep), double(yk % kSteps * kStep)};
            double y[CProfil::kEvalSize];
            const Lab first = ForwardLab(printer, x, channels);
            if (profiling) {
                for (int c = 0; c < CProfil::kEvalSize; ++c) y[c] = x[c];
                EvaluateDirection1(paper, y);
            } else {
                TableDevice(paper, first, paperChannels, y);
            }
            const Lab back = ForwardLab(printer, y, channels);
            const double e = DeltaE(first, back);
            sum += e;
            if (e > largest) largest = e;
            if (profiling) {
                FillRecord(*this, inputs[index], index, x, first);
                FillRecord(*this, outputs[index], index, y, back);
            }
        }
    }
    mean = sum / static_cast<double>(kSamples);
    max = largest;
    Progress(kText, kPairs, kPairs);

    if (profiling) {
        m_ReferenceIT8->WriteIt8(m_PaperName + kInputSuffix, inputs, static_cast<int32_t>(kSamples), 0, 0, 0);
        m_ReferenceIT8->WriteIt8(m_PaperName + kOutputSuffix, outputs, static_cast<int32_t>(kSamples), 0, 0, 0);
    }
    return kOptimiseDone;
}

}  // namespace vantrel
