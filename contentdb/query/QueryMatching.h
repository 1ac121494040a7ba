#pragma once

#include "contentdb/Query.h"

namespace qvct::contentdb {

/// Whether the item meets the condition. `fault` is that of a regular expression which was given up: then the
/// answer is none.
bool meets(const Condition& condition, const IndexedItem& item, Error& fault);

}  // namespace qvct::contentdb
