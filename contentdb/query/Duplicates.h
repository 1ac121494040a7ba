#pragma once

#include "contentdb/Query.h"
#include "contentdb/SearchResults.h"
#include "contentdb/store/ContentStore.h"

#include <functional>

namespace qvct::contentdb {

/// Calls `visit` with each group of found items that hold the same sound, in the order of their oldest items,
/// until it answers false.
///
/// Exact copies have the same payload. Of the others, those are compared that have a landmark in common and
/// lie near each other among all sounds. What is a copy of a copy is in the same group.
/// @cost  O(items): each is read once; some 300 bytes of memory for each, and 100 MB.
/// @throws DatabaseFailure
void forEachDuplicate(ContentStore& store, const Query& query,
                      const std::function<bool(const DuplicateGroup&)>& visit);

}  // namespace qvct::contentdb
