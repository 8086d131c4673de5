// The 3CC correction profile's table carried from the measured paper white to the wanted one.
#include "colour/colour_math.h"
#include "eval/pcs_encoding.h"
#include "eval/table_nodes.h"
#include "interface/tool_object.h"
#include "optimise/white_correction.h"

namespace vantrel {
namespace {

constexpr int kMaxGrid = 100;
// Whites closer than this need no correction of the whole table.
constexpr double kSamePaper = 0.2;
constexpr double kFullStepFrom = 2.0;
constexpr const char* kWhiteText = "Correcting White Point in 3CC...";

}  // namespace

int CIterativtoolDlg::CorrectOutprofWhite() {
    if (!m_Outprof) return 0;
    CProfil& table = *m_Outprof;
    const int n = table.m_Lut[1].gridPoints;
    if (n < 1 || n > kMaxGrid) return 0;
    // The 3CC follows the chosen white for every option.
    ChooseTargetWhite();
    table.m_UseMediaWhite[0] = table.m_UseMediaWhite[1] = 0;
    const double e = DeltaE(m_MeasWhite, m_RefWhite);
    const double share = e <= kFullStepFrom ? e / 2 : 1.0;
    const bool named = !m_OutprofName.empty() && m_OutprofName != kNo3ccSelected;
    if (!named || m_RefWhite.L == 0.0 || m_MeasWhite.L == 0.0 || !(e > kSamePaper)) return 1;
    if (table.m_Lut[1].inputChannels != 3 || table.m_Lut[1].outputChannels < 3) return 1;

    Progress(kWhiteText, 0, n);
    int counter = 0;
    for (int i = 0; i < n; ++i) {
        Progress(kWhiteText, ++counter, n);
        for (int j = 0; j < n; ++j) {
            for (int k = 0; k < n; ++k) {
                double record[CProfil::kEvalSize] = {};
                record[4] = i;
                record[5] = j;
                record[6] = k;
                ReadNodeLab(table, record, 1, false);
                const Lab v{record[0] / kLightnessScale, record[1], record[2]};
                const Lab w = WhiteCorrection(table, v, m_MeasWhite, m_RefWhite, table.m_Precision[1]);
                record[0] = ((1 - share) * v.L + share * w.L) * kLightnessScale;
                record[1] = (1 - share) * v.a + share * w.a;
                record[2] = (1 - share) * v.b + share * w.b;
                WriteNodeLab(table, record, 1);
            }
        }
    }
    return Progress("Finished ...", n, n) != 0 ? 0 : 1;
}

}  // namespace vantrel
