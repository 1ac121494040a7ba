#pragma once

#include "contentdb/store/FolderDigest.h"
#include "formats/library/ContentFolderWalk.h"
#include "formats/library/FolderRejections.h"

#include <string>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// The folder's items with their stamps. Their names live as long as the folder. Items that cannot be looked
/// at are reported to `failed` and left out.
/// @cost  One look at each item and at what lies beside it; in a bundle at up to 10,000 entries.
std::vector<ListedItem> listedItems(const ContentFolder& folder, const WalkFailure& failed);

/// Makes the stamps tell, too, when something else is rejected for the folder or for one above it, up to the
/// root.
/// @cost  One look at each folder, remembered in `rejections`.
void includeRejections(std::vector<ListedItem>& items, const std::string& folder, std::string_view root,
                       FolderRejections& rejections);

}  // namespace qvct::contentdb
