#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <string>

namespace qvct::contentdb {

/// Number of an item in one database: from 1.
using ItemId = std::int64_t;

/// An item that a query found.
struct Found {
    ItemId id = 0;
    IndexedItem item;
};

/// How many of the found items have a tag, or one below it.
struct Facet {
    std::string label;
    std::string category;
    std::int64_t count = 0;
};

/// An item that is like another one.
struct Similar {
    ItemId id = 0;
    IndexedItem item;
    double similarity = 0;  ///< in [0, 1]
};

}  // namespace qvct::contentdb
