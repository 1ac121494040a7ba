#pragma once

#include "platform/base/Error.h"
#include "platform/data/PropertyList.h"

#include <optional>
#include <string>

namespace qvct::tool {

class ToolContext;

/// Takes resources from a folder, and the default taxonomy from a file, where these are named. A file that is
/// not what it should be is reported, and the compiled-in copy takes its place.
void useResources(const std::string& directory, const std::string& taxonomyFile, ToolContext& context);

/// The rule set in a file; nothing and the reason when it holds none.
std::optional<PropertyList::Dictionary> readRules(const std::string& path, Error* error);

/// Reports the keywords of a mapping that are not valid expressions; the others are still used.
void checkKeywords(const PropertyList::Dictionary& mapping, ToolContext& context);

}  // namespace qvct::tool
