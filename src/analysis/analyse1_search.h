#pragma once

namespace vantrel {

class CProfil;

// Device values (7, on 0..255) with which the profile prints the target Lab (L* unscaled),
// using as few inks as possible: passes 1 to 4 allow one to four inks at growing grid steps,
// each followed by a descent over the inks in use. Channels below 1 count as unused. The
// error of the answer goes to `deltaE`; the answer to `result` (7).
void Analyse1Search(CProfil& profile, const double* target, const double* start, double& deltaE,
                    bool lightnessRule, double* result);

}  // namespace vantrel
