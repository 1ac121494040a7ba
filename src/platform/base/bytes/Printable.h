#pragma once

#include <string>
#include <string_view>

namespace qvct {

/// The text with every byte that is not printable UTF-8 escaped, fit for one line of a message.
std::string printable(std::string_view text);

}  // namespace qvct
