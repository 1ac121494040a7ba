#pragma once

#include "metadata/TGRTKeyValue.h"
#include "output/Output.h"
#include "platform/base/ObjectSet.h"

#include <string_view>
#include <vector>

namespace qvct::tool {

// What an item stores, for people: a line a field, its name in front.

/// Nothing when there are no words.
void printField(const Terminal& terminal, std::string_view name, const std::vector<Word>& words);
/// A field a category.
void printTaggings(const Terminal& terminal, const ObjectSet<TGRTTagging>& taggings);
void printKeyValues(const Terminal& terminal, const ObjectSet<TGRTKeyValue>& keyValues);
/// The kind of content, and its sub type where it has one.
void printKind(const Terminal& terminal, std::int64_t fileType, std::int64_t subFileType);

}  // namespace qvct::tool
