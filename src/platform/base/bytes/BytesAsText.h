#pragma once

#include <cstdint>
#include <span>
#include <string_view>

namespace qvct {

/// The bytes as a text, which lives as long as they do. Whether they are UTF-8 is not checked.
inline std::string_view textOf(std::span<const std::uint8_t> bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace qvct
