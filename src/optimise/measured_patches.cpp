#include "optimise/measured_patches.h"

#include <algorithm>

#include "colour/colour_math.h"
#include "eval/forward.h"
#include "eval/gamut_record.h"
#include "eval/pcs_encoding.h"
#include "interface/tool_object.h"

namespace vantrel {
namespace {


bool Named(const std::string& name) { return !name.empty() && name != kNoFileSelected; }

}  // namespace

int PairedPatchCount(const CIterativtoolDlg& tool) {
    if (!Named(tool.m_MeasIT8Name) || !tool.m_MeasIT8) return -1;
    const int reference = Named(tool.m_ReferenceIT8Name) && tool.m_ReferenceIT8 ? tool.m_ReferenceIT8->PatchCount() : 0;
    return reference == tool.m_MeasIT8->PatchCount() ? reference : -1;
}

PatchColumns ProbePatchColumns(const CIterativtoolDlg& tool) {
    PatchColumns columns;
    if (!tool.m_ReferenceIT8 || !tool.m_MeasIT8) return columns;
    const Measured_IT8& reference = *tool.m_ReferenceIT8;
    const int patches = reference.PatchCount();
    if (patches < 1) return columns;
    columns.referenceFromXyz = It8ColourFromXyz(reference, 0);
    columns.measuredFromXyz = It8ColourFromXyz(*tool.m_MeasIT8, 0);
    // A one-patch file is probed on that patch, not past its end.
    const It8Kind kind = ProbeIt8Kind(reference, patches > 1 ? kScanProbePatch : 0);
    columns.device = kind.device;
    switch (kind.device) {
        case It8Kind::kMultiChannel: columns.channels = kind.seventhChannel ? 7 : 6; break;
        case It8Kind::kCmyk: columns.channels = 4; break;
        case It8Kind::kRgb: columns.channels = 3; break;
        case It8Kind::kNoDevice: break;
    }
    return columns;
}

void PatchDevice(const CIterativtoolDlg& tool, const PatchColumns& columns, int patch, double x[7]) {
    const Measured_IT8& reference = *tool.m_ReferenceIT8;
    std::fill(x, x + 7, 0.0);
    for (int c = 0; c < columns.channels; ++c) {
        switch (columns.device) {
            case It8Kind::kMultiChannel: x[c] = reference.GetChannel(patch, c); break;
            case It8Kind::kCmyk: x[c] = reference.GetCmyk(patch, c); break;
            case It8Kind::kRgb: x[c] = reference.GetRgb(patch, c); break;
            case It8Kind::kNoDevice: break;
        }
    }
}

Lab PredictedScaledLab(CProfil& reference, const PatchColumns& columns, const double x[7]) {
    double v[CProfil::kEvalSize] = {};
    const double scale = columns.device == It8Kind::kRgb ? 1.0 : kPercentToDevice;
    for (int c = 0; c < columns.channels; ++c) v[c] = x[c] * scale;
    if (columns.channels >= 4 && v[3] < 0.0) v[3] = 0.0;
    DeviceToLab(reference, v, columns.channels);
    return {v[0], v[1], v[2]};
}

Lab ReachableTarget(const CIterativtoolDlg& tool, CProfil& paper, bool gamutKnown, const Lab& wanted,
                    const Lab& measured) {
    if (!gamutKnown || IsInGamut(tool.m_Gamut, wanted.L, wanted.a, wanted.b)) return wanted;
    const Lab reproduced = ReproducedLab(paper, wanted.L, wanted.a, wanted.b);
    return DeltaE(measured, wanted) <= DeltaE(reproduced, wanted) ? measured : reproduced;
}

}  // namespace vantrel
