#pragma once

#include "output/Output.h"

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::tool {

/// A tag of an item as a line about the item shows it.
struct ShownTag {
    std::string label;
    std::string category;
    std::string text;  ///< With its level.
    std::vector<std::string> ancestors;
    bool hasLevel = false;
};

/// Where a tag stands in a line about an item: what tells most of it comes first, the instrument, then the
/// genre, its character, the key; what only keeps books ("User generated", kinds of content) comes last.
int rankOfTag(std::string_view category, std::string_view label);
/// Whether a tag of that rank only keeps books.
bool isBookkeeping(int rank);

/// The tags in that order, without parents whose child is there and without bookkeeping unless all are
/// wanted; "no tags" when there are none.
std::vector<Word> wordsForTags(const std::vector<ShownTag>& tags, bool all);
/// The same for taggings.
std::vector<Word> wordsForTaggings(const std::vector<std::shared_ptr<TGRTTagging>>& taggings, bool all);

}  // namespace qvct::tool
