#pragma once

#include "platform/base/Export.h"

#include <string_view>

namespace qvct {

/// Boolean settings of the host, by name. A name that was never set is taken from the environment variable
/// QVCT_DEFAULT_<name> ("1", "yes", "true"), else false. Safe from every thread.
class QVCT_API UserDefaults {
  public:
    /// The setting's value.
    static bool boolForKey(std::string_view key);
    /// Sets it for this process; nothing is stored.
    static void setBool(bool value, std::string_view key);
};

}  // namespace qvct
