#pragma once

#include <cstdint>

namespace qvct {

/// Length of the trailer that ends a binary property list.
inline constexpr std::uint64_t kBinaryPlistTrailerLength = 32;

/// Finds the end of a binary property list that other bytes may follow. That is the first 32 bytes that could
/// be its trailer, not the last ones of the data.
///
/// A candidate begins with five zero bytes and holds sizes, counts and offsets that can belong together
/// (layout: 5 unused bytes, sort version, width of an offset, width of a reference, then object count, top
/// object and offset of the offset table as 64-bit big-endian numbers). That does not mean that the list can
/// be parsed.
///
/// @param bytes     Begin with "bplist00"; null or anything else is no list.
/// @param position  Set to the trailer's place on success, unless null.
/// @return  Whether there is one that lies wholly within `length`.
/// @cost    O(length), no allocation.
bool CFBinaryPlistFindTrailer(const std::uint8_t* bytes, std::uint64_t length, std::uint64_t* position);

}  // namespace qvct
