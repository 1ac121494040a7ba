#pragma once

#include <string>
#include <utility>
#include <vector>

namespace qvct {

/// Identifier and display name of every content pack that the product knows, from the resource folder or the
/// compiled-in copy.
/// @cost  Reads the table each time.
std::vector<std::pair<std::string, std::string>> packDisplayNames();

}  // namespace qvct
