#pragma once

namespace vantrel {

class CIterativtoolDlg;

// Rebuilds the four tables of the CMYK profile held by the paper slots (colorimetric pair in
// m_Paperprof, perceptual pair in m_PaperprofPerceptual) so that they separate colours as the
// multi-colourant reference in m_Refprof does, its extra colourants folded into CMYK: every
// node of each direction-1 table becomes the folded reference separation of the colour the
// node stands for, and every node of each direction-0 table the colour that folded separation
// prints. Sets m_UseIntent0. A pair that does not hold both tables is left as it is.
// False, with nothing changed, when the reference has no direction-1 table or the colorimetric
// pair is not a whole CMYK profile (four device channels on both sides).
bool MergeIntoCmyk(CIterativtoolDlg& tool);

// The mergeMCHintoCMYK export's work on a valid tool object: loads the three slots from the
// names, merges, and writes the result into a copy of the CMYK profile at outProfile. 0 when
// the copy was written; -1 when a name is missing, the profiles cannot be merged or the copy
// cannot be written (outProfile then is not created or not patched).
int MergeMchIntoCmyk(CIterativtoolDlg& tool, const char* refProfile, const char* paperProfile, const char* outProfile);

}  // namespace vantrel
