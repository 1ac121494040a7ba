#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// A content item as a folder lists it.
struct ListedItem {
    std::string_view name;
    /// Tells changes of the record, description and preview beside it as well, and of all that lies in a
    /// bundle.
    ItemStamp stamp;
};

/// One number for the names and stamps of a folder's items; never 0.
std::uint64_t digestOf(const std::vector<ListedItem>& items);

}  // namespace qvct::contentdb
