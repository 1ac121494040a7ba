#pragma once

#include "platform/Error.h"

#include <cstdint>
#include <span>

namespace qvct {

/// Whether a binary property list is safe to build: every object and reference lies inside the bytes, no
/// container holds itself, the nesting is at most kDeepestPropertyList, and what shared references expand to
/// stays within a small multiple of the size. Without this a file of a kilobyte can claim a terabyte.
/// @cost  O(size), without recursion.
bool isSafeBinaryPropertyList(std::span<const std::uint8_t> bytes, Error* error);

/// Whether an XML property list nests its elements at most kDeepestPropertyList deep.
bool isSafeXmlPropertyList(std::span<const std::uint8_t> bytes, Error* error);

}  // namespace qvct
