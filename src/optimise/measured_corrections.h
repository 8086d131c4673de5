#pragma once

namespace vantrel {

class CIterativtoolDlg;

// Results of optimize2 and optimize3 besides 0 (done, also after a stop request: what was
// corrected until then is written) and 1 (null handle, checked by the export).
inline constexpr int kMeasuredBadArgument = -1;  // no file name
// The profile to correct has no direction-1 table (missing file, tag or memory): nothing
// written, the out-parameters and the names the next call uses untouched.
inline constexpr int kMeasuredNotLoaded = 2;
inline constexpr int kMeasuredNotWritten = 3;     // the result file could not be written
inline constexpr int kMeasuredOutOfMemory = 4;    // no memory for the accumulators: table unchanged, written
// Nothing to correct from: no measurement, patch counts that differ or a reference without
// device columns. The table is written unchanged (a white correction still applies).
inline constexpr int kMeasuredNothingToCorrect = 5;

// The optimize2 export on a valid tool object: corrects the paper profile named by the last
// call (m_PaperName) from the measurements analyse4 left, writes it as a copy to outProfile and
// makes that the paper profile of the next call. *out1 = 255000, *out2 = 300000 (null pointers
// are not written).
int Optimize2(CIterativtoolDlg& tool, const char* outProfile, int* out1, int* out2, int option);

// The optimize3 export on a valid tool object: corrects the 3CC correction profile outprof3CC
// in place from the same measurements. Outs as Optimize2.
int Optimize3(CIterativtoolDlg& tool, const char* outprof3CC, int* out1, int* out2, int option);

// What the exports report after a correction that returned `corrected`: 0, kMeasuredOutOfMemory
// or kMeasuredNothingToCorrect.
int MeasuredResult(const CIterativtoolDlg& tool, int corrected);

}  // namespace vantrel
