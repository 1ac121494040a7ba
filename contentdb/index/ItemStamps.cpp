#include "contentdb/index/ItemStamps.h"

#include "autotagging/names/ItemNames.h"
#include "contentdb/index/BundleWalk.h"
#include "contentdb/store/Digest.h"
#include "platform/files/Paths.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <string>

namespace qvct::contentdb {
namespace {

ItemStamp stampOf(const EntryStatus& status) {
    return {status.size, status.modified, status.changed, status.inode};
}

/// Makes the stamp tell changes of a second file as well.
void include(ItemStamp& stamp, const EntryStatus& other) {
    stamp.size += other.size;
    stamp.modified = std::max(stamp.modified, other.modified);
    stamp.changed = std::max(stamp.changed, other.changed);
    stamp.inode = stamp.inode * 31 + other.inode;
}

/// Everything that lies in a bundle, which may itself be a link.
void includeBundle(ItemStamp& stamp, const FolderListing& parent, const FolderListing::Entry& entry) {
    const auto bundle = parent.readIn(entry, Links::follow);
    if (!bundle) return;
    forEachInBundle(*bundle, [&stamp](const BundleEntry& found) {
        if (const auto status = found.folder.status(found.entry, Links::keep)) include(stamp, *status);
        return true;
    });
}

/// The record, description and preview that lie beside an item. The size stays the item's own.
void includeCompanions(const FolderListing& listing, ListedItem& item) {
    constexpr std::array<std::string_view, 4> endings = {"plist", "zxml", "xml", "caf"};
    const std::uint64_t size = item.stamp.size;
    const std::string start = std::string(item.name) + '.';
    for (const FolderListing::Entry& companion : listing.entriesThatBegin(start)) {
        const std::string_view ending = companion.name.substr(start.size());
        if (std::find(endings.begin(), endings.end(), ending) == endings.end()) continue;
        if (const auto status = listing.status(companion, Links::follow)) include(item.stamp, *status);
    }
    item.stamp.size = size;
}

}  // namespace

std::vector<ListedItem> listedItems(const ContentFolder& folder, const WalkFailure& failed) {
    std::vector<ListedItem> items;
    for (const ContentFolder::Item& found : folder.items) {
        Error error;
        const auto status = folder.listing.status(found.entry, Links::follow, folder.path, &error);
        if (!status) {
            failed(pathIn(folder.path, found.entry.name), error);
            continue;
        }
        ListedItem item{found.entry.name, stampOf(*status)};
        includeCompanions(folder.listing, item);
        if (found.kind == ContentKind::bundle) includeBundle(item.stamp, folder.listing, found.entry);
        items.push_back(item);
    }
    return items;
}

void includeRejections(std::vector<ListedItem>& items, const std::string& folder, std::string_view root,
                       FolderRejections& rejections) {
    if (items.empty()) return;
    Digest digest;
    bool isNone = true;
    const ItemNames names(pathIn(folder, items.front().name), root);
    for (const std::string_view above : names.folders()) {
        const auto labels = rejections.ofFolder(above);
        if (!labels) continue;
        isNone = false;
        for (const std::string& label : *labels) digest.add(label);
    }
    if (isNone) return;
    for (ListedItem& item : items) item.stamp.modified ^= static_cast<std::int64_t>(digest.value());
}

}  // namespace qvct::contentdb
