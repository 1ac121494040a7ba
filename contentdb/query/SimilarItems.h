#pragma once

#include "contentdb/SearchResults.h"
#include "contentdb/store/ContentStore.h"

#include <cstddef>
#include <vector>

namespace qvct::contentdb {

/// Whether the item has tags, rhythm levels or a tempo by which others can be similar.
bool isComparable(const IndexedItem& item);
/// The items nearest to one, or DatabaseFailure is thrown: by the tags they share (rare ones count more),
/// their rhythm levels, tempo and key. What comparing it with every item would answer, the older of two
/// equally near ones first.
/// @cost  One index entry for each tag, tempo and rhythm level that some item has and 65,536 items; few more
///   items are read than are asked for.
std::vector<Similar> similarItems(ContentStore& store, ItemId id, std::size_t limit);

}  // namespace qvct::contentdb
