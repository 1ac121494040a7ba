#pragma once

#include <cstdint>
#include <string_view>

#include <unicode/utf8.h>

namespace qvct {

// The macros of ICU convert without casts.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wconversion"
/// The character at `i`, which moves behind it; negative for malformed bytes.
inline UChar32 nextCharacter(std::string_view text, int32_t& i, int32_t end) {
    UChar32 c = 0;
    U8_NEXT(text.data(), i, end, c);
    return c;
}

/// The character before `i`, which moves in front of it.
inline UChar32 previousCharacter(std::string_view text, int32_t start, int32_t& i) {
    UChar32 c = 0;
    U8_PREV(text.data(), start, i, c);
    return c;
}
#pragma GCC diagnostic pop

}  // namespace qvct
