#pragma once

#include "contentdb/ContentDatabase.h"
#include "contentdb/store/StoreWriter.h"
#include "contentdb/terms/Terms.h"
#include "support/ItemGenerator.h"
#include "support/TemporaryFolder.h"

#include <algorithm>
#include <functional>
#include <string>
#include <utility>
#include <vector>

namespace qvct::test {

/// Writes the items into a new database, numbered from 1, in several batches.
inline void store(const std::string& path, const std::vector<contentdb::IndexedItem>& items) {
    const auto connection = contentdb::openDatabase(path, contentdb::Access::write);
    contentdb::StoreWriter writer(*connection);
    constexpr std::size_t batch = 700;
    for (std::size_t start = 0; start < items.size(); start += batch) {
        writer.begin();
        for (std::size_t i = start; i < std::min(items.size(), start + batch); ++i)
            writer.put(static_cast<contentdb::ItemId>(i + 1), items[i], contentdb::termsOf(items[i]));
        writer.commit();
    }
}

/// Changes a database in one batch, which is given up again unless it `isWhole`.
inline void change(const std::string& path, const std::function<void(contentdb::StoreWriter&)>& work,
                   bool isWhole = true) {
    const auto connection = contentdb::openDatabase(path, contentdb::Access::write);
    contentdb::StoreWriter writer(*connection);
    writer.begin();
    work(writer);
    if (isWhole) writer.commit();
}

inline std::vector<contentdb::IndexedItem> generatedItems(std::uint64_t seed, std::size_t count) {
    ItemGenerator generator(seed, true);
    std::vector<contentdb::IndexedItem> items;
    for (std::size_t i = 1; i <= count; ++i) items.push_back(generator.next(i));
    return items;
}

}  // namespace qvct::test
