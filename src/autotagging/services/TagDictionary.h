#pragma once

#include "platform/data/PropertyList.h"

#include <algorithm>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct {

/// What tagging services produce: a "label" and, where the tag has a weight, a "level".
using TagDictionary = PropertyList::Dictionary;

/// Key of a tag dictionary's label, a string.
inline constexpr std::string_view kTagDictionaryLabelKey = "label";
/// Key of its level, a number in [0, 1].
inline constexpr std::string_view kTagDictionaryLevelKey = "level";

inline TagDictionary tagDictionary(std::string_view label, std::optional<double> level = std::nullopt) {
    TagDictionary tag{{std::string(kTagDictionaryLabelKey), label}};
    if (level) tag.append(std::string(kTagDictionaryLevelKey), *level);
    return tag;
}

/// Tag dictionaries, each once, in the order in which they were added. Two are the same only when all their
/// keys and values are.
class TagDictionarySet {
  public:
    using value_type = TagDictionary;
    using const_iterator = std::vector<TagDictionary>::const_iterator;

    /// Adds the dictionary unless the same one is there.
    void insert(TagDictionary dictionary) {
        if (std::find(begin(), end(), dictionary) == end()) dictionaries_.push_back(std::move(dictionary));
    }
    /// Adds each dictionary that is not there yet.
    void insertAll(const TagDictionarySet& other) {
        for (const TagDictionary& dictionary : other) insert(dictionary);
    }
    std::size_t size() const { return dictionaries_.size(); }
    bool empty() const { return dictionaries_.empty(); }
    const_iterator begin() const { return dictionaries_.begin(); }
    const_iterator end() const { return dictionaries_.end(); }

  private:
    std::vector<TagDictionary> dictionaries_;
};

}  // namespace qvct
