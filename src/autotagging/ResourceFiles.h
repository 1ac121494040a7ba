#pragma once

#include "platform/base/Export.h"
#include "resources/ReplacementFile.h"

#include <span>

namespace qvct {

/// All data files that are built into the library and that others may replace, always in the same order.
QVCT_API std::span<const ResourceFile> resourceFiles();

}  // namespace qvct
