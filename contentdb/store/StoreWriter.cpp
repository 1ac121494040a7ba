#include "contentdb/store/StoreWriter.h"

#include "contentdb/store/codec/ItemCodec.h"
#include "contentdb/store/codec/StampColumns.h"
#include "contentdb/terms/Terms.h"
#include "contentdb/terms/Words.h"
#include "formats/QVContentTaggingTypes.h"
#include "platform/files/EntryStatus.h"
#include "platform/files/Paths.h"
#include "platform/text/Url.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// Most terms whose numbers are remembered; beyond that they are looked up again.
constexpr std::size_t kMostCachedTerms = 200000;

/// Of the items with one payload, at most so many are checked for being gone.
constexpr int kMostCandidates = 16;

/// Whether what lies there is of the kind that the name promises.
bool isItem(const std::string& path, EntryKind kind) {
    const auto type = QVContentTaggingTypes::fallBackFileTypeForURL(URL::fileURLWithPath(path));
    const bool isBundle = type == kFileTypePatch || type == kFileTypeProject;
    return kind == (isBundle ? EntryKind::folder : EntryKind::file);
}

std::string candidatesWhere(std::string_view condition) {
    return fmt::format(
        "SELECT item.id, folder.path, item.file FROM item JOIN folder ON folder.id = item.folder "
        "WHERE payload = ? AND length(payload) > 0 {} LIMIT {}",
        condition, kMostCandidates);
}

}  // namespace

bool isGone(const std::string& path) {
    EntryStatus status;
    const Presence presence = lookAt(path, Links::keep, status);
    if (presence == Presence::there)
        return lookAt(path, Links::follow, status) == Presence::there && !isItem(path, status.kind);
    if (presence == Presence::unknown) return false;
    // The nearest ancestor that exists decides. If that is a link that leads nowhere, the item may still be
    // behind it.
    for (std::string_view above = placeOf(path).folder; !above.empty(); above = placeOf(above).folder) {
        const std::string nearest(above);
        if (lookAt(nearest, Links::keep, status) != Presence::there) continue;
        return status.kind != EntryKind::link || lookAt(nearest, Links::follow, status) == Presence::there;
    }
    return true;
}

StoreWriter::StoreWriter(Connection& connection)
    : store_(connection),
      cells_(connection),
      put_(connection, "INSERT OR REPLACE INTO item VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?, ?)"),
      putTerm_(connection, "INSERT INTO term (value) VALUES (?) RETURNING id"),
      putPosting_(connection, "INSERT OR REPLACE INTO posting VALUES (?, ?)"),
      dropPosting_(connection, "DELETE FROM posting WHERE key = ?"),
      sameFiles_(connection, candidatesWhere("AND inode = ?")),
      samePayloads_(connection, candidatesWhere("")),
      putFolder_(connection, "INSERT INTO folder (path, digest, gone) VALUES (?, 0, 0) RETURNING id") {}

StoreWriter::~StoreWriter() = default;

void StoreWriter::begin() {
    transaction_.emplace(store_.connection());
}

void StoreWriter::commit() {
    flushPostings();
    cells_.flush();
    transaction_->commit();
}

void StoreWriter::put(ItemId id, const IndexedItem& item, const std::vector<std::string>& terms) {
    if (id > kLastItemId) {
        throw DatabaseFailure(kErrorTooLarge, fmt::format("more than {} items", kLastItemId),
                              store_.connection().path());
    }
    const auto replaced = store_.idOfPath(item.path);
    if (replaced && *replaced != id) remove(*replaced);
    std::vector<std::string> before;
    std::string likenessBefore;
    if (const auto old = store_.item(id)) {
        before = termsOf(*old);
        likenessBefore = old->likeness;
        if (old->path != item.path) leave(placeOf(old->path).folder);
    }
    std::vector<std::string> difference;
    std::set_difference(before.begin(), before.end(), terms.begin(), terms.end(),
                        std::back_inserter(difference));
    for (const std::string& term : difference) change(id, term, false);
    difference.clear();
    std::set_difference(terms.begin(), terms.end(), before.begin(), before.end(),
                        std::back_inserter(difference));
    for (const std::string& term : difference) change(id, term, true);
    cells_.move(id, likenessBefore, item.likeness);
    noteNames(item);
    const Place place = placeOf(item.path);
    const std::string description = encodedDescription(item);
    put_.bind(1, id).bind(2, folderId(place.folder)).bind(3, place.file);
    bindStamp(put_, 4, item.stamp);
    put_.bind(8, item.payloadHash).bind(9, std::int64_t{!item.failure.empty()});
    put_.bind(10, description).execute();
}

void StoreWriter::remove(ItemId id) {
    const auto old = store_.item(id);
    if (!old) return;
    leave(placeOf(old->path).folder);
    for (const std::string& term : termsOf(*old)) change(id, term, false);
    cells_.move(id, old->likeness, {});
    for (const char* sql : {"DELETE FROM item WHERE id = ?", "DELETE FROM earlier_path WHERE item = ?"})
        Statement(store_.connection(), sql).bind(1, id).execute();
}

