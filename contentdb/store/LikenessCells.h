#pragma once

#include "contentdb/SearchResults.h"
#include "contentdb/store/codec/SoundCodec.h"
#include "contentdb/store/sqlite/Sqlite.h"
#include "listening/likeness/SoundLikeness.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct::contentdb {

/// The items of one cell whose numbers share their upper bits, with where their sounds lie; in the order of
/// their numbers. Looks into bytes that it does not own.
class CellEntries {
  public:
    /// Nothing but whole entries: otherwise there are none, and `isIntact` is false.
    CellEntries(std::int64_t chunk, std::string_view bytes);

    bool isIntact() const { return isIntact_; }
    std::int64_t chunk() const { return chunk_; }
    std::size_t size() const;
    /// The lower 16 bits of its number.
    std::uint16_t lowerId(std::size_t index) const;
    ItemId id(std::size_t index) const;
    SoundLikeness place(std::size_t index) const;

  private:
    std::int64_t chunk_;
    std::string_view bytes_;
    bool isIntact_;
};

/// Items by where their sounds lie: cells of neighbouring sounds, so that the nearest are found in a few of
/// them. Every operation throws DatabaseFailure.
class LikenessCells {
  public:
    explicit LikenessCells(Connection& connection);

    /// Calls `visit` for the items of a cell, those of lower numbers first. The entries are valid meanwhile.
    void forEachIn(std::uint16_t cell, const std::function<void(const CellEntries&)>& visit);
    /// The same for every cell.
    void forEach(const std::function<void(std::uint16_t, const CellEntries&)>& visit);

    /// Puts an item where its sound lies, or takes it out; what is written, `flush` writes. Both as in
    /// `IndexedItem::likeness`.
    void move(ItemId id, std::string_view from, std::string_view to);
    void flush();

  private:
    using Change = std::pair<std::uint16_t, std::optional<SoundLikeness>>;

    void visitRows(Statement& rows, const std::function<void(std::uint16_t, const CellEntries&)>& visit);
    void write(std::int64_t key, const std::vector<Change>& changes);

    Connection& connection_;
    std::map<std::int64_t, std::vector<Change>> changes_;
    Statement cell_;
    Statement all_;
    Statement row_;
    Statement put_;
    Statement drop_;
};

}  // namespace qvct::contentdb
