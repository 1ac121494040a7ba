#pragma once

#include "contentdb/store/ContentStore.h"
#include "contentdb/store/LikenessCells.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace qvct::contentdb {

/// Whether there is no item at the path any more. An item that merely cannot be looked at is not gone, and
/// neither is one behind a link that leads nowhere at the moment: its disk may not be mounted.
bool isGone(const std::string& path);

/// Changes items and the index in batches: what lies between `begin` and `commit` is written whole or not at
/// all. Every operation throws DatabaseFailure; a writer that has thrown is of no more use.
class StoreWriter {
  public:
    explicit StoreWriter(Connection& connection);
    ~StoreWriter();

    void begin();
    void commit();

    /// Stores the item under `id`, which may be new or known, in place of another item with the same path.
    /// `terms` are its terms, sorted (see termsOf).
    void put(ItemId id, const IndexedItem& item, const std::vector<std::string>& terms);
    void remove(ItemId id);
    /// A known item of the same payload whose file is no longer there: the same item, moved.
    std::optional<ItemId> idOfMoved(const IndexedItem& item);
    void addEarlierPath(ItemId id, std::string_view path);

    /// Notes which describer describes items from now on. If it is another one, all items count as changed.
    /// This is a batch of its own.
    void setDescriber(std::uint64_t describer);

    /// If items have left the folder since this writer was made, its digest is stored as 0: to be looked at
    /// again.
    void setFolder(FolderRecord folder);
    ContentStore& store() { return store_; }

  private:
    struct Change {
        std::int64_t key;
        std::uint16_t id;
        bool isAdded;
    };

    std::int64_t folderId(std::string_view path);
    void leave(std::string_view path);
    TermId termId(const std::string& value);
    void noteNames(const IndexedItem& item);
    void change(ItemId id, const std::string& term, bool isAdded);
    void flushPostings();

    ContentStore store_;
    LikenessCells cells_;
    std::optional<Transaction> transaction_;
    std::vector<Change> changes_;
    std::unordered_map<std::string, TermId> termIds_;
    std::unordered_set<std::string> names_;  // tags and fields known to be listed
    std::string lastFolder_;
    std::int64_t lastFolderId_ = 0;
    std::unordered_set<std::int64_t> left_;  // folders that had items which now are elsewhere, or nowhere
    Statement put_;
    Statement putTerm_;
    Statement putPosting_;
    Statement dropPosting_;
    Statement sameFiles_;
    Statement samePayloads_;
    Statement putFolder_;
};

}  // namespace qvct::contentdb
