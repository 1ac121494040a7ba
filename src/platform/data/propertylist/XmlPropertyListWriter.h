#pragma once

#include "platform/data/PropertyList.h"

#include <string>

namespace qvct {

/// The value as XML, with header, document type and tabs. The value must be one that XML can hold.
std::string xmlPropertyList(const PropertyList& value);

}  // namespace qvct
