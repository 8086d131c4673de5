#include <cmath>
#include <cstring>

#include "colour/companding.h"
#include "icc/icc_bytes.h"
#include "icc/icc_layout.h"
#include "icc/profil.h"

namespace vantrel {
namespace {

constexpr size_t kIlluminantAt = icc::Header::kIlluminant;

}  // namespace

void CProfil::SetCmmType(const char* fourChars) {
    if (!fourChars) return;
    for (int k = 0; k < 4 && fourChars[k]; ++k) m_Header[icc::Header::kCmmType + k] = static_cast<uint8_t>(fourChars[k]);
}

void CProfil::SetDeviceClass(int kind) {
    const char* name = kind == 0 ? "mntr" : kind == 1 ? "prtr" : kind == 2 ? "scnr" : nullptr;
    if (name) std::memcpy(m_Header + icc::Header::kDeviceClass, name, 4);
}

uint32_t CProfil::IlluminantX() const { return LoadU32(m_Header + kIlluminantAt); }
uint32_t CProfil::IlluminantY() const { return LoadU32(m_Header + kIlluminantAt + 4); }
uint32_t CProfil::IlluminantZ() const { return LoadU32(m_Header + kIlluminantAt + 8); }

void CProfil::SetIlluminant(uint32_t x, uint32_t y, uint32_t z) {
    StoreU32(m_Header + kIlluminantAt, x & 0xFFFF);
    StoreU32(m_Header + kIlluminantAt + 4, y);
    StoreU32(m_Header + kIlluminantAt + 8, z);
}

void CProfil::SetMediaWhite(int direction, char axis, double value) {
    if (!ValidDirection(direction)) return;
    const int index = axis == 'X' || axis == 'x' ? 0 : axis == 'Y' || axis == 'y' ? 1 : axis == 'Z' || axis == 'z' ? 2 : -1;
    if (index >= 0) m_MediaWhite[direction][index] = value;
}

Lab CProfil::WhiteLab(int direction) const {
    if (!ValidDirection(direction)) return {};
    const double* white = m_MediaWhite[direction];
    const double* illuminant = m_Illuminant[direction];
    if (illuminant[0] == 0 || illuminant[1] == 0 || illuminant[2] == 0) return {};
    const double fx = WhitePointF(white[0] / illuminant[0]);
    const double fy = WhitePointF(white[1] / illuminant[1]);
    const double fz = WhitePointF(white[2] / illuminant[2]);
    return {116.0 * fy - 16.0, 500.0 * (fx - fy), 200.0 * (fy - fz)};
}

double CProfil::WhiteL(int direction) const { return WhiteLab(direction).L; }
double CProfil::WhiteA(int direction) const { return WhiteLab(direction).a; }
double CProfil::WhiteB(int direction) const { return WhiteLab(direction).b; }

void CProfil::SetSlotWhite(int direction, int index, double value) {
    if (!ValidDirection(direction)) return;
    m_SlotWhite[direction][index] = value;
    MediaWhiteFromSlotWhite(direction);
}

void CProfil::SetWhiteL(int direction, double lOver100) { SetSlotWhite(direction, 0, lOver100); }
void CProfil::SetWhiteA(int direction, double a) { SetSlotWhite(direction, 1, a); }
void CProfil::SetWhiteB(int direction, double b) { SetSlotWhite(direction, 2, b); }

void CProfil::MediaWhiteFromSlotWhite(int direction) {
    const double L = 100.0 * m_SlotWhite[direction][0];
    const double fy = (L + 16.0) / 116.0;
    const double fx = fy + m_SlotWhite[direction][1] / 500.0;
    const double fz = fy - m_SlotWhite[direction][2] / 200.0;
    m_MediaWhite[direction][0] = fx * fx * fx * (IlluminantX() / 65536.0);
    m_MediaWhite[direction][1] = fy * fy * fy * (IlluminantY() / 65536.0);
    m_MediaWhite[direction][2] = fz * fz * fz * (IlluminantZ() / 65536.0);
}

int64_t CProfil::FindWhitePointOffset(int direction, const std::string& path) {
    if (!ValidDirection(direction)) return -1;
    IccBytes file;
    if (!file.Load(path)) return -1;
    return FindXyzData(file, "wtpt");
}

}  // namespace vantrel
