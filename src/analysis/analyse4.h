#pragma once

namespace vantrel {

class CIterativtoolDlg;

// The analyse4 export's work on a valid tool object: judges the measurement of a proof against a
// reference measurement or, without one, against the reference profile's predictions. When the
// fixed ISD path holds a profile of one of the two known sizes, the measurement file is first
// replaced on disk by its copy through that profile. out1..out4 get mean, maximum, paper-white
// difference and in-gamut percentage x 1000; an analysis that stops before it has a mean and a
// maximum gives 255000, 300000, the white difference and 0. An empty measurement name does nothing
// and writes no output. Null names count as empty; null out-parameters are not written. Returns 0.
int Analyse4(CIterativtoolDlg& tool, const char* paperProfile, const char* refProfile, const char* referenceIT8,
             const char* measIT8, int* out1, int* out2, int* out3, int* out4);

}  // namespace vantrel
