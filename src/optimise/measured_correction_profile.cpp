// The 3CC correction profile's Lab-to-Lab table corrected from a measured proof: each patch asks
// the nodes around its wanted colour for its error once more, the way the proofer missed it.
#include <cmath>

#include "colour/colour_math.h"
#include "eval/grid_location.h"
#include "eval/pcs_encoding.h"
#include "eval/table_nodes.h"
#include "interface/tool_object.h"
#include "optimise/correction_targets.h"
#include "optimise/measured_patches.h"
#include "optimise/node_accumulator.h"
#include "optimise/sample_weight.h"
#include "optimise/sparse_smoothing.h"
#include "optimise/white_correction.h"

namespace vantrel {
namespace {

constexpr int kMaxGrid = 100;
constexpr int kPaperWeight = 100;
// Locations this close to a node (grid units) are on it; errors and white differences below
// this (ΔE) are met.
constexpr double kOnNode = 0.1;
constexpr double kMet = 0.1;
constexpr double kLargeError = 12.0;
// Step factors: [node or corners][chart dense][large error].
constexpr double kStep[2][2][2] = {{{1.5, 0.75}, {1.0, 0.5}}, {{1.0, 0.6}, {0.75, 0.4}}};
constexpr double kSmallestSum = 0.1;
constexpr const char* kOptimizingText = "Optimizing ...";

int NodeIndex(double field, int grid) {
    const int index = static_cast<int>(field);
    return index < 0 ? 0 : (index >= grid ? grid - 1 : index);
}

}  // namespace

int CIterativtoolDlg::OptimizeOutprof() {
    if (!m_Outprof || !m_Paperprof || !m_ReferenceIT8 || !m_MeasIT8) return 0;
    CProfil& table = *m_Outprof;
    const int n = table.m_Lut[1].gridPoints;
    if (n < 1 || n > kMaxGrid || table.m_Lut[1].inputChannels != 3 || table.m_Lut[1].outputChannels < 3) return 0;
    const double dW = DeltaE(m_MeasWhite, m_RefWhite);
    const bool locateByReference =
        !m_RefName.empty() && m_RefName != kNoProfileSelected && m_Refprof && m_Refprof->SlotHolds(0);
    const int patches = PairedPatchCount(*this);
    if (patches < 0) return 1;
    const int steps = 2 * n + patches;
    Progress("Optimizing...", 0, steps);
    int counter = 2;

    NodeAccumulators acc;
    if (!acc.Allocate(n, 3)) return kOptimiseOutOfMemory;
    for (int i = 0; i < n; ++i) {
        if (Progress(kOptimizingText, counter++, steps) != 0) return 0;
    }
    table.m_UseMediaWhite[0] = table.m_UseMediaWhite[1] = 1;
    if (locateByReference) m_Refprof->m_UseMediaWhite[0] = m_Refprof->m_UseMediaWhite[1] = 1;

    const PatchColumns columns = ProbePatchColumns(*this);
    if (columns.device == It8Kind::kNoDevice) return 0;
    const bool cellMode = m_OptFlagA != 0;
    const int dense = m_OptFlagB ? 0 : 1;
    const bool gamutKnown = m_GamutComputed && m_Paperprof && m_Paperprof->HoldsTables();

    CornerWeights weights{};
    for (int p = 0; p < patches; ++p) {
        if (Progress(kOptimizingText, counter++, steps) != 0) return 0;
        double x[7];
        PatchDevice(*this, columns, p, x);
        double tone[7];
        for (int c = 0; c < 7; ++c) tone[c] = x[c];
        if (columns.device == It8Kind::kRgb) {
            // RGB weighs like the ink it takes: none at 255, full at 0.
            for (int c = 0; c < 7; ++c) tone[c] = c < 3 ? (255.0 - x[c]) / kPercentToDevice : 100.0;
        }
        const int w = SampleWeight(tone, m_Params.data());
        if (w == 0) continue;

        Lab measured = PatchLab(*m_MeasIT8, p, columns.measuredFromXyz);
        Lab wanted = w == kPaperWeight ? m_RefWhite : PatchLab(*m_ReferenceIT8, p, columns.referenceFromXyz);
        wanted = ReachableTarget(*this, *m_Paperprof, gamutKnown, wanted, measured);

        const Lab location = locateByReference ? PredictedScaledLab(*m_Refprof, columns, x)
                                               : Lab{wanted.L * kLightnessScale, wanted.a, wanted.b};
        double where[CProfil::kEvalSize] = {location.L, location.a, location.b};
        const double g = cellMode ? LocateCell(table, where, 1, weights) : LocateNearestNode(table, where, 1);
        const int i0 = NodeIndex(where[0], n), j0 = NodeIndex(where[1], n), k0 = NodeIndex(where[2], n);
        const bool toNode = g <= kOnNode || !cellMode;

        if (dW > kMet) measured = WhiteCorrection(table, measured, m_MeasWhite, m_RefWhite, table.m_Precision[1]);
        const double e = DeltaE(measured, wanted);

        if (e < kMet) {
            if (toNode) {
                if (g < 1.0) acc.At(i0, j0, k0).weight += w;
            } else {
                ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int k, double omega) {
                    if (omega > 0.0) acc.At(i, j, k).weight += w;
                });
            }
            continue;
        }

        const Lab reflected = ReflectLab(measured, wanted);
        const double delta[3] = {(reflected.L - wanted.L) * kLightnessScale, reflected.a - wanted.a,
                                 reflected.b - wanted.b};
        const int large = e >= kLargeError ? 1 : 0;
        if (toNode) {
            if (g < 1.0) {
                const double k = kStep[0][dense][large];
                NodeAccumulator& a = acc.At(i0, j0, k0);
                a.weight += w;
                for (int c = 0; c < 3; ++c) a.sum[c] += (1 - g) * delta[c] * k * w;
            }
        } else {
            const double k = kStep[1][dense][large];
            ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int kk, double omega) {
                if (!(omega > 0.0)) return;
                NodeAccumulator& a = acc.At(i, j, kk);
                a.weight += w;
                for (int c = 0; c < 3; ++c) a.sum[c] += delta[c] * k * omega * w;
            });
        }
    }

    for (int i = 0; i < n; ++i) {
        if (Progress(kOptimizingText, counter++, steps) != 0) return 0;
        for (int j = 0; j < n; ++j) {
            for (int k = 0; k < n; ++k) {
                const NodeAccumulator& a = acc.At(i, j, k);
                if (a.weight == 0.0) continue;
                double record[CProfil::kEvalSize] = {};
                record[4] = i;
                record[5] = j;
                record[6] = k;
                ReadNodeLab(table, record, 1, false);
                for (int c = 0; c < 3; ++c) record[c] += a.sum[c] / a.weight;
                for (int c = 0; c < 3; ++c) {
                    if (!(std::fabs(a.sum[c]) > kSmallestSum)) continue;
                    record[3] = c;
                    WriteNodeChannelLab(table, record, 1);
                }
            }
        }
    }
    if (cellMode && SmoothSparseNodes(table, acc, m_Progress) == 0) return 0;
    acc.Free();
    return Progress("Finished ...", steps, steps) != 0 ? 0 : 1;
}

}  // namespace vantrel
