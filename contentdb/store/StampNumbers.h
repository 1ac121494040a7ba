#pragma once

#include "contentdb/IndexedItem.h"

#include <array>
#include <cstdint>

namespace qvct::contentdb {

/// A stamp as it is stored, sent and digested.
using StampNumbers = std::array<std::uint64_t, 4>;

inline StampNumbers numbersOf(const ItemStamp& stamp) {
    return {stamp.size, static_cast<std::uint64_t>(stamp.modified), static_cast<std::uint64_t>(stamp.changed),
            stamp.inode};
}

inline ItemStamp stampOf(const StampNumbers& numbers) {
    const auto& [size, modified, changed, inode] = numbers;
    return {size, static_cast<std::int64_t>(modified), static_cast<std::int64_t>(changed), inode};
}

}  // namespace qvct::contentdb
