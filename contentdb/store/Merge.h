#pragma once

#include <string>
#include <vector>

namespace qvct::contentdb {

/// Makes the database `target` of all items of the others; the first that has an item counts.
/// @throws DatabaseFailure
/// @cost  O(items). Memory is bounded by the folders.
void mergeInto(const std::string& target, const std::vector<std::string>& databases);

}  // namespace qvct::contentdb
