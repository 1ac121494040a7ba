#pragma once

#include "contentdb/store/ContentStore.h"

namespace qvct::contentdb {

/// Throws DatabaseFailure unless every page, record and index entry is as it should be, and every folder
/// holds the items that its digest speaks of.
/// @cost  O(items)
void checkStore(ContentStore& store);

}  // namespace qvct::contentdb
