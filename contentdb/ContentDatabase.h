#pragma once

#include "contentdb/Indexer.h"
#include "contentdb/Query.h"
#include "contentdb/SearchResults.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// What `indexLibrary` has stored of a library, for hosts to search and read.
///
/// One thread at a time for each object; several objects and processes may have the same database open, also
/// while a run writes to it: each operation sees what was stored when it began. A damaged page is found when
/// it is read and answered by an error, never by a wrong result.
class QVCT_API ContentDatabase {
  public:
    /// Null, and an error, when there is no such database, or it is damaged or of another version.
    ///
    /// If `indexLibrary` is just making it, this waits up to ten seconds for the first items. A search then
    /// finds what has been stored so far.
    static std::unique_ptr<ContentDatabase> open(const std::string& path, Error* error = nullptr);
    ~ContentDatabase();

    /// The fields that queries to this database may name: its categories and numbers, and those of the
    /// default taxonomy.
    std::optional<Vocabulary> vocabulary(Error* error = nullptr);
    /// At most `limit` items, in the query's order.
    std::optional<std::vector<Found>> search(const Query& query, std::size_t limit, Error* error = nullptr);
    /// How many items the query finds.
    /// @cost  That of `search`, but without reading items that the index alone can decide.
    std::optional<std::int64_t> count(const Query& query, Error* error = nullptr);
    /// How many of the found items have each tag, the most frequent first.
    std::optional<std::vector<Facet>> facets(const Query& query, Error* error = nullptr);
    /// The items most similar to the one at the path, best first. Nothing and an error when the item at the
    /// path could not be read, or has no tags, rhythm or tempo.
    std::optional<std::vector<Similar>> similar(std::string_view path, std::size_t limit,
                                                Error* error = nullptr);
    /// The items that sound most like the one at the path, or like that sound file, best first, itself left
    /// out. Nothing and an error when there is nothing to hear in it.
    /// @cost  A few milliseconds, and for a file that is not in the database those of listening to it.
    std::optional<std::vector<Similar>> soundingLike(std::string_view path, std::size_t limit,
                                                     Error* error = nullptr);
    /// Calls `visit` with each group of found items that hold the same sound: exact copies, and the same
    /// recording at another level, rate or resolution, in another format, or cut. In the order of their
    /// oldest items, until it answers false.
    /// @cost  O(items): some minutes for a million, 300 bytes of memory for each and 100 MB.
    bool forEachDuplicate(const Query& query, const std::function<bool(const DuplicateGroup&)>& visit,
                          Error* error = nullptr);
    /// The item at the path; nothing and an error when there is none.
    std::optional<Found> item(std::string_view path, Error* error = nullptr);
    /// Where the item was before it was moved.
    std::optional<std::vector<std::string>> earlierPaths(ItemId id, Error* error = nullptr);

    /// What the database holds.
    struct Totals {
        std::int64_t items = 0;     ///< All items, the failed ones too.
        std::int64_t failures = 0;  ///< Items that could not be read.
    };
    /// The totals, counted anew. @cost O(items) in the worst case.
    std::optional<Totals> totals(Error* error = nullptr);
    /// Calls `visit` with each item that could not be read, until it answers false.
    bool forEachFailure(const std::function<bool(const IndexedItem&)>& visit, Error* error = nullptr);

    /// Whether a run of `indexLibrary` is going on, here or in another process, so that more may be found
    /// soon.
    bool isBeingIndexed() const;

    /// Reads everything: each page and its checksum, each tree, each record; and checks that the index agrees
    /// with the items. @cost  O(items), some minutes for a million.
    bool check(Error* error = nullptr);

  private:
    struct Implementation;
    explicit ContentDatabase(std::unique_ptr<Implementation> implementation);
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct::contentdb
