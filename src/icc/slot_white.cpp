#include <cmath>
#include <cstring>

#include "icc/profil.h"
#include "icc/table_white.h"
#include "support/rounding.h"

namespace vantrel {

void CProfil::ComputeSlotWhite(int direction, int slot) {
    double* white = m_SlotWhite[slot];
    const std::string& space = m_Lut[slot].colourSpace;
    if (!m_UseMediaWhite[direction]) {
        white[0] = 1.0;
        white[1] = 0.0;
        white[2] = 0.0;
        if (direction == 1) {
            int16_t* paper = m_PaperWhite[1];
            if (space == "CMYK" || space == "4CLR") {
                for (int k = 0; k < 4; ++k) paper[k] = 0;
            } else if (space.compare(0, 3, "RGB") == 0) {
                for (int k = 0; k < 4; ++k) paper[k] = 255;
            } else {
                paper[0] = 255;
                paper[1] = 0;
                paper[2] = 0;
            }
        }
        return;
    }

    const Lab lab = WhiteLab(direction);
    white[0] = lab.L / 100.0;
    white[1] = lab.a;
    white[2] = lab.b;
    if (direction == 0) {
        m_PaperWhite[0][0] = static_cast<int16_t>(RoundHalfUp(lab.L * kLightnessScale));
        m_PaperWhite[0][1] = static_cast<int16_t>(RoundHalfUp(lab.a));
        m_PaperWhite[0][2] = static_cast<int16_t>(RoundHalfUp(lab.b));
        return;
    }

    // The device values of the paper white: the PCS white (in table units) through the table.
    // The encoding follows the direction-0 table; without one, the table's own.
    const bool sixteenBit = SlotHolds(0) ? SixteenBit(0) : SixteenBit(slot);
    const double half = sixteenBit ? 127.5 : 128.0;
    m_Eval[0] = 255.0;
    m_Eval[1] = half;
    m_Eval[2] = half;
    if (m_Lut[slot].type == "MATR" || !SlotHolds(slot) || !EvaluateTableWhite(*this)) return;
    const int channels = m_Lut[slot].outputChannels;
    for (int k = 0; k < channels && k < 20; ++k) {
        double value = m_Eval[k];
        if (SixteenBit(slot)) value /= 257.0;
        m_PaperWhite[1][k] = static_cast<int16_t>(RoundHalfUp(value));
    }
}

}  // namespace vantrel
