#pragma once

#include "formats/library/LinkRule.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <functional>
#include <string>

namespace qvct {

/// What a walk does with links, and whom it tells.
struct WalkedLinks {
    /// Callers that write to the items should choose `none`; otherwise files outside of the folder are
    /// written to, too.
    LinksOutside outside = LinksOutside::files;
    /// Called for each link that is not followed; may be empty.
    std::function<void(const URL& link)> passedOver;
};

/// Calls `item` for every content item at or below `path`: those of a folder in the order of their names,
/// then those of the folders in it. The callback returns whether to go on.
///
/// Folders are walked; a bundle is an item, but nothing inside it is; pipes, sockets and devices are not
/// items. Links to folders are followed as `links` says, after all else, to folders that were not entered
/// yet: each is entered once. `path` itself is always followed, and if it names a file, that is an item
/// whatever its name. What cannot be read or listed, such as a folder whose path is too long for the system,
/// is reported to `failed`, and the walk goes on. Each function may be empty.
/// @cost  One listing a folder; files are looked at only where the file system does not tell their kind.
QVCT_API void walkContent(const std::string& path, const std::function<bool(const URL& item)>& item,
                          const std::function<void(const Error& error)>& failed,
                          const WalkedLinks& links = {});

}  // namespace qvct
