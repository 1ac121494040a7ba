#pragma once

#include <string_view>

namespace qvct {

/// Whether the process was started with that argument. The arguments are looked up once, at the first call.
bool processHasArgument(std::string_view argument);

}  // namespace qvct
