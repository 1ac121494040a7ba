#pragma once

#include "platform/base/Error.h"
#include "platform/text/Url.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace qvct::tool {

/// A chunk, header field, section, stored entry or companion of an item.
struct InspectedPart {
    std::string id;
    std::optional<std::uint64_t> offset;  ///< In the file.
    std::optional<std::uint64_t> size;
    std::string meaning;
    std::string fault;  ///< Empty when nothing is wrong.
    std::vector<InspectedPart> children;
};

/// All parts of an item, in it and beside it. Damaged ones are shown as far as they can be followed; the
/// error says what cannot be read at all.
std::vector<InspectedPart> partsOfItem(const URL& url, Error* error);

}  // namespace qvct::tool
