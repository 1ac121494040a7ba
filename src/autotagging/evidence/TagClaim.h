#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// What one service says of an item, and what makes it say so.
struct TagClaim {
    /// What was seen, and where.
    struct Evidence {
        std::string what;          ///< The word, the rule, the chunk or the value.
        std::string where;         ///< What it stands in: a name, "rule 3", "record".
        std::uint32_t offset = 0;  ///< Of the first byte of a word in its name.
    };

    std::string label;
    std::optional<double> level;
    std::string_view service;  ///< As `kTaggingServiceNames` calls it.
    Evidence evidence;
    double confidence = 1;  ///< That it holds, in [0, 1], as far as the service can tell.
    /// How far from the item it was seen: 0 in the item or its name, 1 in the name of its folder, and so on.
    int distance = 0;
    bool isHead = false;  ///< The last word of a name that means something.
    std::string doubt;    ///< Why it does not count; empty when it does.

    std::uint32_t end() const { return evidence.offset + static_cast<std::uint32_t>(evidence.what.size()); }
};

}  // namespace qvct
