#pragma once

#include "autotagging/services/TaggingServiceNames.h"

#include <algorithm>
#include <cstddef>
#include <string_view>

namespace qvct::contentdb {

/// The number by which databases keep a tagging service, from 1; 0 for one that is not ours.
inline std::size_t numberOfService(std::string_view name) {
    const auto* const found = std::find_if(kTaggingServiceNames.begin(), kTaggingServiceNames.end(),
                                           [name](const auto& service) { return service.name == name; });
    return found == kTaggingServiceNames.end()
               ? 0
               : static_cast<std::size_t>(found - kTaggingServiceNames.begin()) + 1;
}

/// Its name; "host" for one that is not ours.
inline std::string_view serviceOfNumber(std::size_t number) {
    return number > 0 && number <= kTaggingServiceNames.size() ? kTaggingServiceNames[number - 1].name
                                                               : "host";
}

}  // namespace qvct::contentdb
