#pragma once

#include "contentdb/store/FolderDigest.h"
#include "formats/ContentWalk.h"

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// Called for each folder with its items in the order of names; what it is given lives until it returns.
/// Answers whether to go on.
using FolderVisitor = std::function<bool(const std::string& folder, const std::vector<ListedItem>& items)>;

/// Walks the folder and all below it, a folder's items first and then its folders, each by name. The same
/// names are content as for `walkContent`, and the same links are followed.
///
/// `failed` is told the path and reason of what cannot be read; the walk goes on.
/// @return  False when the visitor stopped it.
/// @cost    One listing a folder and one look at each item.
bool walkLibrary(const std::string& folder, const FolderVisitor& visit,
                 const std::function<void(const std::string& path, const Error& error)>& failed,
                 const WalkedLinks& links = {});

/// How many content names lie at or below the folder, by listing alone.
std::uint64_t countContentNames(const std::string& folder);

}  // namespace qvct::contentdb
