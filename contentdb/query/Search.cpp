#include "contentdb/query/Search.h"

#include "contentdb/query/QueryPlan.h"
#include "contentdb/terms/Terms.h"

#include <algorithm>
#include <optional>

namespace qvct::contentdb {
namespace {

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

    /// The items of the chunk that match, decided one by one where the index cannot tell.
    IdSet decided(std::int64_t chunk, const Bounds& bounds) {
        IdSet open = bounds.possible;
        open -= bounds.sure;
        IdSet result = bounds.sure;
        open.forEach([&](std::uint16_t id) {
            const auto item = store_.item(chunk << kChunkBits | id);
            if (item && isMatch(*item)) result.insert(id);
            return true;
        });
        return result;
    }

  private:
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

}  // namespace

std::vector<Found> search(ContentStore& store, const Query& query, std::size_t limit) {
    std::vector<Found> result;
    if (limit == 0) return result;
    const auto isBefore = [&query](const Found& a, const Found& b) {
        if (comesBefore(query, a.item, b.item)) return true;
        return !comesBefore(query, b.item, a.item) && a.id < b.id;
    };
    const bool isOrdered = !query.order.empty();
    Evaluation(store, query).forEachMatch([&](Found&& found) {
        result.push_back(std::move(found));
        if (!isOrdered) return result.size() < limit;
        // A heap of the best so far, with the worst of them on top.
        std::push_heap(result.begin(), result.end(), isBefore);
        if (result.size() > limit) {
            std::pop_heap(result.begin(), result.end(), isBefore);
            result.pop_back();
        }
        return true;
    });
    if (isOrdered) std::sort_heap(result.begin(), result.end(), isBefore);
    return result;
}

std::int64_t countMatches(ContentStore& store, const Query& query) {
    std::int64_t count = 0;
    Evaluation evaluation(store, query);
    evaluation.forEachChunk([&](std::int64_t chunk, const Bounds& bounds) {
        count += evaluation.decided(chunk, bounds).count();
        return true;
    });
    return count;
}

std::vector<Facet> facets(ContentStore& store, const Query& query) {
    const std::vector<ContentStore::Tag> tags = store.tags();
    std::vector<Facet> result;
    result.reserve(tags.size());
    for (const ContentStore::Tag& tag : tags) result.push_back({tag.label, tag.category, 0});
    Evaluation evaluation(store, query);
    evaluation.forEachChunk([&](std::int64_t chunk, const Bounds& bounds) {
        const IdSet found = evaluation.decided(chunk, bounds);
        if (found.empty()) return true;
        for (std::size_t i = 0; i < tags.size(); ++i) {
            IdSet tagged;
            store.addPosting(tags[i].term, chunk, tagged);
            result[i].count += tagged.countCommon(found);
        }
        return true;
    });
    std::erase_if(result, [](const Facet& facet) { return facet.count == 0; });
    std::stable_sort(result.begin(), result.end(),
                     [](const Facet& a, const Facet& b) { return a.count > b.count; });
    return result;
}

}  // namespace qvct::contentdb
