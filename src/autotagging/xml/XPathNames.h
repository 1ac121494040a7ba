#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// A name in an expression that is not defined.
struct UnknownXPathName {
    std::size_t offset = 0;  ///< Where it begins, in bytes.
    std::string reason;
};

/// The first function that XPath 1.0 does not have, variable, or prefix other than "xml": rules can define
/// none of them. Looks at names only; whether the expression is well-formed is for others to say.
std::optional<UnknownXPathName> unknownXPathName(std::string_view expression);

}  // namespace qvct
