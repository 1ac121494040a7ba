#pragma once

#include "platform/data/PropertyList.h"
#include "platform/data/propertylist/PropertyListGuard.h"
#include "platform/data/propertylist/PropertyListPlace.h"

#include <optional>
#include <string_view>

namespace qvct {

/// Reads the oldest form of a property list: `{ key = value; }`, `(a, b)`, `<00ff>`, "quoted" or 'quoted'
/// with escapes, bare words, comments as in C. It knows only dictionaries, arrays, texts and data.
///
/// A bare word alone is not taken for a list, since nearly any text begins with one. Nothing, and the fault,
/// for a text that is no list, is nested deeper than kDeepestPropertyList, has more than
/// mostPropertyListValues, or goes on behind the value.
/// @param wanted  A value to be looked for on the way, if not null.
/// @cost  O(size), without recursion.
std::optional<PropertyList> parseOldStylePropertyList(std::string_view text, PropertyListFault& fault,
                                                      PropertyListPlace* wanted = nullptr);

}  // namespace qvct
