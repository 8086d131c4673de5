#pragma once

#include <string>

namespace vantrel {

// Reads up to `limit` whole numbers, one a line, from a parameter file into values.
// "#" lines and empty lines are skipped, as is a line that does not start with a
// number; a number is truncated toward zero. Returns how many values were stored;
// a file that cannot be opened stores none.
int ReadParameterFile(const std::string& path, int* values, int limit);

// The same from the fixed parameter file, which is read only when it can be trusted (see
// platform::OpenFixedFile).
int ReadFixedParameterFile(int* values, int limit);

}  // namespace vantrel
