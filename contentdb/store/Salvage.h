#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// What was saved of a damaged database.
struct Salvage {
    std::int64_t items = 0;
    /// The outermost of all folders that are known to it: what lies on damaged pages is found there again.
    std::vector<std::string> folders;
};

/// Takes the items of a damaged database whose pages can be read into a new one at `target`, with their
/// numbers and earlier paths; each is described as it was. Without any there is no new database.
/// @throws DatabaseFailure when the new database cannot be written.
/// @cost  That of writing the items anew.
Salvage salvage(const std::string& damaged, const std::string& target);

}  // namespace qvct::contentdb
