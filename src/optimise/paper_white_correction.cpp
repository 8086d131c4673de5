// The paper profile's media white moved toward the paper the proof was measured on.
#include "colour/colour_math.h"
#include "interface/tool_object.h"
#include "optimise/white_correction.h"

namespace vantrel {
namespace {

constexpr int kMaxGrid = 100;
// Whites closer than this are the same paper.
constexpr double kSamePaper = 0.1;
// Up to this difference only a share of the correction is applied (half of it at 1 ΔE).
constexpr double kFullStepFrom = 2.0;

bool Given(const std::string& name) { return !name.empty() && name != kNoProfileSelected; }

}  // namespace

int CIterativtoolDlg::CorrectPaperWhite() {
    if (!m_Paperprof) return 0;
    CProfil& paper = *m_Paperprof;
    const int n = paper.m_Lut[1].gridPoints;
    if (n < 1 || n > kMaxGrid) return 0;
    if (ChooseTargetWhite() == 1) return 1;
    if (!Given(m_PaperName)) return 1;

    paper.m_UseMediaWhite[0] = paper.m_UseMediaWhite[1] = 0;
    const double e = DeltaE(m_RefWhite, m_MeasWhite);
    const double share = e <= kFullStepFrom ? e / 2 : 1.0;
    if (m_RefWhite.L != 0.0 && m_MeasWhite.L != 0.0 && e > kSamePaper) {
        const Lab corrected = WhiteCorrection(paper, m_PaperWhite, m_RefWhite, m_MeasWhite, paper.m_Precision[1]);
        paper.SetWhiteL(1, ((1 - share) * m_PaperWhite.L + share * corrected.L) / 100);
        paper.SetWhiteA(1, (1 - share) * m_PaperWhite.a + share * corrected.a);
        paper.SetWhiteB(1, (1 - share) * m_PaperWhite.b + share * corrected.b);
        // The next run starts from the full correction, not from the blend.
        m_PaperWhite = corrected;
        m_WriteExtra = 1;
    }
    return 1;
}

}  // namespace vantrel
