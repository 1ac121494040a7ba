#pragma once

#include <string>
#include <string_view>

namespace qvct {

/// A keyword of a keyword mapping: a text to be found as a whole word, or "regex:" and an expression.
///
/// A text goes into its expression as it stands, so a keyword such as "C++" is an expression too.

/// The expression that decides whether the keyword occurs.
std::string expressionForKeyword(std::string_view keyword);
/// Whether the keyword means exactly its own ASCII characters, whatever their case, as a whole word.
bool isPlainKeyword(std::string_view keyword);
/// A text that is part of every occurrence, so that without it there is none. Empty when nothing is certain.
std::string_view requiredLiteral(std::string_view keyword);

/// Whether every character of the text that is not ASCII stays so when case is folded: none is a long s, a
/// Kelvin sign, a sharp s or a ligature, which an expression matches with plain letters.
bool foldsApartFromAscii(std::string_view text);

}  // namespace qvct
