#pragma once

#include "platform/data/PropertyList.h"

#include <string>

namespace qvct {

/// The value as XML, which has to be able to hold it, with header, document type and tabs.
std::string xmlPropertyList(const PropertyList& value);

}  // namespace qvct
