#include "contentdb/store/LikenessCells.h"

#include "contentdb/store/IdSet.h"
#include "platform/base/bytes/ByteOrder.h"

namespace qvct::contentdb {
namespace {

constexpr std::size_t kIdBytes = 2;
constexpr std::size_t kEntryBytes = kIdBytes + SoundLikeness::kSize;

/// Entry of the table: one cell, one chunk of items.
constexpr std::int64_t cellKey(std::uint16_t cell, std::int64_t chunk) {
    return std::int64_t{cell} << kChunkBits | chunk;
}

}  // namespace

CellEntries::CellEntries(std::int64_t chunk, std::string_view bytes)
    : chunk_(chunk), bytes_(bytes), isIntact_(bytes.size() % kEntryBytes == 0) {
    if (!isIntact_) bytes_ = {};
}

std::size_t CellEntries::size() const {
    return bytes_.size() / kEntryBytes;
}

std::uint16_t CellEntries::lowerId(std::size_t index) const {
    const std::string_view id = bytes_.substr(index * kEntryBytes, kIdBytes);
    return static_cast<std::uint16_t>(numberOf(id, ByteOrder::little));
}

ItemId CellEntries::id(std::size_t index) const {
    return chunk_ << kChunkBits | lowerId(index);
}

SoundLikeness CellEntries::place(std::size_t index) const {
    return placeIn(bytes_.substr(index * kEntryBytes + kIdBytes, SoundLikeness::kSize));
}

LikenessCells::LikenessCells(Connection& connection)
    : connection_(connection),
      cell_(connection, "SELECT key, entries FROM likeness WHERE key BETWEEN ? AND ? ORDER BY key"),
      all_(connection, "SELECT key, entries FROM likeness ORDER BY key"),
      row_(connection, "SELECT key, entries FROM likeness WHERE key = ?"),
      put_(connection, "INSERT OR REPLACE INTO likeness VALUES (?, ?)"),
      drop_(connection, "DELETE FROM likeness WHERE key = ?") {}

void LikenessCells::visitRows(Statement& rows,
                              const std::function<void(std::uint16_t, const CellEntries&)>& visit) {
    while (rows.step()) {
        const std::int64_t key = rows.integer(0);
        const CellEntries entries(key & (kChunkSize - 1), rows.bytes(1));
        if (!entries.isIntact()) {
            rows.reset();
            throw DatabaseFailure(kErrorMalformed, "the database is damaged: a cell of sounds",
                                  connection_.path());
        }
        visit(static_cast<std::uint16_t>(key >> kChunkBits), entries);
    }
    rows.reset();
}

void LikenessCells::forEachIn(std::uint16_t cell, const std::function<void(const CellEntries&)>& visit) {
    cell_.reset();
    cell_.bind(1, cellKey(cell, 0)).bind(2, cellKey(cell, kChunkSize - 1));
    visitRows(cell_, [&visit](std::uint16_t /*cell*/, const CellEntries& entries) { visit(entries); });
}

void LikenessCells::forEach(const std::function<void(std::uint16_t, const CellEntries&)>& visit) {
    all_.reset();
    visitRows(all_, visit);
}

void LikenessCells::move(ItemId id, std::string_view from, std::string_view to) {
    if (from == to) return;
    const auto lower = static_cast<std::uint16_t>(id & (kChunkSize - 1));
    const auto keyOf = [id](const PlacedLikeness& its) { return cellKey(its.cell, id >> kChunkBits); };
    if (const auto before = decodedLikeness(from)) changes_[keyOf(*before)].emplace_back(lower, std::nullopt);
    if (const auto after = decodedLikeness(to)) changes_[keyOf(*after)].emplace_back(lower, after->place);
}

void LikenessCells::flush() {
    for (const auto& [key, changes] : changes_) write(key, changes);
    changes_.clear();
}

void LikenessCells::write(std::int64_t key, const std::vector<Change>& changes) {
    std::map<std::uint16_t, SoundLikeness> places;
    visitRows(row_.bind(1, key), [&places](std::uint16_t /*cell*/, const CellEntries& entries) {
        for (std::size_t i = 0; i < entries.size(); ++i) places[entries.lowerId(i)] = entries.place(i);
    });
    for (const auto& [id, place] : changes) {
        if (place) {
            places[id] = *place;
        } else {
            places.erase(id);
        }
    }
    if (places.empty()) return drop_.bind(1, key).execute();
    std::string bytes;
    bytes.reserve(places.size() * kEntryBytes);
    for (const auto& [id, place] : places) {
        bytes += qvct::bytesOf(id, kIdBytes, ByteOrder::little);
        bytes += bytesOf(place);
    }
    put_.bind(1, key).bind(2, bytes).execute();
}

}  // namespace qvct::contentdb
