#pragma once

#include "contentdb/IndexedItem.h"
#include "contentdb/SearchResults.h"
#include "contentdb/store/IdSet.h"
#include "contentdb/store/Part.h"
#include "contentdb/store/sqlite/Schema.h"
#include "contentdb/store/sqlite/Sqlite.h"

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

using TermId = std::int64_t;

/// Entry of the index: one term, one chunk of items.
constexpr std::int64_t postingKey(TermId term, std::int64_t chunk) {
    return term << kChunkBits | chunk;
}
/// More items than this cannot be numbered.
inline constexpr ItemId kLastItemId = (ItemId{1} << (2 * kChunkBits)) - 1;

/// What the index remembers of a folder.
struct FolderRecord {
    std::int64_t id = 0;
    std::uint64_t digest = 0;
    std::int64_t gone = 0;
    /// The share of its items that the digest covers.
    Part part = {};
};

/// What the index remembers of a file in a folder.
struct FileRecord {
    ItemId id = 0;
    ItemStamp stamp;
    bool hasFailed = false;
};

/// Reads items, folders and index entries. Every operation throws DatabaseFailure.
class ContentStore {
  public:
    explicit ContentStore(Connection& connection);

    std::optional<IndexedItem> item(ItemId id);
    std::optional<ItemId> idOfPath(std::string_view path);
    /// Where the item was before, in the order of bytes.
    std::vector<std::string> earlierPaths(ItemId id);
    ItemId lastId();
    std::int64_t countOfItems();
    std::int64_t countOfFailures();
    /// What described the items, see IndexOptions; 0 when that is not known.
    std::uint64_t describer();
    /// Paths and reasons, in the order of items, until `visit` answers false.
    void forEachFailure(const std::function<bool(const IndexedItem&)>& visit);

    /// The folder's record; its `id` is 0 when the index does not know the folder.
    FolderRecord folder(std::string_view path);
    /// By name.
    std::map<std::string, FileRecord, std::less<>> files(std::int64_t folder);
    /// Calls `visit` for every folder at or below the path.
    void forEachFolder(std::string_view path,
                       const std::function<void(const FolderRecord&, std::string_view)>& visit);

    struct Tag {
        TermId term;
        std::string label;
        std::string category;
    };
    std::vector<Tag> tags();
    /// Categories, or fields of numbers, that some item has had.
    std::vector<std::string> fields(bool ofNumbers);

    std::optional<TermId> term(std::string_view value);
    /// Calls `visit` for the terms that begin with `start` and are below `end`, in order.
    void forEachTerm(std::string_view start, std::string_view end,
                     const std::function<void(TermId, std::string_view)>& visit);
    /// Adds the items of the chunk that have the term.
    void addPosting(TermId term, std::int64_t chunk, IdSet& ids);

    Connection& connection() { return connection_; }

  private:
    Connection& connection_;
    Statement item_;
    Statement idOfPath_;
    Statement term_;
    Statement terms_;
    Statement posting_;
    Statement folder_;
};

/// Folder and file name of a path.
struct Place {
    std::string_view folder;
    std::string_view file;
};
Place placeOf(std::string_view path);

}  // namespace qvct::contentdb
