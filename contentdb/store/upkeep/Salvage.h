#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// What was saved of a damaged database.
struct Salvage {
    std::int64_t items = 0;
    /// The outermost of all folders that the database knew: walking them finds again what was on damaged
    /// pages.
    std::vector<std::string> folders;
};

/// Copies those items of a damaged database whose pages can be read into a new one at `target`, with their
/// numbers, descriptions and earlier paths. No new database is made when the damaged one cannot be opened.
/// @throws DatabaseFailure when the new database cannot be written.
/// @cost  That of writing the items anew.
Salvage salvage(const std::string& damaged, const std::string& target);

}  // namespace qvct::contentdb
