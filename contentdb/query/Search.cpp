#include "contentdb/query/Search.h"

#include "contentdb/query/Evaluation.h"
#include "contentdb/query/NearestSounds.h"

#include <algorithm>
#include <map>
#include <optional>

namespace qvct::contentdb {
namespace {

constexpr std::uint16_t lowerBits(ItemId id) {
    return static_cast<std::uint16_t>(id & (kChunkSize - 1));
}

/// The items that meet the conditions and sound most like what the query names, nearest first.
std::vector<NearSound> alike(ContentStore& store, const Query& query, std::size_t limit) {
    const auto likeness = decodedLikeness(query.like->likeness);
    if (!likeness) return {};
    Evaluation evaluation(store, query);
    std::vector<IdSet> sure;
    SoundFilter filter;
    evaluation.forEachChunk([&](std::int64_t /*chunk*/, const Bounds& bounds) {
        sure.push_back(bounds.sure);
        filter.possible.push_back(bounds.possible);
        return true;
    });
    if (sure.empty()) return {};
    filter.counts = [&](ItemId id) {
        return sure[static_cast<std::size_t>(id >> kChunkBits)].contains(lowerBits(id)) ||
               evaluation.isMatch(id);
    };
    LikenessCells cells(store.connection());
    return nearestSounds(cells, likeness->place, limit, filter);
}

std::vector<Found> searchAlike(ContentStore& store, const Query& query, std::size_t limit) {
    const bool isOrdered = !query.order.empty();
    std::vector<Found> result;
    for (const NearSound& near : alike(store, query, isOrdered ? kMostAlike : std::min(limit, kMostAlike)))
        if (auto item = store.item(near.id)) result.push_back({near.id, std::move(*item)});
    std::stable_sort(result.begin(), result.end(),
                     [&query](const Found& a, const Found& b) { return comesBefore(query, a.item, b.item); });
    if (result.size() > limit) result.resize(limit);
    return result;
}

}  // namespace

void forEachFound(ContentStore& store, const Query& query,
                  const std::function<void(std::int64_t, const IdSet&)>& visit) {
    if (!query.like) return Evaluation(store, query).forEachDecided(visit);
    std::map<std::int64_t, IdSet> found;
    for (const NearSound& near : alike(store, query, kMostAlike))
        found[near.id >> kChunkBits].insert(lowerBits(near.id));
    for (const auto& [chunk, ids] : found) visit(chunk, ids);
}

std::vector<Found> search(ContentStore& store, const Query& query, std::size_t limit) {
    if (query.like) return searchAlike(store, query, limit);
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
    forEachFound(store, query,
                 [&count](std::int64_t /*chunk*/, const IdSet& found) { count += found.count(); });
    return count;
}

std::vector<Facet> facets(ContentStore& store, const Query& query) {
    const std::vector<ContentStore::Tag> tags = store.tags();
    std::vector<Facet> result;
    result.reserve(tags.size());
    for (const ContentStore::Tag& tag : tags) result.push_back({tag.label, tag.category, 0});
    forEachFound(store, query, [&](std::int64_t chunk, const IdSet& found) {
        if (found.empty()) return;
        for (std::size_t i = 0; i < tags.size(); ++i) {
            IdSet tagged;
            store.addPosting(tags[i].term, chunk, tagged);
            result[i].count += tagged.countCommon(found);
        }
    });
    std::erase_if(result, [](const Facet& facet) { return facet.count == 0; });
    std::stable_sort(result.begin(), result.end(),
                     [](const Facet& a, const Facet& b) { return a.count > b.count; });
    return result;
}

}  // namespace qvct::contentdb
