#pragma once

#include <string>
#include <string_view>

namespace qvct {

/// A keyword of a keyword mapping: a text to be found as a whole word, or "regex:" and an expression.
///
/// A text becomes part of its expression unescaped, so a keyword such as "C++" is an expression too.

/// The expression that decides whether the keyword occurs.
std::string expressionForKeyword(std::string_view keyword);
/// Whether the keyword means exactly its own ASCII characters, whatever their case, as a whole word.
bool isPlainKeyword(std::string_view keyword);
/// A text that every occurrence contains, so that a text without it cannot match. Empty when there is no such
/// text.
std::string_view requiredLiteral(std::string_view keyword);

/// Whether case folding turns no other character of the text into ASCII: it has no long s, Kelvin sign, sharp
/// s or ligature, which expressions match with plain letters.
bool foldsApartFromAscii(std::string_view text);

}  // namespace qvct
