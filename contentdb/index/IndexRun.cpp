#include "contentdb/index/IndexRun.h"

#include "contentdb/terms/Terms.h"
#include "platform/files/EntryStatus.h"
#include "platform/files/FileAccess.h"
#include "platform/files/Paths.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <chrono>
#include <utility>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

using Clock = std::chrono::steady_clock;

/// A file that changed so recently may change again within the same tick of the file system's clock, and its
/// stamp would not show it. The next run reads it again.
constexpr std::int64_t kTick = 20'000'000;
constexpr std::int64_t kClockSkew = 2'000'000'000;

std::int64_t wallNanoseconds() {
    return std::chrono::nanoseconds(std::chrono::system_clock::now().time_since_epoch()).count();
}

bool isAtOrBelow(std::string_view path, std::string_view folder) {
    return path.starts_with(folder) &&
           (path.size() == folder.size() || folder == "/" || path[folder.size()] == '/');
}

template <typename Folders>
bool isBelow(std::string_view path, const Folders& folders) {
    return std::any_of(folders.begin(), folders.end(),
                       [path](const std::string& folder) { return isAtOrBelow(path, folder); });
}

/// Device and inode of a folder, links followed.
std::optional<std::pair<std::uint64_t, std::uint64_t>> inodeOf(const std::string& path) {
    EntryStatus status;
    if (lookAt(path, Links::follow, status) != Presence::there) return std::nullopt;
    return std::pair(status.device, status.inode);
}

}  // namespace

IndexRun::IndexRun(const IndexOptions& options, Connection& connection, DescriberPool& describers)
    : options_(options),
      part_{options.part, options.parts},
      describers_(describers),
      writer_(connection),
      nextId_(writer_.store().lastId() + 1),
      isNewDatabase_(nextId_ == 1),
      lastFlush_(Clock::now()),
      lastReport_(lastFlush_) {
    writer_.setDescriber(options.describer);
}

bool IndexRun::walk(const std::string& folder) {
    if (isStopped_) return canDescribe_;
    roots_.push_back(folder);
    listed_ = 0;
    const auto tell = [this](const std::string& path, const Error& error) {
        unreadable_.insert(path);
        if (options_.failed) options_.failed(error);
    };
    const auto show = [&](const ContentFolder& found) {
        std::vector<ListedItem> items = listedItems(found, tell);
        includeRejections(items, found.path, folder, rejections_);
        return visit(found.path, items);
    };
    if (isDirectory(folder)) walkContentFolders(folder, show, tell, options_.links);
    if (listed_ == 0 && !options_.pruneRoots) bareRoots_.emplace(folder, 0);
    return canDescribe_;
}

bool IndexRun::visit(const std::string& path, const std::vector<ListedItem>& all) {
    listed_ += all.size();
    if (!shown_.insert(path).second) return true;  // below an earlier root
    std::vector<ListedItem> part;
    if (options_.parts > 1) part = itemsOfPart(path, all);
    const std::vector<ListedItem>& items = options_.parts > 1 ? part : all;
    progress_.seen += items.size();
    const FolderRecord known = writer_.store().folder(path);
    if (known.id != 0) visited_.insert(known.id);
    const std::uint64_t digest = digestOf(items);
    // A folder with missing items is always gone through: they may have turned up elsewhere.
    const bool isUnchanged = known.digest == digest && known.part == part_ && known.gone == 0;
    if ((isUnchanged && !options_.retryFailed) || (known.id == 0 && items.empty())) {
        progress_.unchanged += items.size();
    } else {
        const auto folder = std::make_shared<OpenFolder>(OpenFolder{path, digest, 0, 1});
        if (!submitChanged(folder, known.id, items)) return false;
        if (--folder->remaining == 0) complete_.push_back(folder);
    }
    stopIfCancelled();
    report();
    return !isStopped_;
}

void IndexRun::stopIfCancelled() {
    if (options_.isCancelled && options_.isCancelled()) isStopped_ = true;
}

