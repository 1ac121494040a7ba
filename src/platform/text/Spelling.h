#pragma once

#include <cstddef>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

/// How many letters have to be added, left out, changed or swapped with their neighbour to make one text of
/// the other, whatever their case.
/// @cost  O(|a| · |b|).
std::size_t spellingDistance(std::string_view a, std::string_view b);

/// The one of `words` that a misspelt word most likely stands for: the nearest, the first of several; empty
/// when none is near, which is a third of its letters at most.
std::string_view nearestSpelling(std::string_view word, std::span<const std::string> words);

}  // namespace qvct
