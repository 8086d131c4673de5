#pragma once
// The chart patches the measurement-driven corrections work through: the device values and the
// wanted colours of the reference measurement paired by index with the measured colours.

#include "analysis/it8_kind.h"
#include "colour/colour_values.h"

namespace vantrel {

class CIterativtoolDlg;
class CProfil;

// How the two files carry their patches.
struct PatchColumns {
    It8Kind::Device device = It8Kind::kNoDevice;
    int channels = 0;  // 4 CMYK, 3 RGB, 6 or 7 multi-channel
    bool referenceFromXyz = false;
    bool measuredFromXyz = false;
};

// The number of paired patches, or -1 when there is nothing to pair: no measurement named, or
// the two files (the reference counted as empty when none is named) hold different counts.
int PairedPatchCount(const CIterativtoolDlg& tool);

// Colours from Lab unless the first patch of a file has none (then from XYZ); device values as
// the reference's second patch (its first, in a one-patch file) carries them.
PatchColumns ProbePatchColumns(const CIterativtoolDlg& tool);

// The reference's device values of `patch` into x[0..6]: CMYK and multi-channel in percent,
// RGB as the file holds them (0..255); channels the file does not have are 0.
void PatchDevice(const CIterativtoolDlg& tool, const PatchColumns& columns, int patch, double x[7]);

// The colour the reference profile predicts for the device values x (as PatchDevice gives them)
// as scaled Lab, absolute when the profile's direction 0 uses the media white. A negative black
// counts as none.
Lab PredictedScaledLab(CProfil& reference, const PatchColumns& columns, const double x[7]);

// A wanted colour the paper cannot print is replaced by whichever is nearer to it: the measured
// colour or what the paper profile reproduces for it. `gamutKnown` false keeps the colour.
Lab ReachableTarget(const CIterativtoolDlg& tool, CProfil& paper, bool gamutKnown, const Lab& wanted,
                    const Lab& measured);

}  // namespace vantrel