std::vector<ListedItem> IndexRun::itemsOfPart(const std::string& path,
                                              const std::vector<ListedItem>& items) const {
    std::vector<ListedItem> part;
    for (const ListedItem& item : items) {
        if (part_.holds(path, item.name)) part.push_back(item);
    }
    return part;
}

bool IndexRun::submitChanged(const std::shared_ptr<OpenFolder>& folder, std::int64_t folderId,
                             const std::vector<ListedItem>& items) {
    auto known = folderId == 0 ? decltype(writer_.store().files(0))() : writer_.store().files(folderId);
    const std::int64_t now = wallNanoseconds();
    for (ListedItem item : items) {
        const std::int64_t age = now - item.stamp.changed;
        if (age < kTick && age > -kClockSkew) {
            item.stamp.changed = 0;
            folder->digest = 0;
        }
        const auto hit = known.find(item.name);
        const bool isKnown = hit != known.end();
        const ItemId id = isKnown ? hit->second.id : 0;
        const bool isSame = isKnown && hit->second.stamp == item.stamp && item.stamp.changed != 0 &&
                            !(options_.retryFailed && hit->second.hasFailed);
        if (isKnown) known.erase(hit);
        if (isSame) {
            ++progress_.unchanged;
        } else if (!submit(item, id, folder)) {
            return false;
        }
    }
    for (const auto& [name, file] : known) {
        if (!part_.holds(folder->path, name)) continue;
        ++progress_.missing;
        ++folder->gone;
        missing_.insert(file.id);
    }
    return true;
}

bool IndexRun::submit(const ListedItem& item, ItemId id, const std::shared_ptr<OpenFolder>& folder) {
    while (!describers_.hasRoom()) {
        if (!collect()) return false;
    }
    ++folder->remaining;
    pending_[++lastTicket_] = {id != 0 ? id : nextId_++, id == 0, folder};
    describers_.submit({lastTicket_, pathIn(folder->path, item.name), item.stamp});
    return true;
}

bool IndexRun::collect() {
    canDescribe_ = describers_.collect([this](Described described) {
        batchSize_.add(described.terms.size());
        batch_.push_back(std::move(described));
    });
    stopIfCancelled();
    flushIfDue();
    report();
    return canDescribe_ && !isStopped_;
}

void IndexRun::flushIfDue() {
    if (batchSize_.isFull() || Clock::now() - lastFlush_ >= options_.longestBatch) flush();
}

void IndexRun::flush() {
    lastFlush_ = Clock::now();
    if (batch_.empty() && complete_.empty()) return;
    writer_.begin();
    store(batch_);
    for (const auto& folder : complete_) storeFolder(*folder);
    writer_.commit();
    batch_.clear();
    batchSize_ = {};
    complete_.clear();
}

void IndexRun::store(std::vector<Described>& batch) {
    // In the order of the walk, so that the same library gives the same database.
    std::sort(batch.begin(), batch.end(),
              [](const Described& a, const Described& b) { return a.ticket < b.ticket; });
    for (const Described& described : batch) {
        const auto hit = pending_.find(described.ticket);
        storeOne(described, hit->second);
        OpenFolder& folder = *hit->second.folder;
        if (--folder.remaining == 0) complete_.push_back(hit->second.folder);
        pending_.erase(hit);
    }
}

void IndexRun::storeOne(const Described& described, Pending& pending) {
    const IndexedItem& item = described.item;
    const bool hasFailed = !item.failure.empty();
    const bool wasAway = described.wasAway || (hasFailed && isGone(item.path));
    if (wasAway) pending.folder->digest = 0;  // the next run reads it again
    if (wasAway && hasFailed) return;         // the item is missing, not broken
    if (hasFailed) {
        ++progress_.failed;
        if (options_.failed) {
            options_.failed(errorOfFailure(item));
        }
    } else {
        ++progress_.described;
    }
    if (!isNewDatabase_ && pending.isNew) {
        if (const auto before = writer_.idOfMoved(item)) {
            writer_.addEarlierPath(*before, writer_.store().item(*before)->path);
            pending.id = *before;
            ++progress_.moved;
            progress_.missing -= missing_.erase(*before);
        }
    }
    writer_.put(pending.id, item, described.terms);
}

