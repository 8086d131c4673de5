#pragma once

namespace vantrel {

class CIterativtoolDlg;

// Results of optimize1 besides 0 (done) and 1 (null handle, checked by the export).
inline constexpr int kOptimize1BadArgument = -1;  // no profile name
// Nothing could be measured (a table missing, or no memory for the first measurement): nothing
// written, the out-parameters untouched.
inline constexpr int kOptimize1NotLoaded = 2;
inline constexpr int kOptimize1NotWritten = 3;    // measured and corrected, but the file could not take the table
inline constexpr int kOptimize1OutOfMemory = 4;   // a step could not get its memory; the kept state was written

// The optimize1 export on a valid tool object: loads the paper profile, improves its
// PCS-to-device table (OptimizeOutputProfile), hands back the mean and maximum round-trip error
// x 1000 (null pointers are not written) and writes the table back into the file in place.
int Optimize1(CIterativtoolDlg& tool, const char* paperProfile, int* out1, int* out2);

}  // namespace vantrel
