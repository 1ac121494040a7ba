#include "contentdb/store/upkeep/Salvage.h"

#include "contentdb/store/Batches.h"
#include "contentdb/store/StoreWriter.h"
#include "contentdb/store/sqlite/ChecksumVfs.h"
#include "contentdb/store/sqlite/DatabaseFiles.h"
#include "contentdb/store/sqlite/Schema.h"
#include "contentdb/terms/Terms.h"

#include <algorithm>
#include <filesystem>
#include <memory>
#include <set>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// Where the end of a table is damaged, its last number is not known; the search then ends after so many
/// numbers without a row. No page stands for more rows than that, and no row is shorter than `kShortestRow`.
constexpr std::int64_t kMostMisses = 1 << 16;
constexpr std::int64_t kShortestRow = 16;

/// What `read` answers, or nothing where the database cannot be read.
template <typename Read>
auto readable(Read read) -> decltype(read()) {
    try {
        return read();
    } catch (const DatabaseFailure&) {
        return {};
    }
}

/// Null when the database is too damaged to be opened. A full or unreadable disk is not damage and throws.
std::unique_ptr<Connection> openedIfReadable(const std::string& path) {
    try {
        return openDatabase(path, Access::read);
    } catch (const DatabaseFailure& failure) {
        if (failure.code() == kErrorUnreadable || failure.code() == kErrorUnwritable) throw;
        return nullptr;
    }
}

/// Calls `visit` with each number that a row of the table may have; it answers whether there is one.
template <typename Visit>
void forEachNumber(Connection& connection, const char* table, Visit visit) {
    const std::string sql = fmt::format("SELECT max(id) FROM {}", table);
    const std::int64_t bytes = connection.number("PRAGMA page_count") * kPageSize;
    // The file has no room for numbers beyond this, whatever it claims.
    const std::int64_t last = std::min(bytes, readable([&] { return connection.number(sql.c_str()); }));
    const std::int64_t mostMisses = std::min(bytes / kShortestRow, kMostMisses);
    std::int64_t misses = 0;
    for (std::int64_t id = 1; last != 0 ? id <= last : misses < mostMisses; ++id)
        misses = visit(id) ? 0 : misses + 1;
}

std::set<std::string> knownFolders(Connection& connection) {
    std::set<std::string> folders;
    Statement row(connection, "SELECT path FROM folder WHERE id = ?");
    forEachNumber(connection, "folder", [&](std::int64_t id) {
        const bool isThere = readable([&] { return row.bind(1, id).step(); });
        if (isThere) folders.emplace(row.bytes(0));
        row.reset();
        return isThere;
    });
    // The index by path holds every path a second time.
    Statement all(connection, "SELECT path FROM folder ORDER BY path");
    while (readable([&all] { return all.step(); })) folders.emplace(all.bytes(0));
    return folders;
}

/// Whether walking another folder comes to this one.
bool isInAnother(const std::string& path, const std::set<std::string>& folders) {
    std::string_view folder = path;
    while (folder != "/" && !folder.empty()) {
        if (std::filesystem::is_symlink(folder)) return false;  // the walk may not follow it
        folder = placeOf(folder).folder;
        if (folders.contains(std::string(folder))) return true;
    }
    return false;
}

std::int64_t copyItems(ContentStore& from, const std::string& target) {
    const auto connection = openDatabase(target, Access::write);
    StoreWriter writer(*connection);
    if (const auto describer = readable([&] { return from.describer(); })) writer.setDescriber(describer);
    Batches batches(writer);
    forEachNumber(from.connection(), "item", [&](ItemId id) {
        const auto item = readable([&] { return from.item(id); });
        if (!item) return false;
        batches.put(id, *item, termsOf(*item));
        for (const std::string& path : readable([&] { return from.earlierPaths(id); }))
            writer.addEarlierPath(id, path);
        return true;
    });
    batches.end();
    connection->emptyLog();
    return batches.items();
}

}  // namespace

Salvage salvage(const std::string& damaged, const std::string& target) {
    Salvage saved;
    const auto connection = openedIfReadable(damaged);
    std::unique_ptr<ContentStore> store;
    readable([&] {
        if (connection) store = std::make_unique<ContentStore>(*connection);
        return true;
    });
    if (!store) return saved;
    makeEmptyLike(damaged, target);
    saved.items = copyItems(*store, target);
    const std::set<std::string> folders = knownFolders(*connection);
    std::copy_if(folders.begin(), folders.end(), std::back_inserter(saved.folders),
                 [&folders](const std::string& folder) { return !isInAnother(folder, folders); });
    return saved;
}

}  // namespace qvct::contentdb
