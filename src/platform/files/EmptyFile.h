#pragma once

#include "platform/base/Error.h"

#include <string>

namespace qvct {

/// Makes an empty file, with the mode, owner and group of `model` where there is such a file and as far as
/// the user may give them. False, and an error, when something is there already or nothing can be made.
bool makeEmptyFileLike(const std::string& model, const std::string& path, Error* error);

}  // namespace qvct
