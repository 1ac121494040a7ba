#pragma once

#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>

namespace qvct {

/// What is wrong with a property list, and at which of its bytes.
struct PropertyListFault {
    ErrorCode code = kErrorMalformed;
    std::size_t offset = 0;
    std::string reason;
};

/// Whether XML can spell the date: from 0000-12-30, which some platforms take for the distant past, to the
/// end of 9999.
constexpr bool isPropertyListDate(double secondsSinceReferenceDate) {
    return secondsSinceReferenceDate >= -63114076800.0 && secondsSinceReferenceDate <= 252423993599.0;
}

/// Most keys and values, together, of a list of so many bytes, in whatever form. A single byte can stand for
/// one, which takes 200 bytes of memory while it is read.
constexpr std::size_t mostPropertyListValues(std::size_t size) {
    return 150'000 + size / 64;
}

/// The first reason why a binary property list is not safe to build: an object or reference outside of the
/// bytes, a container that holds itself, nesting over kDeepestPropertyList, more than mostPropertyListValues,
/// shared texts and data that expand to more than a small multiple of the size, a text that is not Unicode, a
/// date that XML cannot spell. Without this a file of a kilobyte can claim a terabyte.
/// @cost  O(size), without recursion.
std::optional<PropertyListFault> faultOfBinaryPropertyList(std::span<const std::uint8_t> bytes);

}  // namespace qvct
