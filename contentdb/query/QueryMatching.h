#pragma once

#include "contentdb/Query.h"

namespace qvct::contentdb {

/// Whether the item meets the condition. When a regular expression took too long, `fault` is set and the
/// result means nothing.
bool meets(const Condition& condition, const IndexedItem& item, Error& fault);

}  // namespace qvct::contentdb
