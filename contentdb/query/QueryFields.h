#pragma once

#include "contentdb/Query.h"

#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// The field that a word names, or nothing and a reason.
std::optional<Field> fieldNamed(std::string_view word, const Vocabulary& vocabulary, std::string& reason);

/// The labels of the tags that stand for a musical key, such as "A", "C#", "Bbm" or "A minor"; empty when the
/// text is no key.
std::vector<std::string> keyLabels(std::string_view text);
/// The MIDI note that a text such as "A2" or "Eb-1" names; "C4" is 60.
std::optional<double> noteNamed(std::string_view text);
/// Whether the numbers of the field are notes.
bool isOfNotes(std::string_view field);
/// The terms of the tags that are keys.
std::set<std::string> keyTerms();
/// The file type that a word names.
std::optional<std::int64_t> typeNamed(std::string_view word);

/// What an item has in a field: its numbers, or its texts.
std::vector<double> numbersInField(const IndexedItem& item, const Field& field);
std::vector<std::string> textsInField(const IndexedItem& item, const Field& field);
bool isNumeric(const Field& field);

}  // namespace qvct::contentdb
