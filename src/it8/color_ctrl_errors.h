#pragma once

#include <cstdint>

namespace vantrel {

// Failure codes of the measurement-file reader and writer. Callers compare against the
// numbers, so they are fixed.
enum eColorCtrlErrors : int32_t {
    // Writer.
    kIt8WriteNoRecords = -2194,     // no record array given
    kIt8WriteCannotCreate = -2195,  // the file cannot be created

    // Reader.
    kIt8CannotOpen = -2370,         // the file cannot be opened
    kIt8NoSets = -2369,             // NUMBER_OF_SETS is 0 or absent
    kIt8NoFieldNames = -2368,       // no field names before BEGIN_DATA
    kIt8NoDataBlock = -2367,        // no BEGIN_DATA line
    kIt8EndsInDataBlock = -2366,    // the text ends before END_DATA
    kIt8TooFewSets = -2365,         // END_DATA before NUMBER_OF_SETS rows
    kIt8RowFieldCount = -2364,      // a row with a number of values other than the field count
    kIt8TooManySets = -2359,        // the line after the last announced row is not END_DATA
};

}  // namespace vantrel
