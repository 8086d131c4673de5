// The two corrections of an output profile's PCS-to-device table: node by node, then from a
// sample grid whose corrections are spread over the cells the samples fall in.
#include <cmath>

#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "eval/grid_location.h"
#include "eval/interpolation.h"
#include "eval/table_nodes.h"
#include "interface/tool_object.h"
#include "optimise/add_to_node.h"
#include "optimise/node_accumulator.h"
#include "optimise/paper_round_trip.h"
#include "optimise/sample_weight.h"

namespace vantrel {
namespace {

constexpr int kMaxGrid = 100;

// Step 1: a node is corrected when its round trip is off by more than this; colours outside
// the gamut get more slack, and far outside it only half the way is asked for.
constexpr double kInGamutSlack = 0.1;
constexpr double kOutOfGamutSlack = 0.3;
constexpr double kHalfWayBeyond = 1.5;
// Step 1: device corrections this small are noise of the search.
constexpr double kSmallestNodeStep = 0.1;

// Step 2: 21 samples per channel, 0 to 255 in steps of 12.75 (5 %).
constexpr int kSamples = 21;
constexpr double kSampleStep = 12.75;
constexpr double kSamplePercent = 5.0;
constexpr int kPairs = kSamples * kSamples;
// A sample this close to a node (grid units) feeds that node alone.
constexpr double kOnNode = 0.25;
constexpr double kOnNodeAfterSnap = 0.01;
constexpr double kSampleSlack = 0.1;
constexpr double kSampleHalfWayBeyond = 0.75;
constexpr double kSmallestSum = 0.01;

constexpr const char* kStep2Text = "Optimizing  Step 2...";

// The steps correct three-input tables of 1..100 grid points; anything else is left alone.
bool CorrectableTable(const CProfil& p) {
    const LutView t = SlotView(p, 1);
    return t.inputs == 3 && t.grid >= 1 && t.grid <= kMaxGrid;
}

// Adds delta[c] to channel c of node (i, j, k) for each channel whose `tested` value exceeds
// the threshold in size.
void AddCorrections(CProfil& p, int i, int j, int k, const double delta[4], const double tested[4],
                    double threshold) {
    double record[CProfil::kEvalSize] = {double(i), double(j), double(k), delta[0], delta[1], delta[2], delta[3]};
    for (int c = 0; c < 4; ++c) {
        if (!(std::fabs(tested[c]) > threshold)) continue;
        record[7] = c;
        AddToNode(p, record);
    }
}

int Index(double field, int grid) {
    const int index = static_cast<int>(field);
    return index < 0 ? 0 : (index >= grid ? grid - 1 : index);
}

}  // namespace

int CIterativtoolDlg::OptimizeStep1() {
    if (!m_Paperprof || !CorrectableTable(*m_Paperprof)) return 0;
    CProfil& p = *m_Paperprof;
    const int n = p.m_Lut[1].gridPoints;
    Progress("Optimizing Step 1...", 0, n);
    int counter = 2;
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = 0;
    const int channels = DeviceChannels(p);

    for (int i = 0; i < n; ++i) {
        Progress("Optimizing  Step 1...", counter++, n);
        for (int j = 0; j < n; ++j) {
            for (int k = 0; k < n; ++k) {
                double node[CProfil::kEvalSize] = {double(i), double(j), double(k)};
                NodePcsValue(p, node);
                const Lab wanted{node[0] / kLightnessScale, node[1], node[2]};
                double device[CProfil::kEvalSize];
                TableDevice(p, wanted, channels, device);
                const Lab reached = ForwardLab(p, device, channels);
                const double e = DeltaE(wanted, reached);

                Lab target = wanted;
                if (!IsInGamut(m_Gamut, wanted.L, wanted.a, wanted.b)) {
                    if (e <= kOutOfGamutSlack) continue;
                    if (e > kHalfWayBeyond) target = Midpoint(wanted, reached);
                } else if (e <= kInGamutSlack) {
                    continue;
                }
                double found[4];
                double foundError = 0.0;
                InverseSearch(p, target.L, target.a, target.b, device, found, foundError);
                const double delta[4] = {found[0] - device[0], found[1] - device[1], found[2] - device[2],
                                         found[3] - device[3]};
                AddCorrections(p, i, j, k, delta, delta, kSmallestNodeStep);
            }
        }
    }
    Progress("Finishing ...", n, n);
    return 1;
}

int CIterativtoolDlg::OptimizeStep2() {
    if (!m_Paperprof || !CorrectableTable(*m_Paperprof)) return 0;
    CProfil& p = *m_Paperprof;
    const int n = p.m_Lut[1].gridPoints;
    p.m_UseMediaWhite[0] = p.m_UseMediaWhite[1] = 0;
    const int steps = 2 * n + kPairs;
    Progress(kStep2Text, 0, steps);
    int counter = 2;

    NodeAccumulators acc;
    if (!acc.Allocate(n, 3)) return kOptimiseOutOfMemory;
    for (int i = 0; i < n; ++i) Progress(kStep2Text, counter++, steps);

    const int channels = DeviceChannels(p);
    CornerWeights weights{};
    for (int pair = 0; pair < kPairs; ++pair) {
        Progress(kStep2Text, counter++, steps);
        for (int yk = 0; yk < kSamples * kSamples; ++yk) {
            const int steps4[4] = {pair / kSamples, pair % kSamples, yk / kSamples, yk % kSamples};
            double percent[7] = {};
            double x[CProfil::kEvalSize] = {};
            for (int c = 0; c < 4; ++c) {
                percent[c] = steps4[c] * kSamplePercent;
                x[c] = steps4[c] * kSampleStep;
            }
            const int w = SampleWeight(percent, m_Params.data());
            if (w == 0) continue;

            const Lab first = ForwardLab(p, x, channels);
            double d[CProfil::kEvalSize];
            TableDevice(p, first, channels, d);
            const Lab back = ForwardLab(p, d, channels);

            double where[CProfil::kEvalSize] = {first.L * kLightnessScale, first.a, first.b};
            double g = LocateNearestNode(p, where, 1);
            if (g <= kOnNode) {
                g = 0.0;
            } else {
                for (double& field : where) field = 0.0;
                where[0] = first.L * kLightnessScale;
                where[1] = first.a;
                where[2] = first.b;
                g = LocateCell(p, where, 1, weights);
            }
            const int i0 = Index(where[0], n), j0 = Index(where[1], n), k0 = Index(where[2], n);
            const bool onNode = g <= kOnNodeAfterSnap;

            const double e = DeltaE(first, back);
            if (e >= kSampleSlack) {
                const Lab target = e > kSampleHalfWayBeyond ? Midpoint(first, back) : first;
                double found[4];
                double foundError = 0.0;
                InverseSearch(p, target.L, target.a, target.b, d, found, foundError);
                double delta[4];
                for (int c = 0; c < 4; ++c) delta[c] = found[c] - d[c];
                if (onNode) {
                    NodeAccumulator& a = acc.At(i0, j0, k0);
                    a.weight += w;
                    for (int c = 0; c < 4; ++c) a.sum[c] += w * delta[c];
                } else {
                    ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int k, double omega) {
                        if (!(omega > 0.0)) return;
                        NodeAccumulator& a = acc.At(i, j, k);
                        a.weight += w;
                        for (int c = 0; c < 4; ++c) a.sum[c] += delta[c] * omega * w;
                    });
                }
            } else if (onNode) {
                // A sample that is already right damps the corrections of its nodes.
                acc.At(i0, j0, k0).weight += w;
            } else {
                ForEachCellCorner(n, i0, j0, k0, weights.data(), [&](int i, int j, int k, double omega) {
                    if (omega > 0.0) acc.At(i, j, k).weight += w * omega;
                });
            }
        }
    }

    for (int i = 0; i < n; ++i) {
        Progress(kStep2Text, counter++, steps);
        for (int j = 0; j < n; ++j) {
            for (int k = 0; k < n; ++k) {
                const NodeAccumulator& a = acc.At(i, j, k);
                if (!(a.weight > 0.0)) continue;
                double average[4];
                for (int c = 0; c < 4; ++c) average[c] = a.sum[c] / a.weight;
                // The raw sums decide, not the averages.
                AddCorrections(p, i, j, k, average, a.sum, kSmallestSum);
            }
        }
    }
    acc.Free();
    Progress("Finished ...", steps, steps);
    return 1;
}

}  // namespace vantrel