std::optional<ItemId> StoreWriter::idOfMoved(const IndexedItem& item) {
    const auto firstGone = [&item](Statement& candidates) {
        std::optional<ItemId> id;
        while (!id && candidates.step()) {
            const std::string path = pathIn(candidates.bytes(1), candidates.bytes(2));
            if (path != item.path && isGone(path)) id = candidates.integer(0);
        }
        candidates.reset();
        return id;
    };
    // A file that was only moved keeps its inode. Otherwise a few of the copies that a sound may have are
    // checked; if all of those are still in place, it counts as a new copy.
    const auto same = firstGone(sameFiles_.bind(1, item.payloadHash).bind(2, item.stamp.inode));
    return same ? same : firstGone(samePayloads_.bind(1, item.payloadHash));
}

void StoreWriter::addEarlierPath(ItemId id, std::string_view path) {
    Statement(store_.connection(), "INSERT OR IGNORE INTO earlier_path VALUES (?, ?)")
        .bind(1, id)
        .bind(2, path)
        .execute();
}

void StoreWriter::setDescriber(std::uint64_t describer) {
    if (store_.describer() == describer) return;
    begin();
    store_.connection().run("UPDATE item SET changed = 0; UPDATE folder SET digest = 0");
    Statement(store_.connection(), "INSERT OR REPLACE INTO setting VALUES ('describer', ?)")
        .bind(1, describer)
        .execute();
    commit();
}

void StoreWriter::setFolder(FolderRecord folder) {
    if (left_.contains(folder.id)) folder.digest = 0;
    Statement(store_.connection(), "UPDATE folder SET digest = ?, gone = ?, part = ?, parts = ? WHERE id = ?")
        .bind(1, folder.digest)
        .bind(2, folder.gone)
        .bind(3, std::int64_t{folder.part.number})
        .bind(4, std::int64_t{folder.part.count})
        .bind(5, folder.id)
        .execute();
}

void StoreWriter::leave(std::string_view path) {
    FolderRecord record = store_.folder(path);
    // Once is enough: `setFolder` stores 0 for this folder from now on.
    if (left_.insert(record.id).second) setFolder(record);
}

std::int64_t StoreWriter::folderId(std::string_view path) {
    if (lastFolderId_ != 0 && path == lastFolder_) return lastFolderId_;
    std::int64_t id = store_.folder(path).id;
    if (id == 0) {
        putFolder_.bind(1, path).step();
        id = putFolder_.integer(0);
        putFolder_.reset();
    }
    lastFolder_ = path;
    lastFolderId_ = id;
    return id;
}

TermId StoreWriter::termId(const std::string& value) {
    const auto known = termIds_.find(value);
    if (known != termIds_.end()) return known->second;
    auto id = store_.term(value);
    if (!id) {
        putTerm_.bind(1, value).step();
        id = putTerm_.integer(0);
        putTerm_.reset();
    }
    if (termIds_.size() >= kMostCachedTerms) termIds_.clear();
    termIds_.emplace(value, *id);
    return *id;
}

void StoreWriter::noteNames(const IndexedItem& item) {
    const auto noteField = [this](bool isNumber, const std::string& name) {
        if (!names_.insert((isNumber ? "#" : "@") + name).second) return;
        Statement(store_.connection(), "INSERT OR IGNORE INTO field VALUES (?, ?)")
            .bind(1, std::int64_t{isNumber})
            .bind(2, name)
            .execute();
    };
    const auto noteTag = [&](const std::string& label, const std::string& category) {
        if (!names_.insert("t" + label + '\0' + category).second) return;
        noteField(false, category);
        // Of spellings that differ only in case, one is kept for all; which one does not depend on the order.
        Statement(store_.connection(),
                  "INSERT INTO tag VALUES (?, ?, ?) ON CONFLICT DO UPDATE SET "
                  "label = min(label, excluded.label), category = min(category, excluded.category)")
            .bind(1, termId(tagTerm(label, category)))
            .bind(2, label)
            .bind(3, category)
            .execute();
    };
    for (const IndexedTagging& tagging : item.taggings) {
        noteTag(tagging.label, tagging.category);
        for (const std::string& ancestor : tagging.ancestors) noteTag(ancestor, tagging.category);
    }
    for (const IndexedValue& value : item.values) {
        if (std::holds_alternative<double>(value.value)) noteField(true, value.key);
    }
}

void StoreWriter::change(ItemId id, const std::string& term, bool isAdded) {
    changes_.push_back({postingKey(termId(term), id >> kChunkBits),
                        static_cast<std::uint16_t>(id & (kChunkSize - 1)), isAdded});
}

void StoreWriter::flushPostings() {
    std::stable_sort(changes_.begin(), changes_.end(),
                     [](const Change& a, const Change& b) { return a.key < b.key; });
    for (std::size_t at = 0; at < changes_.size();) {
        const std::int64_t key = changes_[at].key;
        IdSet ids;
        store_.addPosting(key >> kChunkBits, key & (kChunkSize - 1), ids);
        for (; at < changes_.size() && changes_[at].key == key; ++at) {
            changes_[at].isAdded ? ids.insert(changes_[at].id) : ids.erase(changes_[at].id);
        }
        if (ids.empty()) {
            dropPosting_.bind(1, key).execute();
        } else {
            const std::string bytes = ids.encoded();
            putPosting_.bind(1, key).bind(2, bytes).execute();
        }
    }
    changes_.clear();
}

}  // namespace qvct::contentdb
