#pragma once

#include "contentdb/Indexer.h"
#include "contentdb/index/DescriberPool.h"
#include "contentdb/index/ItemStamps.h"
#include "contentdb/store/Batches.h"
#include "contentdb/store/StoreWriter.h"

#include <chrono>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace qvct::contentdb {

/// One run of the indexer over an open database. Throws DatabaseFailure.
class IndexRun {
  public:
    IndexRun(const IndexOptions& options, Connection& connection, DescriberPool& describers);

    /// False when nothing can be described any more.
    bool walk(const std::string& folder);
    bool finish();
    const IndexProgress& progress() const { return progress_; }

  private:
    /// A folder with items that are still to be stored; its digest is stored after the last of them.
    struct OpenFolder {
        std::string path;
        std::uint64_t digest = 0;
        std::int64_t gone = 0;
        std::size_t remaining = 0;
    };
    struct Pending {
        ItemId id = 0;
        bool isNew = false;
        std::shared_ptr<OpenFolder> folder;
    };

    bool visit(const std::string& path, const std::vector<ListedItem>& items);
    std::vector<ListedItem> itemsOfPart(const std::string& path, const std::vector<ListedItem>& items) const;
    bool submitChanged(const std::shared_ptr<OpenFolder>& folder, std::int64_t folderId,
                       const std::vector<ListedItem>& items);
    bool submit(const ListedItem& item, ItemId id, const std::shared_ptr<OpenFolder>& folder);
    void stopIfCancelled();
    bool collect();
    void store(std::vector<Described>& batch);
    void storeOne(const Described& described, Pending& pending);
    void storeFolder(const OpenFolder& folder);
    void flush();
    void flushIfDue();
    void prune();
    void pruneUnvisited(const std::string& root);
    void pruneFolder(const FolderRecord& folder, const std::string& path);
    void removeIfGone(ItemId id);
    bool isSpared(std::string_view path);
    std::optional<std::string> otherPathOf(const std::string& folder);
    void report();

    const IndexOptions& options_;
    const Part part_;
    DescriberPool& describers_;
    StoreWriter writer_;
    IndexProgress progress_;
    FolderRejections rejections_;
    ItemId nextId_;
    bool isNewDatabase_;
    bool isStopped_ = false;
    bool canDescribe_ = true;
    std::uint64_t lastTicket_ = 0;
    std::unordered_map<std::uint64_t, Pending> pending_;
    std::vector<Described> batch_;
    BatchSize batchSize_;
    std::vector<std::shared_ptr<OpenFolder>> complete_;  // to be stored with the batch
    std::uint64_t listed_ = 0;  // items of all parts in the root that is being walked
    std::vector<std::string> roots_;
    std::map<std::string, std::uint64_t, std::less<>> bareRoots_;  // nothing is left there; items missing
    std::unordered_set<std::string> shown_;                        // folders, by path
    std::unordered_set<std::int64_t> visited_;                     // folders, by number
    std::map<std::pair<std::uint64_t, std::uint64_t>, std::string> shownByInode_;  // made when asked
    std::set<std::string, std::less<>> unreadable_;
    std::set<ItemId> missing_;  // items missing from folders that were visited
    std::chrono::steady_clock::time_point lastFlush_;
    std::chrono::steady_clock::time_point lastReport_;
};

}  // namespace qvct::contentdb
