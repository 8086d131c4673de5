// The measurement scans of the tool object: the patch with given device values, the paper white,
// and the XYZ-to-Lab conversion they use for files without Lab.
#include <cmath>

#include "analysis/it8_kind.h"
#include "colour/companding.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {

constexpr const char* kScanValues = "Scan IT8 for Values...";
constexpr const char* kScanWhite = "Scan IT8 for White Point...";
constexpr const char* kFinished = "Finished ...";

bool MatchesTarget(const Measured_IT8& it8, const It8Kind& kind, int patch, const double target[7]) {
    switch (kind.device) {
        case It8Kind::kMultiChannel:
            for (int c = 0; c < 6; ++c)
                if (it8.GetChannel(patch, c) != target[c]) return false;
            return !kind.seventhChannel || it8.GetChannel(patch, 6) == target[6];
        case It8Kind::kRgb:
            for (int c = 0; c < 3; ++c)
                if (it8.GetRgb(patch, c) != target[c]) return false;
            return true;
        case It8Kind::kCmyk:
            for (int c = 0; c < 4; ++c)
                if (it8.GetCmyk(patch, c) != target[c]) return false;
            return true;
        case It8Kind::kNoDevice:
            break;
    }
    return false;
}

bool IsWhite(const Measured_IT8& it8, const It8Kind& kind, int patch) {
    static constexpr double kNoInk[7] = {0, 0, 0, 0, 0, 0, 0};
    static constexpr double kFullRgb[7] = {255, 255, 255, 0, 0, 0, 0};
    // Paper carries no ink; a trace of black below 1 % still counts as paper.
    if (kind.device == It8Kind::kCmyk)
        return it8.GetCmyk(patch, 0) == 0.0 && it8.GetCmyk(patch, 1) == 0.0 && it8.GetCmyk(patch, 2) == 0.0 &&
               it8.GetCmyk(patch, 3) < 1.0;
    return MatchesTarget(it8, kind, patch, kind.device == It8Kind::kRgb ? kFullRgb : kNoInk);
}


}  // namespace

Lab CIterativtoolDlg::PatchLab(const Measured_IT8& it8, int patch, bool fromXyz) const {
    if (fromXyz) return MeasuredXyzToLab(it8.GetXyz(patch, 0), it8.GetXyz(patch, 1), it8.GetXyz(patch, 2));
    return Lab{it8.GetLab(patch, 0), it8.GetLab(patch, 1), it8.GetLab(patch, 2)};
}

Lab CIterativtoolDlg::ScanIt8ForValues(const Measured_IT8& it8, const double target[7]) const {
    const int n = it8.PatchCount();
    if (n < 1) return Lab{};
    const It8Kind kind = ProbeIt8Kind(it8, kScanProbePatch);
    if (kind.device == It8Kind::kNoDevice) return Lab{};

    Progress(kScanValues, 0, n);
    for (int i = 0; i < n; ++i) {
        if (Progress(kScanValues, i + 1, n) != 0) return Lab{};
        if (!MatchesTarget(it8, kind, i, target)) continue;
        const Lab found = PatchLab(it8, i, kind.colourFromXyz);
        Progress(kFinished, 1, 1);
        return found;
    }
    Progress(kFinished, 1, 1);
    return Lab{};
}

Lab CIterativtoolDlg::ScanIt8ForWhitePoint(const Measured_IT8& it8) const {
    const int n = it8.PatchCount();
    if (n < 1) return Lab{};
    const It8Kind kind = ProbeIt8Kind(it8, kScanProbePatch);
    if (kind.device == It8Kind::kNoDevice) return Lab{};

    Lab sum;
    int count = 0;
    Progress(kScanWhite, 0, n);
    for (int i = 0; i < n; ++i) {
        Progress(kScanWhite, i + 1, n);  // the white point scan runs to the end
        if (!IsWhite(it8, kind, i)) continue;
        const Lab lab = PatchLab(it8, i, kind.colourFromXyz);
        sum.L += lab.L;
        sum.a += lab.a;
        sum.b += lab.b;
        ++count;
    }
    Progress(kFinished, 1, 1);
    if (count > 0) {
        sum.L /= count;
        sum.a /= count;
        sum.b /= count;
    }
    return sum;
}

Lab CIterativtoolDlg::MeasuredXyzToLab(double X, double Y, double Z) const {
    X /= 100.0;
    Y /= 100.0;
    Z /= 100.0;
    for (const CProfil* profile : {m_Outprof.get(), m_Paperprof.get(), m_Refprof.get(), m_ISDprof.get()}) {
        if (profile && profile->HoldsTables()) return profile->XYZToLab(X, Y, Z);
    }
    // No profile loaded: D50 and the plain CIE formula.
    const double fx = CieFExact(X / kD50White[0]);
    const double fy = CieFExact(Y / kD50White[1]);
    const double fz = CieFExact(Z / kD50White[2]);
    return Lab{116.0 * fy - 16.0, 500.0 * (fx - fy), 200.0 * (fy - fz)};
}

}  // namespace vantrel
