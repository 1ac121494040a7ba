#pragma once

#include "platform/base/Export.h"

#include <string>
#include <string_view>

namespace qvct {

/// Identifiers that anybody can compute from what they identify, so that they need not be stored.
class QVCT_API QVCTUUIDGenerator {
  public:
    /// The namespace of our identifiers: with it, the same path has the same identifier everywhere.
    static constexpr std::string_view kPathNamespace = "42e60a19-8562-4e31-9514-3ae3912dfa41";

    /// The identifier of what lies at a path: a name-based UUID (version 5, RFC 9562) of the path in lower
    /// case hexadecimal digits.
    ///
    /// "." and ".." and doubled or trailing slashes make no difference, and neither does whether anything
    /// lies there. A path that does not begin at the root is taken as if it did. Bytes are taken as they are:
    /// names that only look alike have different identifiers.
    static std::string automaticUUIDForAbsolutePath(std::string_view path);
};

}  // namespace qvct
