#pragma once

#include "contentdb/IndexedItem.h"
#include "contentdb/store/sqlite/Sqlite.h"

namespace qvct::contentdb {

/// The columns of an item's stamp, in the order in which the functions here take them.
inline constexpr const char* kStampColumns = "size, modified, changed, inode";

inline ItemStamp stampIn(const Statement& row, int firstColumn) {
    return {row.unsignedInteger(firstColumn), row.integer(firstColumn + 1), row.integer(firstColumn + 2),
            row.unsignedInteger(firstColumn + 3)};
}

inline void bindStamp(Statement& statement, int firstIndex, const ItemStamp& stamp) {
    statement.bind(firstIndex, stamp.size).bind(firstIndex + 1, stamp.modified);
    statement.bind(firstIndex + 2, stamp.changed).bind(firstIndex + 3, stamp.inode);
}

}  // namespace qvct::contentdb
