#pragma once

#include "contentdb/IndexedItem.h"
#include "contentdb/SearchResults.h"

#include <string>
#include <utility>
#include <vector>

namespace qvct::contentdb {

/// What the item has to offer as a copy of its sound.
SoundCopy copyOf(ItemId id, const IndexedItem& item);

/// Copies of one sound, in the order of their numbers and each with its payload, as a group with the best one
/// first: one that no coding has changed, then the longest, the one of the highest rate, of the most bits, of
/// the most channels, the oldest. Lengths within a twentieth of a second count as the same.
DuplicateGroup bestFirst(std::vector<std::pair<SoundCopy, std::string>> copies);

}  // namespace qvct::contentdb
