#pragma once

#include <string>

namespace qvct::tool {

class ToolContext;

/// Takes resources from a folder, and the default taxonomy from a file, where these are named. A file that is
/// not what it should be is reported, and the compiled-in copy takes its place.
void useResources(const std::string& directory, const std::string& taxonomyFile, ToolContext& context);

}  // namespace qvct::tool