void IndexRun::storeFolder(const OpenFolder& folder) {
    FolderRecord record = writer_.store().folder(folder.path);
    if (record.id == 0) return;  // nothing of it was stored
    visited_.insert(record.id);
    record.digest = folder.digest;
    record.gone = folder.gone;
    record.part = part_;
    writer_.setFolder(record);
}

bool IndexRun::finish() {
    stopIfCancelled();
    while (canDescribe_ && !isStopped_ && describers_.isBusy()) collect();
    flush();
    if (options_.prune && canDescribe_ && !isStopped_) prune();
    if (options_.progress) options_.progress(progress_);
    return canDescribe_;
}

void IndexRun::prune() {
    writer_.begin();
    for (const ItemId id : missing_) removeIfGone(id);
    writer_.commit();
    for (const std::string& root : roots_) pruneUnvisited(root);
    for (const auto& [root, missing] : bareRoots_) {
        if (missing == 0 || !options_.failed) continue;
        options_.failed(errorOf(
            kErrorUnreadable,
            fmt::format("nothing is left in it, as when a disk is away; its {} items stay in the database "
                        "unless roots are pruned, too",
                        missing),
            {root}));
    }
}

void IndexRun::pruneUnvisited(const std::string& root) {
    std::vector<std::pair<FolderRecord, std::string>> folders;
    writer_.store().forEachFolder(root, [&](const FolderRecord& folder, std::string_view path) {
        if (!visited_.contains(folder.id) && !isBelow(path, unreadable_)) folders.emplace_back(folder, path);
    });
    for (const auto& [folder, path] : folders) {
        writer_.begin();
        pruneFolder(folder, path);
        writer_.commit();
        visited_.insert(folder.id);  // a root inside another one would visit it again
    }
}

void IndexRun::pruneFolder(const FolderRecord& folder, const std::string& path) {
    const auto otherPath = otherPathOf(path);
    for (const auto& [name, file] : writer_.store().files(folder.id)) {
        if (!part_.holds(path, name)) continue;
        const auto other = otherPath ? writer_.store().idOfPath(pathIn(*otherPath, name)) : std::nullopt;
        if (other) {
            writer_.addEarlierPath(*other, pathIn(path, name));
            writer_.remove(file.id);
        } else {
            ++progress_.missing;
            removeIfGone(file.id);
        }
    }
}

void IndexRun::removeIfGone(ItemId id) {
    const auto item = writer_.store().item(id);
    if (!item || !isGone(item->path) || isSpared(item->path)) return;
    writer_.remove(id);
    ++progress_.pruned;
}

/// Whether the item stays because nothing is left in its whole root, as when a disk is not mounted.
bool IndexRun::isSpared(std::string_view path) {
    for (auto& [root, missing] : bareRoots_) {
        if (!isAtOrBelow(path, root)) continue;
        ++missing;
        return true;
    }
    return false;
}

/// The other path by which the walk reached this folder: through another link, or directly.
std::optional<std::string> IndexRun::otherPathOf(const std::string& folder) {
    const auto inode = inodeOf(folder);
    if (!inode) return std::nullopt;
    if (shownByInode_.empty()) {
        for (const std::string& path : shown_) {
            if (const auto its = inodeOf(path)) shownByInode_.emplace(*its, path);
        }
    }
    const auto hit = shownByInode_.find(*inode);
    return hit == shownByInode_.end() || hit->second == folder ? std::nullopt : std::optional(hit->second);
}

void IndexRun::report() {
    constexpr std::chrono::milliseconds pause{100};
    if (!options_.progress || Clock::now() - lastReport_ < pause) return;
    lastReport_ = Clock::now();
    options_.progress(progress_);
}

}  // namespace qvct::contentdb
