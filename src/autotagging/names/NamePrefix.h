#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <utility>

namespace qvct {

/// What a name looks like that begins with the code of a category, as libraries of sound effects name their
/// files: "DOGBark_Big Dog Barking_MK_LIB" for code, name, creator and source, "DOGBark-Pets_..." with a
/// category of its maker's own.
struct NamePrefix {
    std::string_view code;
    /// Where creator and source stand in the name; empty when they are not there.
    std::pair<std::uint32_t, std::uint32_t> makers;
};

/// Nothing when the name does not have that form: capitals, small letters behind them, "_", "-" or the end.
/// Capitals alone may be any word ("WIND_Flute"), so behind them all four parts have to stand.
/// @cost  O(bytes).
std::optional<NamePrefix> namePrefixOf(std::string_view name);

}  // namespace qvct
