#pragma once

#include "output/Output.h"
#include "platform/data/PropertyList.h"

#include <string>

namespace qvct::tool {

/// The same value in JSON. What JSON has no type for becomes a text: dates in ISO form, data as its size and
/// first bytes in hexadecimal digits.
Json jsonOfPropertyList(const PropertyList& value);
/// One line for people; dictionaries and arrays are shown by their number of entries only.
std::string textOfPropertyList(const PropertyList& value);

}  // namespace qvct::tool
