#pragma once

#include <cstdint>

namespace qvct {

/// One note of a loop. Times are in beats from the start of the analysed span.
struct Note {
    double startTime = 0;
    double endTime = 0;
    std::int32_t pitch = 0;     ///< MIDI note number.
    std::int32_t velocity = 0;  ///< 0 to 127.
};

}  // namespace qvct
