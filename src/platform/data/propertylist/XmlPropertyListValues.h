#pragma once

#include "platform/data/PropertyList.h"

#include <optional>
#include <string_view>

namespace qvct {

// What the characters of an element mean in the XML form of a property list. Nothing where they are no such
// value. Of numbers and dates the blanks around are taken away before, of data all blanks.

/// A whole number, decimal or hexadecimal, that 64 bits hold.
std::optional<PropertyList> integerInXml(std::string_view text);

/// A number, "inf" or "nan"; one out of range is as near as there is, infinity or 0.
std::optional<PropertyList> realInXml(std::string_view text);

/// A date and time such as "2001-12-31T23:59:59Z", in the range that is written, too.
std::optional<PropertyList> dateInXml(std::string_view text);

/// The bytes that digits of base 64 spell. Padding may be missing, but not be wrong.
std::optional<PropertyList> dataInXml(std::string_view digits);

/// Whether the character may stand in data: a digit of base 64, padding or a blank.
bool isBase64(char c);

}  // namespace qvct
