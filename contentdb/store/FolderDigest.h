#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// A content item as a folder lists it.
struct ListedItem {
    std::string_view name;
    /// Also shows changes of the record, description and preview beside the item, of everything in a bundle,
    /// and of what is rejected for its folders.
    ItemStamp stamp;
};

/// One number for the names and stamps of a folder's items; never 0.
std::uint64_t digestOf(const std::vector<ListedItem>& items);

}  // namespace qvct::contentdb
