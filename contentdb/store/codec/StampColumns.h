#pragma once

#include "contentdb/store/StampNumbers.h"
#include "contentdb/store/sqlite/Sqlite.h"

namespace qvct::contentdb {

/// The columns of an item's stamp, in the order in which the functions here take them.
inline constexpr const char* kStampColumns = "size, modified, changed, inode";

inline ItemStamp stampIn(const Statement& row, int firstColumn) {
    StampNumbers numbers{};
    for (std::uint64_t& number : numbers) number = row.unsignedInteger(firstColumn++);
    return stampOf(numbers);
}

inline void bindStamp(Statement& statement, int firstIndex, const ItemStamp& stamp) {
    for (const std::uint64_t number : numbersOf(stamp)) statement.bind(firstIndex++, number);
}

}  // namespace qvct::contentdb
