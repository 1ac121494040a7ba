#include "contentdb/query/NearestSounds.h"

#include "resources/DefaultListeningModels.h"

#include <algorithm>
#include <cmath>

namespace qvct::contentdb {
namespace {

/// The nearest of those that it is shown.
class NearestSoFar {
  public:
    NearestSoFar(std::size_t limit, const SoundFilter& filter) : limit_(limit), filter_(filter) {}

    void show(const NearSound& one) {
        if (limit_ == 0 || (heap_.size() == limit_ && heap_.front() < one)) return;
        if (filter_.counts && !filter_.counts(one.id)) return;
        if (heap_.size() == limit_) {
            std::pop_heap(heap_.begin(), heap_.end());
            heap_.pop_back();
        }
        heap_.push_back(one);
        std::push_heap(heap_.begin(), heap_.end());
    }

    std::vector<NearSound> take() {
        std::sort_heap(heap_.begin(), heap_.end());
        return std::move(heap_);
    }

  private:
    std::size_t limit_;
    const SoundFilter& filter_;
    std::vector<NearSound> heap_;  // the farthest on top
};

}  // namespace

double similarityAt(int squaredDistance) {
    constexpr double kHalf = 100;
    return 1 / (1 + std::sqrt(squaredDistance) / kHalf);
}

std::vector<NearSound> nearestSounds(LikenessCells& index, const SoundLikeness& place, std::size_t limit,
                                     const SoundFilter& filter) {
    NearestSoFar nearest(limit, filter);
    std::size_t compared = 0;
    const auto compare = [&](const CellEntries& entries) {
        const auto chunk = static_cast<std::size_t>(entries.chunk());
        const bool isFiltered = !filter.possible.empty();
        if (isFiltered && (chunk >= filter.possible.size() || filter.possible[chunk].empty())) return;
        for (std::size_t i = 0; i < entries.size(); ++i) {
            if (isFiltered && !filter.possible[chunk].contains(entries.lowerId(i))) continue;
            nearest.show({squaredDistance(place, entries.place(i)), entries.id(i)});
            ++compared;
        }
    };
    for (const std::uint16_t cell : defaultLikenessModel()->cellsByDistance(place)) {
        if (compared >= kMostCompared) break;
        index.forEachIn(cell, compare);
    }
    return nearest.take();
}

std::vector<Similar> soundsLike(ContentStore& store, std::string_view likeness, std::optional<ItemId> self,
                                std::size_t limit) {
    const auto wanted = decodedLikeness(likeness);
    if (!wanted) return {};
    LikenessCells cells(store.connection());
    const SoundFilter others{{}, [self](ItemId id) { return id != self; }};
    std::vector<Similar> result;
    for (const NearSound& near : nearestSounds(cells, wanted->place, limit, others))
        if (auto item = store.item(near.id))
            result.push_back({near.id, std::move(*item), similarityAt(near.squaredDistance)});
    return result;
}

}  // namespace qvct::contentdb
