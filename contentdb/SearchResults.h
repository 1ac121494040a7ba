#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <string>
#include <vector>

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

/// One of several items that hold the same sound, and what speaks for keeping it. Numbers are 0 where they
/// are unknown, or the coding has none.
struct SoundCopy {
    ItemId id = 0;
    std::string path;
    /// The sound is that of the best copy byte for byte, whatever its name and record.
    bool isExact = false;
    std::uint64_t size = 0;  ///< Of the file, in bytes.
    double seconds = 0;
    double sampleRate = 0;
    double bitDepth = 0;
    double channels = 0;
};

/// Items that hold the same sound, the best copy first.
struct DuplicateGroup {
    std::vector<SoundCopy> copies;
    /// In what the best copy is better than another one, what counts most first; empty when all are equal and
    /// it is the oldest in the database.
    std::vector<std::string> reasons;
};

/// An item that is like another one.
struct Similar {
    ItemId id = 0;
    IndexedItem item;
    double similarity = 0;  ///< in [0, 1]
};

}  // namespace qvct::contentdb
