#pragma once

#include "platform/base/Export.h"

#include <string_view>

namespace qvct {

/// The version of the library that is running, such as "1.2.3".
///
/// It may differ from the version that a host was built with. Safe from every thread.
QVCT_API std::string_view version();

}  // namespace qvct
