#pragma once

#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <optional>

namespace qvct {

/// Where an item's companions lie. Only what exists is answered.
class QVCT_API QVContentEditorFileUtilities {
  public:
    /// The XML description of an item. A URL with the extension "xml" or "zxml" is its own, whether it exists
    /// or not; for others the first of: inside the item the intermediate cache of ours (compressed, then
    /// plain), inside it the cache of its root strip, beside it `name.ext.zxml`, beside it `name.ext.xml`.
    static std::optional<URL> intermediateCacheURLForURL(const std::optional<URL>& url);

    /// The recorded preview of an item: an audio file is its own; else "prelisten.caf" inside the item, else
    /// `name.ext.caf` beside it.
    static std::optional<URL> prelistenURLForURL(const std::optional<URL>& url);
};

}  // namespace qvct
