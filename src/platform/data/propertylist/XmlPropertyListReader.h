#pragma once

#include "platform/data/PropertyList.h"
#include "platform/data/propertylist/PropertyListGuard.h"
#include "platform/data/propertylist/PropertyListPlace.h"

#include <cstddef>
#include <optional>
#include <string_view>

namespace qvct {

/// Reads the XML form of a property list: well-formed, one value, keys and values in turn. Whole numbers are
/// decimal or, behind "0x", hexadecimal; reals may be "inf" or "nan"; data is base 64, whose padding may be
/// missing. Comments and instructions do not split the text around them. The text is read as UTF-8, whatever
/// encoding it declares.
///
/// Nothing, and the first fault, for anything else: declarations of entities or attributes, nesting over
/// kDeepestPropertyList, more than mostPropertyListValues, kMostXmlAttributes or kMostXmlNameSpaces. If
/// faults were tolerated, what follows them would be lost when the list is written again.
/// @param end  Set to the offset behind the root element, unless there is a fault.
/// @param wanted  A value to be looked for on the way, if not null.
/// @cost  O(size), without recursion.
std::optional<PropertyList> parseXmlPropertyList(std::string_view text, std::size_t& end,
                                                 PropertyListFault& fault,
                                                 PropertyListPlace* wanted = nullptr);

}  // namespace qvct
