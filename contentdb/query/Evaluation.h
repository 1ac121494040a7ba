#pragma once

#include "contentdb/Query.h"
#include "contentdb/SearchResults.h"
#include "contentdb/query/QueryPlan.h"
#include "contentdb/store/ContentStore.h"
#include "contentdb/terms/Terms.h"

#include <cstdint>
#include <optional>
#include <utility>

namespace qvct::contentdb {

/// Walks the chunks of the database with the items that match in each.
class Evaluation {
  public:
    Evaluation(ContentStore& store, const Query& query)
        : store_(store),
          query_(query),
          plan_(store, query.condition),
          everything_(store.term(term(TermKind::everything))) {}

    /// Calls `visit(chunk, bounds)` until it answers false.
    template <typename Visit>
    void forEachChunk(Visit visit) {
        if (!everything_) return;
        const std::int64_t last = store_.lastId() >> kChunkBits;
        for (std::int64_t chunk = 0; chunk <= last; ++chunk) {
            IdSet all;
            store_.addPosting(*everything_, chunk, all);
            if (!visit(chunk, plan_.evaluate(chunk, all))) return;
        }
    }

    /// Calls `visit(chunk, items)` with those that match.
    template <typename Visit>
    void forEachDecided(Visit visit) {
        forEachChunk([&](std::int64_t chunk, const Bounds& bounds) {
            visit(chunk, decided(chunk, bounds));
            return true;
        });
    }

    /// Calls `visit(found)` for every match, in the order of the database, until it answers false.
    template <typename Visit>
    void forEachMatch(Visit visit) {
        forEachChunk([&](std::int64_t chunk, const Bounds& bounds) {
            bool goesOn = true;
            bounds.possible.forEach([&](std::uint16_t id) {
                auto found = read(chunk << kChunkBits | id);
                const bool isFound = found && (bounds.sure.contains(id) || isMatch(found->item));
                if (isFound) goesOn = visit(std::move(*found));
                return goesOn;
            });
            return goesOn;
        });
    }

    /// Whether an item matches; one that is not there does not.
    bool isMatch(ItemId id) {
        const auto item = store_.item(id);
        return item && isMatch(*item);
    }

  private:
    /// The items of the chunk that match, decided one by one where the index cannot tell.
    IdSet decided(std::int64_t chunk, const Bounds& bounds) {
        IdSet open = bounds.possible;
        open -= bounds.sure;
        IdSet result = bounds.sure;
        open.forEach([&](std::uint16_t id) {
            if (isMatch(chunk << kChunkBits | id)) result.insert(id);
            return true;
        });
        return result;
    }

    bool isMatch(const IndexedItem& item) const {
        Error error;
        const bool result = matches(query_, item, &error);
        if (error.isSet()) throw DatabaseFailure(std::move(error));
        return result;
    }

    std::optional<Found> read(ItemId id) {
        auto item = store_.item(id);
        if (!item) return std::nullopt;
        return Found{id, std::move(*item)};
    }

    ContentStore& store_;
    const Query& query_;
    QueryPlan plan_;
    std::optional<TermId> everything_;
};

}  // namespace qvct::contentdb
