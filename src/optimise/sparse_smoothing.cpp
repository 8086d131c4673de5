#include "optimise/sparse_smoothing.h"

#include "eval/interpolation.h"
#include "eval/table_nodes.h"
#include "icc/profil.h"
#include "optimise/node_accumulator.h"

namespace vantrel {
namespace {

constexpr double kReached = 1.0;
constexpr double kOwnWeight = 25.0;
constexpr double kDivisor = 52.0;
constexpr int kSweeps = 8;

// Node (i, j, k) of slot 1 read through the record's index fields 4..6, without output curves.
void ReadLab(CProfil& p, int i, int j, int k, double* record) {
    record[4] = i;
    record[5] = j;
    record[6] = k;
    ReadNodeLab(p, record, 1, false);
}

}  // namespace

int SmoothSparseNodes(CProfil& p, const NodeAccumulators& acc, ProgressCallback progress) {
    const LutView t = SlotView(p, 1);
    const int n = t.grid;
    if (t.inputs != 3 || t.outputs < 3 || acc.Grid() != n || acc.Size() != static_cast<std::size_t>(n) * n * n)
        return 1;
    const int steps = 8 * n - 16;
    int counter = 0;
    auto report = [&](int step) { return progress ? progress("Smoothing ...", step, steps) : 0; };
    if (report(counter) != 0) return 0;

    for (int sweep = 0; sweep < kSweeps; ++sweep) {
        // Sweep bits: i runs down when bit 0 is set, j when bit 1, k when bit 2.
        auto index = [&](int step, int bit) { return (sweep >> bit & 1) ? n - 2 - step : 1 + step; };
        for (int si = 0; si < n - 2; ++si) {
            if (report(counter++) != 0) return 0;
            const int i = index(si, 0);
            for (int sj = 0; sj < n - 2; ++sj) {
                const int j = index(sj, 1);
                for (int sk = 0; sk < n - 2; ++sk) {
                    const int k = index(sk, 2);
                    if (acc.At(i, j, k).weight >= kReached) continue;
                    double record[CProfil::kEvalSize] = {};
                    ReadLab(p, i, j, k, record);
                    double sum[3] = {kOwnWeight * record[0], kOwnWeight * record[1], kOwnWeight * record[2]};
                    for (int di = -1; di <= 1; ++di)
                        for (int dj = -1; dj <= 1; ++dj)
                            for (int dk = -1; dk <= 1; ++dk) {
                                double neighbour[CProfil::kEvalSize] = {};
                                ReadLab(p, i + di, j + dj, k + dk, neighbour);
                                for (int c = 0; c < 3; ++c) sum[c] += neighbour[c];
                            }
                    double out[CProfil::kEvalSize] = {sum[0] / kDivisor, sum[1] / kDivisor, sum[2] / kDivisor};
                    out[4] = i;
                    out[5] = j;
                    out[6] = k;
                    WriteNodeLab(p, out, 1);
                }
            }
        }
    }
    return 1;
}

}  // namespace vantrel
