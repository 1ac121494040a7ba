#pragma once

#include "platform/base/bytes/Printable.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Text operations on UTF-8. Those that look at characters are Unicode-correct.

bool isValidUtf8(std::string_view text);
bool isAscii(std::string_view text);
/// UTF-16 of the text; malformed bytes become U+FFFD.
std::u16string utf16FromUtf8(std::string_view text);
std::string utf8FromUtf16(std::u16string_view text);

/// The user's locale, such as "de_DE"; the root locale's empty name where none is set ("C"), so that texts
/// are sorted as people would sort them.
std::string userLocaleName();
/// Order of two texts for people, in the order of the user's locale: negative, 0 or positive.
int localizedCompare(std::string_view a, std::string_view b);
/// Whether `text` holds `part`, without regard to case and diacritics. An empty part is never held.
bool containsIgnoringCaseAndDiacritics(std::string_view text, std::string_view part);
/// Full case folding: two texts that differ only in case fold to the same text.
std::string foldCase(std::string_view text);
/// The same without combining marks: "Flöte" and "FLOTE" give one text.
std::string foldedWithoutDiacritics(std::string_view text);
std::string lowercase(std::string_view text);
/// The user-perceived characters in reverse order.
std::string reversedString(std::string_view text);
/// Replaces each character that is neither a letter, a combining mark, a number nor listed in `kept` (ASCII)
/// by `replacement`.
std::string replaceNonAlphanumerics(std::string_view text, std::string_view kept,
                                    std::string_view replacement);

/// Whether a word begins or ends at that byte offset, exactly as "\b" of an ICU expression has it: between a
/// letter, digit or connector and something else, combining marks being part of what they follow.
bool isWordBoundary(std::string_view text, std::size_t offset);
constexpr bool isAsciiWordCharacter(char c) {
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '_';
}
/// A space, a tab or the end of a line: what separates words in XML, XPath and queries.
constexpr bool isAsciiBlank(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

/// Without the blanks (and, if asked for, line breaks) at both ends.
std::string_view trimBlanks(std::string_view text);
std::string_view trimBlanksAndLineBreaks(std::string_view text);
/// Without the punctuation characters at both ends.
std::string_view trimPunctuation(std::string_view text);
/// The parts between the separators; one more part than there are separators.
std::vector<std::string> split(std::string_view text, std::string_view separator);
std::string join(const std::vector<std::string>& parts, std::string_view separator);
std::string replaceAll(std::string_view text, std::string_view from, std::string_view to);
/// The line, from 1, on which the byte at the offset stands.
std::uint64_t lineAt(std::string_view text, std::size_t offset);
/// The number that the text is, blanks around it aside and whatever the locale; nothing when it is none.
std::optional<double> numberIn(std::string_view text);
/// The number that the text begins with, blanks skipped and whatever the locale; 0 when there is none.
double leadingNumber(std::string_view text);
/// How many columns of a terminal the text takes.
std::size_t displayWidth(std::string_view text);

}  // namespace qvct
