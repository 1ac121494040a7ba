#pragma once

#include "platform/data/PropertyList.h"
#include "platform/data/PropertyListGuard.h"

#include <cstddef>
#include <optional>
#include <string_view>

namespace qvct {

/// Reads the XML form of a property list: well-formed, one value, keys and values in turn. Whole numbers are
/// decimal or, behind "0x", hexadecimal; reals may be "inf" or "nan"; data is base 64, whose padding may be
/// missing. Comments and instructions part nothing. Whatever encoding the text declares, it is UTF-8.
///
/// Nothing, and the first fault, for anything else: declarations of entities or attributes, nesting over
/// kDeepestPropertyList, more than mostPropertyListValues, kMostXmlAttributes or kMostXmlNameSpaces. A reader
/// that lets faults pass would lose what stands behind them when the list is written again.
/// @param end  The offset behind the root element, where there is no fault.
/// @cost  O(size), without recursion.
std::optional<PropertyList> parseXmlPropertyList(std::string_view text, std::size_t& end,
                                                 PropertyListFault& fault);

}  // namespace qvct
