#include "platform/data/propertylist/PropertyListEncoding.h"

#include "platform/base/bytes/BytesAsText.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <array>

namespace qvct {
namespace {

enum class Encoding { utf8, utf16Little, utf16Big };

struct Mark {
    std::string_view bytes;
    Encoding encoding;
    bool isSkipped;
};

Mark markOf(std::string_view bytes) {
    using namespace std::string_view_literals;
    constexpr std::array<Mark, 5> marks = {{{"\xEF\xBB\xBF"sv, Encoding::utf8, true},
                                            {"\xFF\xFE"sv, Encoding::utf16Little, true},
                                            {"\xFE\xFF"sv, Encoding::utf16Big, true},
                                            {"<\0"sv, Encoding::utf16Little, false},
                                            {"\0<"sv, Encoding::utf16Big, false}}};
    const auto* hit = std::find_if(marks.begin(), marks.end(),
                                   [bytes](const Mark& mark) { return bytes.starts_with(mark.bytes); });
    return hit == marks.end() ? Mark{{}, Encoding::utf8, false} : *hit;
}

std::u16string unitsOf(std::span<const std::uint8_t> bytes, Encoding encoding) {
    const std::size_t high = encoding == Encoding::utf16Big ? 0 : 1;
    std::u16string units(bytes.size() / 2, u'\0');
    for (std::size_t i = 0; i < units.size(); ++i)
        units[i] = static_cast<char16_t>(bytes[2 * i + high] << 8U | bytes[2 * i + 1 - high]);
    return units;
}

/// Where the first half of a surrogate pair stands alone; the size when there is none.
std::size_t loneSurrogate(std::u16string_view units) {
    for (std::size_t i = 0; i < units.size(); ++i) {
        const unsigned kind = units[i] & 0xFC00U;
        const bool isPair = kind == 0xD800 && i + 1 < units.size() && (units[i + 1] & 0xFC00U) == 0xDC00;
        if (isPair) {
            ++i;
        } else if (kind == 0xD800 || kind == 0xDC00) {
            return i;
        }
    }
    return units.size();
}

}  // namespace

bool isBinaryPropertyList(std::span<const std::uint8_t> bytes) {
    return textOf(bytes).starts_with("bplist");
}

bool isXmlPropertyList(std::string_view text) {
    const std::size_t start = std::min(text.find_first_not_of(" \t\r\n"), text.size());
    if (!text.substr(start).starts_with('<')) return false;
    const std::size_t end = text.find_first_not_of(" \t\r\n0123456789abcdefABCDEF", start + 1);
    return end == std::string_view::npos || text[end] != '>';
}

std::optional<PropertyListCharacters> PropertyListCharacters::decode(std::span<const std::uint8_t> bytes,
                                                                     PropertyListFault& fault) {
    PropertyListCharacters result;
    result.original_ = textOf(bytes);
    const Mark mark = markOf(result.original_);
    result.skipped_ = mark.isSkipped ? mark.bytes.size() : 0;
    result.original_.remove_prefix(result.skipped_);
    result.isWide_ = mark.encoding != Encoding::utf8;
    if (!result.isWide_) return result;
    const std::u16string units = unitsOf(bytes.subspan(result.skipped_), mark.encoding);
    const std::size_t sound = loneSurrogate(units);
    if (sound < units.size() || bytes.size() % 2 != 0) {
        fault = {kErrorMalformed, result.skipped_ + 2 * sound, "half a character of UTF-16"};
        return std::nullopt;
    }
    result.converted_ = utf8FromUtf16(units);
    return result;
}

std::size_t PropertyListCharacters::byteOffset(std::size_t textOffset) const {
    if (!isWide_) return skipped_ + textOffset;
    std::size_t units = 0;
    for (const char c : text().substr(0, textOffset)) {
        const auto byte = static_cast<unsigned char>(c);
        const bool isContinuation = (byte & 0xC0U) == 0x80;
        units += isContinuation ? 0 : byte >= 0xF0 ? 2 : 1;
    }
    return skipped_ + 2 * units;
}

}  // namespace qvct
