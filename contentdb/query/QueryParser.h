#pragma once

#include "contentdb/Query.h"

#include <string_view>

namespace qvct::contentdb {

/// Thrown for a text that is no query.
struct QueryFault {
    QueryError error;
};

/// Reads a query, see `parseQuery`.
/// @throws QueryFault
Query parsedQuery(std::string_view text, const Vocabulary& vocabulary);

}  // namespace qvct::contentdb
