#pragma once

#include <cstddef>
#include <cstdint>
#include <locale>
#include <string>

#include "it8/patch_record.h"

namespace vantrel {

// Writes setCount records as a CGATS file in one of four layouts chosen by the first record's
// kind, numbers formatted with `numbers`. Measured_IT8::WriteIt8 resolves its set count and the
// user's locale and comes here. Results as WriteIt8.
int32_t WriteCgats(const std::string& path, const PatchRecord* records, std::size_t recordCount,
                   int32_t setCount, int32_t strips, int32_t columns, int32_t borderFlag,
                   const std::locale& numbers);

}  // namespace vantrel
