#pragma once

#include "CommandLine.h"
#include "ToolContext.h"

#include <cstdint>
#include <string>
#include <vector>

namespace qvct::tool {

/// Adds "--services", which takes one list, so that paths may follow it.
Option addServicesOption(Command& command, std::vector<std::string>& names);

/// The options of the services by name; of all of them when none is named. A wrong name is reported and left
/// out.
std::uint64_t optionsForServices(const std::vector<std::string>& names, ToolContext& context);

}  // namespace qvct::tool
