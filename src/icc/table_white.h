#pragma once

namespace vantrel {

class CProfil;

// Evaluates the slot-1 table at the PCS white that the loader has put into the evaluation vector,
// leaving the device values (table units) in the vector. False when no kernel evaluated the table,
// in which case the loader leaves the device paper white as it was.
bool EvaluateTableWhite(CProfil& profile);

}  // namespace vantrel
