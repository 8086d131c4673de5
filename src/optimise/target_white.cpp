// The paper white the measurement-driven corrections aim at.
#include "colour/colour_math.h"
#include "eval/gamut_record.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {

constexpr double kLighter = 3.0;
constexpr double kFullWhiteFrom = 97.0;

}  // namespace

int CIterativtoolDlg::ChooseTargetWhite() {
    if (m_OptimizeOption == 1) {
        m_RefWhite = m_PaperWhite;
        m_RefWhite.L = m_PaperWhite.L >= kFullWhiteFrom ? 100.0 : m_PaperWhite.L + kLighter;
        return 1;
    }
    if (m_OptimizeOption == 2) {
        m_RefWhite = m_MeasWhite;
        return 1;
    }
    if (m_PaperName.empty() || m_PaperName == kNoProfileSelected || !m_Paperprof) return 0;
    if (IsInGamut(m_Gamut, m_RefWhite.L, m_RefWhite.a, m_RefWhite.b)) return 0;
    // A white the paper cannot reach: take whichever reachable white lies nearest to it.
    const Lab reproduced = ReproducedLab(*m_Paperprof, m_RefWhite.L, m_RefWhite.a, m_RefWhite.b);
    const double toMeasured = DeltaE(m_RefWhite, m_MeasWhite);
    const double toPaper = DeltaE(m_RefWhite, m_PaperWhite);
    const double toReproduced = DeltaE(m_RefWhite, reproduced);
    if (toMeasured <= toPaper) {
        m_RefWhite = toReproduced <= toMeasured ? reproduced : m_MeasWhite;
    } else {
        m_RefWhite = toReproduced <= toPaper ? reproduced : m_PaperWhite;
    }
    return 0;
}

}  // namespace vantrel
