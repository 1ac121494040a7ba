#pragma once

#include "contentdb/Query.h"
#include "contentdb/SearchResults.h"
#include "contentdb/store/ContentStore.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// Evaluates a query over the index. Every function throws DatabaseFailure.
///
/// The index answers with two sets for each chunk: items that surely match and items that may; what lies
/// between is read and decided by `matches`, so both evaluators agree by construction where the index is
/// blunt.
/// @cost  One index entry for each term of the query and 65,536 items, and the items that are read: those of
///   the result, and of what only their text can decide. With an order: all that match.
std::vector<Found> search(ContentStore& store, const Query& query, std::size_t limit);
std::int64_t countMatches(ContentStore& store, const Query& query);
/// By count, then category and label.
std::vector<Facet> facets(ContentStore& store, const Query& query);

}  // namespace qvct::contentdb
