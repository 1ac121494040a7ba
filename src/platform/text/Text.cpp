#include "platform/text/Text.h"

#include "platform/base/bytes/Utf8.h"

#include <algorithm>
#include <charconv>
#include <memory>

#include <fmt/format.h>
#include <unicode/brkiter.h>
#include <unicode/coll.h>
#include <unicode/locid.h>
#include <unicode/normalizer2.h>
#include <unicode/uchar.h>
#include <unicode/unistr.h>

namespace qvct {
namespace {

icu::StringPiece piece(std::string_view text) {
    return {text.data(), static_cast<int32_t>(text.size())};
}

icu::UnicodeString unicode(std::string_view text) {
    return icu::UnicodeString::fromUTF8(piece(text));
}

std::string utf8(const icu::UnicodeString& text) {
    std::string result;
    text.toUTF8String(result);
    return result;
}

const icu::Collator& userCollator() {
    static const auto collator = [] {
        UErrorCode status = U_ZERO_ERROR;
        return std::unique_ptr<icu::Collator>(
            icu::Collator::createInstance(icu::Locale(userLocaleName().c_str()), status));
    }();
    return *collator;
}

/// Case-folded, decomposed, without combining marks: what a search without regard to both compares.
icu::UnicodeString withoutCaseAndDiacritics(std::string_view text) {
    UErrorCode status = U_ZERO_ERROR;
    const icu::Normalizer2* decomposition = icu::Normalizer2::getNFDInstance(status);
    const icu::UnicodeString decomposed = decomposition->normalize(unicode(text).foldCase(), status);
    icu::UnicodeString base;
    for (int32_t i = 0; i < decomposed.length();) {
        const UChar32 c = decomposed.char32At(i);
        i += U16_LENGTH(c);
        if (u_charType(c) != U_NON_SPACING_MARK) base.append(c);
    }
    return base.foldCase();
}

template <typename IsTrimmed>
std::string_view trim(std::string_view text, IsTrimmed isTrimmed) {
    const auto length = static_cast<int32_t>(text.size());
    int32_t first = 0;
    int32_t last = length;
    while (first < last) {
        int32_t next = first;
        const UChar32 c = nextCharacter(text, next, last);
        if (c < 0 || !isTrimmed(c)) break;
        first = next;
    }
    while (last > first) {
        int32_t before = last;
        const UChar32 c = previousCharacter(text, first, before);
        if (c < 0 || !isTrimmed(c)) break;
        last = before;
    }
    return text.substr(static_cast<std::size_t>(first), static_cast<std::size_t>(last - first));
}

/// ICU's "\w".
bool isWordCharacter(UChar32 c) {
    constexpr UChar32 zeroWidthNonJoiner = 0x200C;
    constexpr UChar32 zeroWidthJoiner = 0x200D;
    constexpr uint32_t wordCategories = U_GC_M_MASK | U_GC_ND_MASK | U_GC_PC_MASK;
    return u_isUAlphabetic(c) || (U_GET_GC_MASK(c) & wordCategories) != 0 || c == zeroWidthNonJoiner ||
           c == zeroWidthJoiner;
}

/// Whether the character belongs to the one before it and cannot begin a word.
bool isCombining(UChar32 c) {
    return u_hasBinaryProperty(c, UCHAR_GRAPHEME_EXTEND) != 0 || u_charType(c) == U_FORMAT_CHAR;
}

bool isBlank(UChar32 c) {
    return u_charType(c) == U_SPACE_SEPARATOR || c == '\t';
}

bool isLineBreak(UChar32 c) {
    return (c >= 0x0A && c <= 0x0D) || c == 0x85 || c == 0x2028 || c == 0x2029;
}

}  // namespace

bool isValidUtf8(std::string_view text) {
    const auto length = static_cast<int32_t>(text.size());
    for (int32_t i = 0; i < length;) {
        if (nextCharacter(text, i, length) < 0) return false;
    }
    return true;
}

bool isAscii(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

std::u16string utf16FromUtf8(std::string_view text) {
    const icu::UnicodeString converted = unicode(text);
    return {converted.getBuffer(), static_cast<std::size_t>(converted.length())};
}

std::string utf8FromUtf16(std::u16string_view text) {
    return utf8(icu::UnicodeString(false, text.data(), static_cast<int32_t>(text.size())));
}

std::string userLocaleName() {
    const icu::Locale locale = icu::Locale::getDefault();
    const bool isPosix = std::string_view(locale.getVariant()) == "POSIX";
    return (isPosix ? icu::Locale::getRoot() : locale).getName();
}

int localizedCompare(std::string_view a, std::string_view b) {
    UErrorCode status = U_ZERO_ERROR;
    return static_cast<int>(userCollator().compareUTF8(piece(a), piece(b), status));
}

bool containsIgnoringCaseAndDiacritics(std::string_view text, std::string_view part) {
    const icu::UnicodeString wanted = withoutCaseAndDiacritics(part);
    return !wanted.isEmpty() && withoutCaseAndDiacritics(text).indexOf(wanted) >= 0;
}

std::string foldedWithoutDiacritics(std::string_view text) {
    return utf8(withoutCaseAndDiacritics(text));
}

std::string foldCase(std::string_view text) {
    return utf8(unicode(text).foldCase());
}

std::string lowercase(std::string_view text) {
    return utf8(unicode(text).toLower(icu::Locale::getRoot()));
}

std::string reversedString(std::string_view text) {
    const icu::UnicodeString source = unicode(text);
    UErrorCode status = U_ZERO_ERROR;
    const std::unique_ptr<icu::BreakIterator> characters(
        icu::BreakIterator::createCharacterInstance(icu::Locale::getRoot(), status));
    characters->setText(source);
    icu::UnicodeString reversed;
    int32_t end = characters->last();
    for (int32_t start = characters->previous(); start != icu::BreakIterator::DONE;
         start = characters->previous()) {
        reversed.append(source, start, end - start);
        end = start;
    }
    return utf8(reversed);
}

std::string replaceNonAlphanumerics(std::string_view text, std::string_view kept,
                                    std::string_view replacement) {
    std::string result;
    const auto length = static_cast<int32_t>(text.size());
    for (int32_t i = 0; i < length;) {
        const int32_t start = i;
        const UChar32 c = nextCharacter(text, i, length);
        const bool isKept =
            c >= 0 && ((U_GET_GC_MASK(c) & (U_GC_L_MASK | U_GC_M_MASK | U_GC_N_MASK)) != 0 ||
                       (c < 0x80 && kept.find(static_cast<char>(c)) != std::string_view::npos));
        result += isKept ? text.substr(static_cast<std::size_t>(start), static_cast<std::size_t>(i - start))
                         : replacement;
    }
    return result;
}

bool isWordBoundary(std::string_view text, std::size_t offset) {
    const auto length = static_cast<int32_t>(text.size());
    const auto start = static_cast<int32_t>(offset);
    bool isWord = false;
    if (start < length) {
        int32_t next = start;
        const UChar32 c = nextCharacter(text, next, length);
        if (c >= 0x80 && isCombining(c)) return false;
        isWord = c < 0x80 ? isAsciiWordCharacter(text[offset]) : isWordCharacter(c);
    }
    for (int32_t before = start; before > 0;) {
        const UChar32 c = previousCharacter(text, 0, before);
        if (c < 0x80) return isWord != (c >= 0 && isAsciiWordCharacter(static_cast<char>(c)));
        if (!isCombining(c)) return isWord != isWordCharacter(c);
    }
    return isWord;
}

std::string_view trimBlanks(std::string_view text) {
    return trim(text, isBlank);
}

std::string_view trimBlanksAndLineBreaks(std::string_view text) {
    return trim(text, [](UChar32 c) { return isBlank(c) || isLineBreak(c); });
}

std::string_view trimPunctuation(std::string_view text) {
    return trim(text, [](UChar32 c) { return u_ispunct(c); });
}

std::vector<std::string> split(std::string_view text, std::string_view separator) {
    std::vector<std::string> parts;
    std::size_t start = 0;
    for (std::size_t hit = text.find(separator); hit != std::string_view::npos;
         hit = text.find(separator, start)) {
        parts.emplace_back(text.substr(start, hit - start));
        start = hit + separator.size();
    }
    parts.emplace_back(text.substr(start));
    return parts;
}

std::string join(const std::vector<std::string>& parts, std::string_view separator) {
    return fmt::format("{}", fmt::join(parts, separator));
}

std::string replaceAll(std::string_view text, std::string_view from, std::string_view to) {
    return join(split(text, from), to);
}

std::uint64_t lineAt(std::string_view text, std::size_t offset) {
    const std::string_view before = text.substr(0, offset);
    std::uint64_t line = 1;
    for (std::size_t i = 0; i < before.size(); ++i) {
        const bool isPairOfBreaks = before[i] == '\r' && i + 1 < text.size() && text[i + 1] == '\n';
        line += before[i] == '\n' || (before[i] == '\r' && !isPairOfBreaks) ? 1 : 0;
    }
    return line;
}

std::optional<double> numberIn(std::string_view text) {
    text = trimBlanksAndLineBreaks(text);
    if (text.starts_with('+')) text.remove_prefix(1);
    double value = 0;
    const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), value);
    const bool isNumber = status == std::errc{} && end == text.data() + text.size();
    return isNumber ? std::optional(value) : std::nullopt;
}

double leadingNumber(std::string_view text) {
    const std::size_t first = text.find_first_not_of(" \t\n\r");
    if (first == std::string_view::npos) return 0;
    text.remove_prefix(first);
    if (text.front() == '+') text.remove_prefix(1);
    double value = 0;
    const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), value);
    return status == std::errc{} ? value : 0;
}

std::size_t displayWidth(std::string_view text) {
    std::size_t columns = 0;
    const auto length = static_cast<int32_t>(text.size());
    for (int32_t i = 0; i < length;) {
        const UChar32 c = nextCharacter(text, i, length);
        if (c >= 0 && (u_charType(c) == U_NON_SPACING_MARK || u_charType(c) == U_FORMAT_CHAR)) continue;
        const int32_t width = c < 0 ? U_EA_NEUTRAL : u_getIntPropertyValue(c, UCHAR_EAST_ASIAN_WIDTH);
        columns += width == U_EA_WIDE || width == U_EA_FULLWIDTH ? 2 : 1;
    }
    return columns;
}

}  // namespace qvct
