// The paper profile's PCS-to-device table corrected from a measured proof: each patch's error
// becomes a device correction of the nodes around the colour it stands for.
#include <algorithm>
#include <cctype>
#include <cmath>
#include <string>

#include "colour/colour_math.h"
#include "eval/grid_location.h"
#include "eval/inverse.h"
#include "eval/pcs_encoding.h"
#include "interface/tool_object.h"
#include "optimise/add_to_node.h"
#include "optimise/correction_targets.h"
#include "optimise/measured_patches.h"
#include "optimise/node_accumulator.h"
#include "optimise/sample_weight.h"
#include "optimise/white_correction.h"

namespace vantrel {
namespace {

constexpr int kMaxGrid = 100;
constexpr int kPaperWeight = 100;
// Charts larger than this are dense enough for nearest-node updates with smaller steps.
constexpr int kDenseChart = 2000;
// A location this close to a node (grid units) is on it; beyond 1 a node takes nothing.
constexpr double kOnNode = 0.001;
// Errors (ΔE) below this are met; white differences below it need no carrying.
constexpr double kMet = 0.001;
constexpr double kLargeError = 12.0;
// Step factors of a node update, and of a cell's corners (large error or many colourants / else).
constexpr double kNodeStep = 0.75, kNodeStepDense = 0.5;
constexpr double kCornerStepLarge = 0.4, kCornerStep = 0.6;
constexpr double kCornerStepLargeDense = 0.25, kCornerStepDense = 0.4;
// The paper patch of option 1 drives its node to no ink: its corners take 1.5 x, the node 4.5 x.
constexpr double kPaperCornerPush = 1.5;
constexpr double kPaperNodePush = 4.5;
constexpr double kSmallestSum = 0.001;

constexpr const char* kOptimizingText = "Optimizing ...";

bool Given(const std::string& name) { return !name.empty() && name != kNoProfileSelected; }

std::string FilePart(const std::string& path) {
    const std::size_t slash = path.find_last_of("\\/");
    std::string part = slash == std::string::npos ? path : path.substr(slash + 1);
    std::transform(part.begin(), part.end(), part.begin(), [](unsigned char c) { return std::tolower(c); });
    return part;
}

int NodeIndex(double field, int grid) {
    const int index = static_cast<int>(field);
    return index < 0 ? 0 : (index >= grid ? grid - 1 : index);
}

double Held(double v) { return Clamp(v, 0.0, 255.0); }

}  // namespace

int CIterativtoolDlg::OptimizeFromMeasurement() {
    if (!m_Paperprof || !m_ReferenceIT8 || !m_MeasIT8) return 0;
    CProfil& paper = *m_Paperprof;
    const int n = paper.m_Lut[1].gridPoints;
    if (n < 1 || n > kMaxGrid || paper.m_Lut[1].inputChannels != 3) return 0;

    const double dW = m_OptimizeOption == 0 ? DeltaE(m_MeasWhite, m_RefWhite) : 0.0;
    const bool locateByReference = Given(m_RefName) && m_Refprof && m_Refprof->SlotHolds(0);
    const bool sameProfile = FilePart(m_PaperName) == FilePart(m_RefName);
    const int patches = PairedPatchCount(*this);
    if (patches < 0) return 1;

    if (patches > kDenseChart) m_OptFlagA = m_OptFlagB = 0;
    const int steps = 2 * n + patches;
    Progress(kOptimizingText, 0, steps);
    int counter = 2;

    NodeAccumulators acc;
    if (!acc.Allocate(n, 3)) return kOptimiseOutOfMemory;
    for (int i = 0; i < n; ++i) Progress(kOptimizingText, counter++, steps);
    paper.m_UseMediaWhite[0] = paper.m_UseMediaWhite[1] = 1;
    if (m_Refprof) m_Refprof->m_UseMediaWhite[0] = m_Refprof->m_UseMediaWhite[1] = 1;

    const PatchColumns columns = ProbePatchColumns(*this);
    if (columns.device == It8Kind::kNoDevice) return 0;
    const bool cellMode = m_OptFlagA != 0;
    const double nodeStep = m_OptFlagB ? kNodeStep : kNodeStepDense;
    const bool gamutKnown = m_GamutComputed && !sameProfile;

    CornerWeights weights{};
    for (int p = 0; p < patches; ++p) {
        if (Progress(kOptimizingText, counter++, steps) != 0) return 0;
        double x[7];
        PatchDevice(*this, columns, p, x);
        const int w = SampleWeight(x, m_Params.data());
        if (w == 0) continue;

        Lab measured = PatchLab(*m_MeasIT8, p, columns.measuredFromXyz);
        Lab wanted = w == kPaperWeight ? m_RefWhite : PatchLab(*m_ReferenceIT8, p, columns.referenceFromXyz);
        wanted = ReachableTarget(*this, paper, gamutKnown, wanted, measured);

        const Lab location = locateByReference ? PredictedScaledLab(*m_Refprof, columns, x)
                                               : Lab{wanted.L * kLightnessScale, wanted.a, wanted.b};
        double where[CProfil::kEvalSize] = {location.L, location.a, location.b};
        const double g = cellMode ? LocateCell(paper, where, 1, weights) : LocateNearestNode(paper, where, 1);
        const int i0 = NodeIndex(where[0], n), j0 = NodeIndex(where[1], n), k0 = NodeIndex(where[2], n);
        const bool toNode = g <= kOnNode || !cellMode;

        if (dW > kMet) measured = WhiteCorrection(paper, measured, m_MeasWhite, m_RefWhite, paper.m_Precision[1]);
        const double e = DeltaE(measured, wanted);

        if (e < kMet) {
            // A patch that is already right damps the corrections other patches bring here.
            if (toNode) {
                if (g < 1.0) acc.At(i0, j0, k0).weight += w;
            } else {
                ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int k, double omega) {
                    if (omega > 0.0) acc.At(i, j, k).weight += w * omega;
                });
            }
            continue;
        }

