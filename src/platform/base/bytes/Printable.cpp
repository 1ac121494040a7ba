#include "platform/base/bytes/Printable.h"

#include "platform/base/bytes/Utf8.h"

#include <cstdint>

#include <fmt/format.h>
#include <unicode/uchar.h>

namespace qvct {

std::string printable(std::string_view text) {
    std::string result;
    const auto length = static_cast<int32_t>(text.size());
    for (int32_t i = 0; i < length;) {
        const int32_t start = i;
        const UChar32 c = nextCharacter(text, i, length);
        const std::string_view bytes =
            text.substr(static_cast<std::size_t>(start), static_cast<std::size_t>(i - start));
        if (c >= 0 && u_isprint(c)) {
            result += bytes;
        } else {
            for (const char byte : bytes)
                result += fmt::format("\\x{:02x}", static_cast<unsigned char>(byte));
        }
    }
    return result;
}

}  // namespace qvct
