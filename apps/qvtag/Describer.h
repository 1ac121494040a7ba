#pragma once

#include "ToolContext.h"
#include "contentdb/IndexedItem.h"

#include <string>
#include <vector>

namespace qvct::tool {

/// What `index` reads of each item: its kind by its name, and the tags that the services derive (all of them
/// when none is named). Empty after a wrong name, which is reported.
contentdb::DescriberFactory describerFactory(const std::vector<std::string>& services, ToolContext& context);

}  // namespace qvct::tool
