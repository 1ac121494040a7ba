#pragma once

#include "contentdb/SearchResults.h"
#include "contentdb/store/ContentStore.h"
#include "contentdb/store/IdSet.h"
#include "contentdb/store/LikenessCells.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <string_view>
#include <tuple>
#include <vector>

namespace qvct::contentdb {

/// An item, and how far its sound is from another one. Sorts the nearest first, then by number.
struct NearSound {
    int squaredDistance = 0;
    ItemId id = 0;

    bool operator<(const NearSound& other) const {
        return std::tie(squaredDistance, id) < std::tie(other.squaredDistance, other.id);
    }
};

/// How alike two sounds are, from the square of their distance: 1 for the same place, 1/2 at a distance at
/// which people begin to call them two kinds of sound.
double similarityAt(int squaredDistance);

/// Which items are looked for.
struct SoundFilter {
    /// Those that may count, by chunk; all of them where there are no sets.
    std::vector<IdSet> possible;
    /// Decides about one of these. Asked only about items that are among the nearest so far.
    std::function<bool(ItemId)> counts;
};

/// After so many comparisons no further cell is opened: the nearest sounds lie in the cells before it.
inline constexpr std::size_t kMostCompared = 50'000;

/// The items whose sounds are nearest to a place, nearest first; of equally near ones the older first.
///
/// The cells are opened in the order of their distances. Exact while no more than `kMostCompared` items
/// may count; beyond that it misses fewer than one in a hundred of the ten nearest (docs/benchmarks.md).
/// @cost  66 bytes read for each item of the cells that are opened: some 3 ms for 50,000.
/// @throws DatabaseFailure
std::vector<NearSound> nearestSounds(LikenessCells& index, const SoundLikeness& place, std::size_t limit,
                                     const SoundFilter& filter);

/// The items whose sounds are most like one, `self` left out. The likeness is as in `IndexedItem::likeness`;
/// one that is none is like nothing.
std::vector<Similar> soundsLike(ContentStore& store, std::string_view likeness, std::optional<ItemId> self,
                                std::size_t limit);

}  // namespace qvct::contentdb
