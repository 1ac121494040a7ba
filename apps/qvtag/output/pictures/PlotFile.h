#pragma once

#include "platform/base/Error.h"

#include <string>
#include <vector>

namespace qvct::tool {

/// Why a picture must not be put there, since something else would be lost: one of the files that it is made
/// of, or a file that is no picture. Not set when it may, and for an empty path.
Error problemOfPlot(const std::string& target, const std::vector<std::string>& inputs);

}  // namespace qvct::tool
