#pragma once

#include <string>
#include <vector>

namespace qvct::contentdb {

/// Makes the database `target` from all items of the others; of an item that several have, the first one's is
/// taken.
/// @throws DatabaseFailure
/// @cost  O(items). Memory is bounded by the folders.
void mergeInto(const std::string& target, const std::vector<std::string>& databases);

}  // namespace qvct::contentdb
