#pragma once

#include "platform/base/Error.h"
#include "platform/data/PropertyList.h"

#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// The property list in a file, with the entries that the resource of that name must have; else nothing, and
/// an error.
std::optional<PropertyList::Dictionary> readResourceDictionary(std::string_view name, const std::string& path,
                                                               Error* error = nullptr);

}  // namespace qvct
