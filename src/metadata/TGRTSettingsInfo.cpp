#include "metadata/TGRTSettingsInfo.h"

#include <fmt/format.h>

namespace qvct {

std::string TGRTSettingsInfo::description() const {
    return fmt::format("<TGRTSettingsInfo {}> plugInSubID: {} manuID: {} productID: {} plugInID: {}",
                       static_cast<const void*>(this), plugInSubID_, manuID_, productID_, plugInID_);
}

}  // namespace qvct
