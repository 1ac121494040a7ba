#pragma once

#include "contentdb/SearchResults.h"
#include "contentdb/store/ContentStore.h"

#include <cstddef>
#include <vector>

namespace qvct::contentdb {

/// Whether the item has tags, rhythm levels or a tempo by which others can be similar.
bool isComparable(const IndexedItem& item);
/// The items nearest to one, or DatabaseFailure is thrown: by the tags they share (rare ones count more),
/// their rhythm levels, tempo and key. The result is the same as if every item were compared; of two equally
/// near ones the older comes first.
/// @cost  For every 65,536 items, one index entry for each tag, tempo and rhythm level that occurs; few more
///   items are read than are asked for.
std::vector<Similar> similarItems(ContentStore& store, ItemId id, std::size_t limit);

}  // namespace qvct::contentdb
