#pragma once

#include "platform/Error.h"
#include "platform/Export.h"
#include "platform/Url.h"

#include <functional>
#include <string>

namespace qvct {

/// Whether a name is that of content: its extension is that of a file kind that the framework knows, it is
/// not hidden, and it is not the recorded preview of another item.
///
/// Data files (".data") do not count: half of the world's programs call files so, and only a search through
/// all of its bytes tells whether one carries a record. Who names one can read it.
QVCT_API bool isContentName(const URL& url);

/// Calls `item` for every content item at or below `path`, in the order of names.
///
/// Folders are walked; a bundle is an item, what lies inside it is not. Links are followed, after all else,
/// to folders that were not entered yet: each is entered once. A path that names a file itself is an item
/// whatever its name. What cannot be read is reported to `failed`, and the walk goes on. Either function may
/// be empty.
/// @cost  One listing a folder; files are looked at only where the file system does not tell their kind.
QVCT_API void walkContent(const std::string& path, const std::function<void(const URL& item)>& item,
                          const std::function<void(const Error& error)>& failed);

}  // namespace qvct
