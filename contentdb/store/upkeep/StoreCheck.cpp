#include "contentdb/store/upkeep/StoreCheck.h"

#include "contentdb/store/Digest.h"
#include "contentdb/store/FolderDigest.h"
#include "contentdb/store/LikenessCells.h"
#include "contentdb/store/Part.h"
#include "contentdb/store/codec/StampColumns.h"
#include "contentdb/terms/Terms.h"
#include "platform/text/Text.h"

#include <deque>
#include <optional>
#include <vector>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// A number for a set of (entry, item) pairs that does not depend on their order.
class Tally {
  public:
    void add(std::int64_t key, std::uint16_t id) {
        add(static_cast<std::uint64_t>(key) * 0x9e3779b97f4a7c15U + id);
    }
    /// Of an item that lies in a cell.
    void add(std::uint16_t cell, ItemId id, const SoundLikeness& place) {
        Digest digest;
        digest.add(cell);
        digest.add(static_cast<std::uint64_t>(id));
        digest.add(bytesOf(place));
        add(digest.value());
    }
    bool operator==(const Tally&) const = default;

  private:
    void add(std::uint64_t state) {
        state = (state ^ state >> 31U) * 0xbf58476d1ce4e5b9U;
        sum_ += state ^ state >> 29U;
        ++count_;
    }

    std::uint64_t sum_ = 0;
    std::uint64_t count_ = 0;
};

/// The first folder whose digest does not match the items that are stored for it, so that runs would wrongly
/// pass it over.
std::optional<std::string> misjudgedFolder(Connection& connection) {
    Statement folder(connection,
                     "SELECT id, path, digest, part, parts FROM folder WHERE digest <> 0 AND gone = 0");
    Statement items(connection,
                    fmt::format("SELECT file, {} FROM item WHERE folder = ? ORDER BY file", kStampColumns));
    while (folder.step()) {
        const std::string path(folder.bytes(1));
        const Part part{static_cast<unsigned>(folder.integer(3)), static_cast<unsigned>(folder.integer(4))};
        std::deque<std::string> names;
        std::vector<ListedItem> listed;
        for (items.bind(1, folder.integer(0)); items.step();) {
            if (!part.holds(path, items.bytes(0))) continue;
            names.emplace_back(items.bytes(0));
            listed.push_back({names.back(), stampIn(items, 1)});
        }
        items.reset();
        if (digestOf(listed) != folder.unsignedInteger(2)) return path;
    }
    return std::nullopt;
}

bool isSoundWhole(const IndexedItem& item) {
    const bool isPlaceWhole = item.likeness.empty() || decodedLikeness(item.likeness);
    return isPlaceWhole && decodedFingerprint(item.fingerprint);
}

Tally inCells(Connection& connection) {
    Tally tally;
    LikenessCells(connection).forEach([&tally](std::uint16_t cell, const CellEntries& entries) {
        for (std::size_t i = 0; i < entries.size(); ++i) tally.add(cell, entries.id(i), entries.place(i));
    });
    return tally;
}

}  // namespace

void checkStore(ContentStore& store) {
    Connection& connection = store.connection();
    const auto damaged = [&connection](std::string_view what) {
        throw DatabaseFailure(kErrorMalformed, fmt::format("the database is damaged: {}", what),
                              connection.path());
    };
    const std::string verdict = connection.text("PRAGMA integrity_check(1)");
    // Of several lines the last one says what is wrong, and where.
    if (verdict != "ok")
        damaged(fmt::format("its pages do not fit together ({})", verdict.substr(verdict.rfind('\n') + 1)));
    Tally said;
    Tally heard;
    for (ItemId id = 1, last = store.lastId(); id <= last; ++id) {
        const auto its = store.item(id);
        if (!its) continue;
        for (const std::string& value : termsOf(*its)) {
            const auto known = store.term(value);
            if (!known) damaged(fmt::format("a term of {} is missing", printable(its->path)));
            said.add(postingKey(*known, id >> kChunkBits), static_cast<std::uint16_t>(id & (kChunkSize - 1)));
        }
        if (!isSoundWhole(*its)) damaged(fmt::format("what was heard in {}", printable(its->path)));
        if (const auto likeness = decodedLikeness(its->likeness))
            heard.add(likeness->cell, id, likeness->place);
    }
    Tally indexed;
    Statement postings(connection, "SELECT key, ids FROM posting");
    while (postings.step()) {
        IdSet ids;
        if (!ids.insertEncoded(postings.bytes(1))) damaged("an index entry");
        ids.forEach([&](std::uint16_t id) {
            indexed.add(postings.integer(0), id);
            return true;
        });
    }
    if (!(said == indexed)) damaged("the index does not say what the items say");
    if (!(heard == inCells(connection))) damaged("the cells of sounds do not hold what was heard");
    if (const auto folder = misjudgedFolder(connection))
        damaged(fmt::format("{} does not hold the items that it is known by", printable(*folder)));
}

}  // namespace qvct::contentdb
