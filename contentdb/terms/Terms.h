#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct::contentdb {

/// The kinds of things that an item is found by. A term is one such thing as bytes: the kind, then the value.
enum class TermKind : char {
    everything = 'a',  ///< every item that could be described
    coarseNumber = 'c',
    fineNumber = 'n',
    pack = 'k',
    prefix = 'p',  ///< the first characters of a word, to find words by a short beginning
    tag = 't',     ///< a tag of the item, or one above it
    type = 'y',
    word = 'w'
};

/// Beginnings of words up to this many characters have terms of their own.
inline constexpr std::size_t kLongestPrefixTerm = 3;

std::string term(TermKind kind, std::string_view value = {});
/// Label, then category: all categories of a label stand together. Both folded.
std::string tagTerm(std::string_view label, std::string_view category);
std::string typeTerm(std::int64_t fileType);

/// A group of neighbouring numbers, so that few terms cover any range. A fine group spans a 256th of a power
/// of two, but its first number, such as a whole tempo, is a group of its own; a coarse one spans a 16th.
/// Terms sort as the numbers do.
struct NumberGroup {
    std::string term;
    double first;
    double last;  ///< the last number that can be in it
};
NumberGroup fineGroup(std::string_view field, double value);
NumberGroup coarseGroup(std::string_view field, double value);
/// The group that a term names.
NumberGroup numberGroupOfTerm(std::string_view term);

/// An item's numbers by field: folded keys of its values, "size", and levels under `levelField(label)`.
std::vector<std::pair<std::string, double>> numbersOf(const IndexedItem& item);
std::string levelField(std::string_view label);
/// The texts whose words find the item: name, path, labels of tags and of those above them.
std::vector<std::string_view> textsOf(const IndexedItem& item);

/// All terms of an item, sorted, each once. None for a failed item.
std::vector<std::string> termsOf(const IndexedItem& item);

}  // namespace qvct::contentdb
