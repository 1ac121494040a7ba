#pragma once

#include <cstdint>
#include <span>
#include <string_view>

namespace qvct {

/// The bytes of a data file as it is built in; none where there is no file of that name.
std::span<const std::uint8_t> builtInFile(std::string_view name, std::string_view extension);

}  // namespace qvct
