#pragma once

namespace vantrel {

class CIterativtoolDlg;

// The analyse3 export's work on a valid tool object. With a 3CC profile or device link named: the
// merged analysis of the reference and the measurement (in profiling mode with link correction,
// calibration runs numbered by "_cal<N>" in the measurement name); with only a measurement: its
// repeatability. *out1, *out2 get mean and maximum x 1000, or 255000 and 300000 when the analysis
// stopped before it had them. Null names count as empty; null out-parameters are not written.
// Returns 0.
int Analyse3(CIterativtoolDlg& tool, const char* paperProfile, const char* outprof3CC, const char* referenceIT8,
             const char* measIT8, int* out1, int* out2);

// The run number that follows the first "_cal" of a measurement name (0 without digits), or -1
// when the name has no "_cal".
int CalibrationRun(const char* name);

}  // namespace vantrel
