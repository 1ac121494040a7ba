#pragma once

#include <span>
#include <string_view>

namespace qvct {

/// A number by which presets of the retired vocabulary name a tag.
struct VorthalLegacyCode {
    std::string_view code;
    std::string_view category;
    std::string_view label;
    std::string_view parent;  ///< empty for a root tag
};

/// Every code that presets have been written with, in ascending order.
std::span<const VorthalLegacyCode> vorthalLegacyCodes();

}  // namespace qvct
