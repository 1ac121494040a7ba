#pragma once

#include "platform/data/PropertyList.h"

#include <string>

namespace qvct {

enum class JsonStyle { compact, pretty };

/// The value as JSON text in UTF-8, dictionaries in their order.
///
/// What JSON has no form for (data, dates, UIDs, infinities) becomes null, bytes that are not UTF-8 become
/// U+FFFD.
/// @cost  O(size); recursion as deep as the value nests.
std::string jsonText(const PropertyList& value, JsonStyle style);

}  // namespace qvct
