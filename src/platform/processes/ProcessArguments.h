#pragma once

#include <string_view>

namespace qvct {

/// Whether the process was started with that argument. Looked up once, at the first question.
bool processHasArgument(std::string_view argument);

}  // namespace qvct
