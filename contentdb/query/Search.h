#pragma once

#include "contentdb/Query.h"
#include "contentdb/SearchResults.h"
#include "contentdb/store/ContentStore.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// Evaluates a query over the index. Every function throws DatabaseFailure.
///
/// For each chunk the index gives two sets: the items that surely match and those that may. Items in the
/// second set only are read and decided by `matches`, so that both evaluators agree by construction where the
/// index is too coarse.
/// @cost  For every 65,536 items, one index entry for each term of the query; and the items that are read:
///   those of the result, and those that only their text can decide. With an order, all that match are read.
///   With a likeness, those cells of sounds are read besides that `nearestSounds` opens.
std::vector<Found> search(ContentStore& store, const Query& query, std::size_t limit);
std::int64_t countMatches(ContentStore& store, const Query& query);
/// Calls `visit` with each chunk's items that the query finds.
void forEachFound(ContentStore& store, const Query& query,
                  const std::function<void(std::int64_t, const IdSet&)>& visit);
/// The most frequent first, then by category and label.
std::vector<Facet> facets(ContentStore& store, const Query& query);

}  // namespace qvct::contentdb
