#pragma once

#include <chrono>
#include <string>
#include <string_view>

namespace qvct {

/// Finds out beforehand whether a script's regular expression would backtrack without end.
///
/// The script engine cannot be interrupted while it matches. Expressions that could take long by their form
/// and the length of the text are therefore tried on ICU's engine first, which backtracks in the same way and
/// can be stopped; one that ICU cannot read, or does not finish in time, is refused. For all others only the
/// pattern is looked at.
bool isRegularExpressionBounded(std::u16string_view pattern, std::u16string_view flags,
                                std::u16string_view text, std::size_t start,
                                std::chrono::steady_clock::time_point deadline);

/// The pattern as ICU writes it, for a pattern without the flag "v".
std::u16string icuPattern(std::u16string_view pattern, bool isMultiline);

}  // namespace qvct