        double d[CProfil::kEvalSize] = {location.L, location.a, location.b};
        LabToCmyk(paper, d);

        if (w == kPaperWeight && m_OptimizeOption == 1) {
            if (g > kOnNode && cellMode) {
                ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int k, double omega) {
                    if (!(omega > 0.0)) return;
                    NodeAccumulator& a = acc.At(i, j, k);
                    a.weight += w;
                    for (int c = 0; c < 4; ++c) a.sum[c] -= kPaperCornerPush * w * d[c];
                });
            }
            NodeAccumulator& a = acc.At(i0, j0, k0);
            for (int c = 0; c < 4; ++c) a.sum[c] = -kPaperNodePush * w * d[c];
            a.weight = w;
            continue;
        }

        double reflected[4], throughLab[4], delta[4];
        ReflectInDevice(paper, wanted, measured, reflected);
        ReflectInLab(paper, wanted, measured, throughLab);
        double v[4];
        bool clamped = false;
        for (int c = 0; c < 4; ++c) {
            const double raw = (reflected[c] + d[c]) / 2;
            v[c] = Held(raw);
            clamped = clamped || v[c] != raw;
        }
        if (clamped && d[3] > 0.0) {
            for (int c = 0; c < 4; ++c) v[c] = Held((reflected[c] + throughLab[c] + d[c]) / 3);
        }
        for (int c = 0; c < 4; ++c) delta[c] = v[c] - d[c];

        if (toNode) {
            if (g < 1.0) {
                NodeAccumulator& a = acc.At(i0, j0, k0);
                for (int c = 0; c < 4; ++c) a.sum[c] += (1 - g) * w * delta[c] * nodeStep;
                a.weight += w;
            }
        } else {
            const bool large = e >= kLargeError || columns.device == It8Kind::kMultiChannel;
            const double k = m_OptFlagB ? (large ? kCornerStepLarge : kCornerStep)
                                        : (large ? kCornerStepLargeDense : kCornerStepDense);
            ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int kk, double omega) {
                if (!(omega > 0.0)) return;
                NodeAccumulator& a = acc.At(i, j, kk);
                a.weight += w;
                for (int c = 0; c < 4; ++c) a.sum[c] += delta[c] * k * omega * w;
            });
        }
    }

    for (int i = 0; i < n; ++i) {
        if (Progress(kOptimizingText, counter++, steps) != 0) return 0;
        for (int j = 0; j < n; ++j) {
            for (int k = 0; k < n; ++k) {
                const NodeAccumulator& a = acc.At(i, j, k);
                if (a.weight == 0.0) continue;
                double record[CProfil::kEvalSize] = {double(i), double(j), double(k)};
                for (int c = 0; c < 4; ++c) record[3 + c] = a.sum[c] / a.weight;
                for (int c = 0; c < 4; ++c) {
                    if (!(std::abs(a.sum[c]) > kSmallestSum)) continue;
                    record[7] = c;
                    AddToNode(paper, record);
                }
            }
        }
    }
    acc.Free();
    return Progress("Finished ...", steps, steps) != 0 ? 0 : 1;
}

}  // namespace vantrel
