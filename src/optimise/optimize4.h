#pragma once

namespace vantrel {

class CIterativtoolDlg;

// Results of optimize4 besides 0 (done) and 1 (null handle, checked by the export).
inline constexpr int kOptimize4BadArgument = -1;  // no link name
// The link's table could not be loaded: nothing corrected or written, the buffer untouched.
inline constexpr int kOptimize4NotLoaded = 2;
inline constexpr int kOptimize4NotWritten = 3;  // corrected, but the file could not take the table
// The accumulators could not be had: the link is left as it was (and written back unchanged).
inline constexpr int kOptimize4OutOfMemory = 4;

// Fills the forward table of the printer model in m_Paperprof (the link's own file, loaded in
// its place) with the reference colours at the link nodes the chart's patches fall on; the
// media white of both directions becomes m_RefWhite.
void FillModelFromMeasurement(CIterativtoolDlg& tool);

// Moves the link's output at the nodes of the black = 0, extra = 0 plane that chart patches fall
// on, so that the model predicts the reference colour for what the link prints; later
// calibration runs step by (2/3)^(run - 1). With allWeights 0 only mixtures correct the link.
// 1 done (also when the measurements do not pair up: nothing changes then); 0 for a grid outside
// 1..100, no device columns or a stop request; kOptimize4OutOfMemory when the accumulators
// cannot be had (nothing changed).
int OptimizeLink(CIterativtoolDlg& tool, int allWeights);

// The optimize4 export on a valid tool object: loads the link (and the paper profile, or the
// link itself as the model), corrects it from the measurements the last analyse3 left, writes
// its table back in place and, for three-input links, into the host's buffer (which must hold
// 13 + 3 g^3 words; null skips it). out1/out2 get 255000 and 300000 (null pointers skipped).
int Optimize4(CIterativtoolDlg& tool, const char* outprof3CC, int* out1, int* out2, unsigned short* table,
              const char* paperProfile, int option);

}  // namespace vantrel
