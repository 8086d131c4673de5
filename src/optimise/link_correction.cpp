// Correcting a device link from a calibration run's measurements: the printer model filled from
// the measurement, and the node corrections of the link.
#include <algorithm>
#include <cmath>

#include "analysis/it8_kind.h"
#include "colour/colour_math.h"
#include "eval/forward.h"
#include "eval/grid_location.h"
#include "eval/inverse.h"
#include "eval/table_nodes.h"
#include "interface/tool_object.h"
#include "optimise/correction_targets.h"
#include "optimise/node_accumulator.h"
#include "optimise/optimize4.h"
#include "optimise/sample_weight.h"
#include "optimise/white_correction.h"

namespace vantrel {
namespace {

constexpr int kDeviceChannels = 7;
// A patch corrects a node only when it falls on it this closely (grid units).
constexpr double kOnNode = 0.01;
// Colour errors at or below this are left alone.
constexpr double kLeaveAlone = 0.1;
// No correction step larger than this ΔE.
constexpr double kLargestStep = 2.5;
// Each later calibration run steps by this factor more.
constexpr double kRunDamping = 2.0 / 3.0;
// A node read or written in a colour record: indices from field 4 on (three inputs) or from
// field n (n of four or more); outputs 4..6 written from fields 14..16.
constexpr int kRecordSize = CProfil::kEvalSize;
constexpr int kExtraOutputs = 14;

bool Given(const std::string& name, const char* defaultLabel) { return !name.empty() && name != defaultLabel; }

// A patch's device values: percent for CMYK and multi-channel files, RGB as the file has it;
// channels the file lacks are 0.
void PatchValues(const Measured_IT8& it8, const It8Kind& kind, int patch, double* values) {
    std::fill(values, values + kDeviceChannels, 0.0);
    const int channels = kind.device == It8Kind::kCmyk    ? 4
                         : kind.device == It8Kind::kRgb   ? 3
                         : kind.seventhChannel            ? 7
                                                          : 6;
    for (int c = 0; c < channels; ++c) {
        const double v = kind.device == It8Kind::kCmyk  ? it8.GetCmyk(patch, c)
                         : kind.device == It8Kind::kRgb ? it8.GetRgb(patch, c)
                                                        : it8.GetChannel(patch, c);
        values[c] = v < 0.0 ? 0.0 : v;
    }
}

// Device values on 0..255: percent x 2.55, RGB as it stands.
void ToDeviceScale(const It8Kind& kind, const double* values, double* device) {
    const double scale = kind.device == It8Kind::kRgb ? 1.0 : kPercentToDevice;
    for (int c = 0; c < kDeviceChannels; ++c) device[c] = values[c] * scale;
}

// The flat position of a node among the accumulators of a grid of n points on `axes` axes.
std::size_t AccumulatorIndex(const int32_t* indices, int axes, int n) {
    std::size_t index = 0;
    for (int a = 0; a < axes; ++a) index = index * static_cast<std::size_t>(n) + static_cast<std::size_t>(indices[a]);
    return index;
}

int IndexField(int inputs) { return inputs >= 4 ? inputs : 4; }

// The device values the profile's own forward table gives a colour for (its input count decides
// the evaluation), as L*, a*, b*.
Lab Forward(CProfil& model, const double* device) {
    double v[CProfil::kEvalSize] = {};
    std::copy(device, device + kDeviceChannels, v);
    DeviceToLab(model, v, model.m_Lut[0].inputChannels);
    return {v[0] / kLightnessScale, v[1], v[2]};
}

}  // namespace

void FillModelFromMeasurement(CIterativtoolDlg& tool) {
    if (!tool.m_MeasIT8 || !tool.m_ReferenceIT8 || !tool.m_Paperprof || !tool.m_Outprof) return;
    const Measured_IT8& meas = *tool.m_MeasIT8;
    const Measured_IT8& ref = *tool.m_ReferenceIT8;
    CProfil& model = *tool.m_Paperprof;
    CProfil& link = *tool.m_Outprof;
    const int patches = meas.PatchCount();
    if (patches == 0) return;
    for (int direction = 0; direction < 2; ++direction) {
        model.SetWhiteL(direction, tool.m_RefWhite.L / 100.0);
        model.SetWhiteA(direction, tool.m_RefWhite.a);
        model.SetWhiteB(direction, tool.m_RefWhite.b);
    }
    const It8Kind kind = ProbeIt8Kind(meas, kScanProbePatch);
    // The colours come from the reference, patch by patch: it must have as many.
    if (kind.device == It8Kind::kNoDevice || ref.PatchCount() != patches) return;
    if (!model.SlotHolds(0) || !link.SlotHolds(1)) return;
    const bool refFromXyz = It8ColourFromXyz(ref, 0);
    const int axes = link.m_Lut[1].inputChannels;

    for (int p = 0; p < patches; ++p) {
        double values[kDeviceChannels];
        // CMYK from the measurement, other device values from the reference.
        PatchValues(kind.device == It8Kind::kCmyk ? meas : ref, kind, p, values);
        double device[kDeviceChannels];
        ToDeviceScale(kind, values, device);
        int32_t node[CProfil::kMaxInputs] = {};
        const double g = LocateNearestDeviceNode(link, 1, device, node);
        Lab lab = tool.PatchLab(ref, p, refFromXyz);
        if (tool.m_CorrectOutprof) lab = WhiteCorrection(link, lab, tool.m_MeasWhite, tool.m_RefWhite, 1);
        if (g < 0.0 || g >= kOnNode) continue;
        double record[kRecordSize] = {lab.L * kLightnessScale, lab.a, lab.b};
        for (int a = 0; a < axes; ++a) record[4 + a] = node[a];
        WriteNodeLab(model, record, 0);
    }
}

int OptimizeLink(CIterativtoolDlg& tool, int allWeights) {
    CProfil& link = *tool.m_Outprof;
    CProfil& model = *tool.m_Paperprof;
    const int n = link.m_Lut[1].gridPoints;
    if (n < 1 || n > 100 || !link.SlotHolds(1) || link.m_Lut[1].type == "MATR") return 0;
    link.m_OutputIdentity[0] = link.m_OutputIdentity[1] = 1;

    const int refPatches = Given(tool.m_ReferenceIT8Name, kNoFileSelected) && tool.m_ReferenceIT8
                               ? tool.m_ReferenceIT8->PatchCount()
                               : 0;
    const bool refGiven = Given(tool.m_RefName, kNoProfileSelected);
    if (!Given(tool.m_MeasIT8Name, kNoFileSelected) || !tool.m_MeasIT8 || refPatches != tool.m_MeasIT8->PatchCount() ||
        (!refGiven && !tool.m_CorrectOutprof))
        return 1;
    const Measured_IT8& ref = *tool.m_ReferenceIT8;
    const Measured_IT8& meas = *tool.m_MeasIT8;
    const int patches = refPatches;
    if (patches > 2000) tool.m_OptFlagA = tool.m_OptFlagB = 0;
    const int steps = 2 * n + patches;
    int counter = 0;
    tool.Progress("Optimizing...", counter, steps);
    counter = 2;

    // One record per node of the link's own grid (n^k), not of a seven-axis one: a 9-point
    // seven-channel grid would otherwise need 800 MB.
    const int axes = link.m_Lut[1].inputChannels;
    NodeAccumulators sums;
    if (!sums.Allocate(n, axes)) return kOptimize4OutOfMemory;
    for (int i = 0; i < n; ++i) tool.Progress("Optimizing...", counter++, steps);
    model.m_UseMediaWhite[0] = model.m_UseMediaWhite[1] = 1;
    if (refGiven) tool.m_Refprof->m_UseMediaWhite[0] = tool.m_Refprof->m_UseMediaWhite[1] = 1;
    const double damping = tool.m_CalRun >= 2 ? std::pow(kRunDamping, tool.m_CalRun - 1) : 1.0;

    const It8Kind kind = ProbeIt8Kind(ref, kScanProbePatch);
    if (kind.device == It8Kind::kNoDevice) return 0;
    // The measured device values are read in the reference's layout: another kind pairs nothing.
    if (ProbeIt8Kind(meas, kScanProbePatch).device != kind.device) return 0;
    const bool refFromXyz = It8ColourFromXyz(ref, 0), measFromXyz = It8ColourFromXyz(meas, 0);
    if (!model.SlotHolds(0)) return 0;

    for (int p = 0; p < patches; ++p) {
        tool.Progress("Optimizing...", counter++, steps);
        double x[kDeviceChannels];
        PatchValues(ref, kind, p, x);
        const int w = SampleWeight(x, tool.m_Params.data());
        // Only weighted patches, the paper never; single inks only when all weights are asked for.
        if (w <= 0 || w == 100 || (w != 1 && allWeights == 0)) continue;
        const Lab A = tool.PatchLab(ref, p, refFromXyz);
        const Lab M = tool.PatchLab(meas, p, measFromXyz);

        double device[kDeviceChannels];
        ToDeviceScale(kind, x, device);
        int32_t node[CProfil::kMaxInputs] = {};
        const double g = LocateNearestDeviceNode(link, 1, device, node);
        // Only the plane of black = 0 and extra colourants = 0 is corrected.
        if (g < 0.0 || g > kOnNode || std::any_of(node + 3, node + axes, [](int32_t v) { return v != 0; })) continue;
        const double e = DeltaE(M, A);
        if (e <= kLeaveAlone) continue;

        // What the proof printed for the patch: the link's output at its node, which is what the
        // measured colour belongs to. (The chart's own device values equal it only while the link
        // is still the identity; taken from the chart, a second calibration run would aim from
        // the uncorrected values and undo the first.) Through the model, moved by the error.
        double record[kRecordSize] = {};
        for (int a = 0; a < axes; ++a) record[IndexField(axes) + a] = node[a];
        ReadNodeDevice(link, record, false);
        double d[kDeviceChannels] = {};
        const int printedChannels = std::min(link.m_Lut[1].outputChannels, 4);
        std::copy(record, record + printedChannels, d);
        const Lab printed = Forward(model, d);
        const Lab target = ShiftLab(A, M, printed);
        double found[4];
        double searchDelta = 0.0;
        InverseSearch(model, target.L, target.a, target.b, d, found, searchDelta);
        if (std::equal(found, found + 4, d)) continue;
        const double step = e <= kLargestStep ? 1.0 : kLargestStep / e;
        NodeAccumulator& acc = sums[AccumulatorIndex(node, axes, n)];
        acc.weight += w;
        // Absolute device values, averaged over the patches of the node.
        for (int c = 0; c < 3; ++c) acc.sum[c] += w * (d[c] + damping * step * (found[c] - d[c]));
    }

    // Apply: channels 0..2 of every weighted node become the averages; the rest keep theirs.
    const std::size_t perFirstIndex = sums.Size() / static_cast<std::size_t>(n);
    for (std::size_t r = 0; r < sums.Size(); ++r) {
        if (r % perFirstIndex == 0 && tool.Progress("Optimizing ...", counter++, steps) != 0) return 0;
        const NodeAccumulator& acc = sums[r];
        if (acc.weight == 0.0) continue;
        int32_t node[CProfil::kMaxInputs] = {};
        for (std::size_t rest = r, a = static_cast<std::size_t>(axes); a-- > 0; rest /= static_cast<std::size_t>(n))
            node[a] = static_cast<int32_t>(rest % static_cast<std::size_t>(n));
        double record[kRecordSize] = {};
        const int first = IndexField(axes);
        for (int a = 0; a < axes; ++a) record[first + a] = node[a];
        ReadNodeDevice(link, record, false);
        double outputs[CProfil::kMaxOutputs] = {};
        const int m = std::min(link.m_Lut[1].outputChannels, CProfil::kMaxOutputs);
        std::copy(record, record + m, outputs);
        for (int c = 0; c < 3; ++c) outputs[c] = acc.sum[c] / acc.weight;
        std::fill(record, record + kRecordSize, 0.0);
        for (int c = 0; c < 4 && c < m; ++c) record[c] = outputs[c];
        for (int c = 4; c < 7 && c < m; ++c) record[kExtraOutputs + c - 4] = outputs[c];
        for (int a = 0; a < axes; ++a) record[first + a] = node[a];
        WriteNodeDevice(link, record, false);
    }
    if (tool.Progress("Optimizing ...", steps, steps) != 0) return 0;
    if (tool.Progress("Finished ...", steps, steps) != 0) return 0;
    return 1;
}

}  // namespace vantrel
