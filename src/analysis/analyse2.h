#pragma once

namespace vantrel {

class CIterativtoolDlg;

// The analyse2 export's work on a valid tool object: loads the ISD profile, reads the measurement,
// runs the ISD analysis and copies its result (or the measurement itself) to outIT8. Null names
// count as empty; null out-parameters are not written. Returns 0.
int Analyse2(CIterativtoolDlg& tool, const char* isdProfile, const char* outIT8, const char* measIT8, int* out1,
             int* out2);

}  // namespace vantrel
