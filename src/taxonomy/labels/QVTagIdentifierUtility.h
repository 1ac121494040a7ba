#pragma once

#include "platform/base/Export.h"

#include <string>
#include <string_view>

namespace qvct {

/// Keys that both hosts and the framework derive from tag labels.
class QVCT_API QVTagIdentifierUtility {
  public:
    /// The key under which a pole of a bipolar label ("Bright / Dark") is translated.
    static std::string localizationKeyForJingJangTagLabel(std::string_view label, bool lowerValue);
};

}  // namespace qvct
