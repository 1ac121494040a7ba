#pragma once

#include "contentdb/store/FolderDigest.h"
#include "formats/ContentFolderWalk.h"

#include <vector>

namespace qvct::contentdb {

/// The folder's items with their stamps. Their names live as long as the folder. Items that cannot be looked
/// at are reported to `failed` and left out.
/// @cost  One look at each item and at what lies beside it; in a bundle at up to 10,000 entries.
std::vector<ListedItem> listedItems(const ContentFolder& folder, const WalkFailure& failed);

}  // namespace qvct::contentdb
