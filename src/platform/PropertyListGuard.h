#pragma once

#include "platform/Error.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

/// What is wrong with a property list, and at which of its bytes.
struct PropertyListFault {
    ErrorCode code = kErrorMalformed;
    std::size_t offset = 0;
    std::string reason;
};

/// Whether the date lies in the years that XML can spell, 0001 to 9999.
constexpr bool isPropertyListDate(double secondsSinceReferenceDate) {
    return secondsSinceReferenceDate >= -63114076800.0 && secondsSinceReferenceDate <= 252423993599.0;
}

/// Most keys and values, together, of a list of so many bytes. One byte can spell one, which takes 200 in
/// memory while it is read.
constexpr std::size_t mostPropertyListValues(std::size_t size) {
    return 150'000 + size / 64;
}

/// The first reason why a binary property list is not safe to build: an object or reference outside of the
/// bytes, a container that holds itself, nesting over kDeepestPropertyList, shared references that expand to
/// more than a small multiple of the size, too many values, a text that is not Unicode, a date that XML
/// cannot spell. Without this a file of a kilobyte can claim a terabyte.
/// @cost  O(size), without recursion.
std::optional<PropertyListFault> faultOfBinaryPropertyList(std::span<const std::uint8_t> bytes);

/// The first reason why an XML property list is not well-formed and of its grammar: one value, keys and
/// values in turn, whole numbers of 64 bits, numbers and dates that are some, data in base 64, no entities of
/// its own, nested at most kDeepestPropertyList deep, not too many values. A reader that lets faults pass
/// would lose what stands behind them when the file is written again. Whatever encoding the text declares, it
/// is read as UTF-8.
/// @param end  Where there is no fault, the offset behind the root element.
/// @cost  O(size), without recursion.
std::optional<PropertyListFault> faultOfXmlPropertyList(std::string_view text, std::size_t& end);

}  // namespace qvct
