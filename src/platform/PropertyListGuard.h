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

/// Whether an XML property list is well-formed and of its grammar: one value, keys and values in turn, whole
/// numbers of 64 bits, data in base 64, no entities of its own, nested at most kDeepestPropertyList deep. A
/// reader that lets faults pass would lose what stands behind them when the file is written again.
/// @cost  O(size), without recursion.
bool isSafeXmlPropertyList(std::span<const std::uint8_t> bytes, Error* error);

}  // namespace qvct
