#pragma once

#include "platform/base/Object.h"

#include <cstdint>
#include <string>

namespace qvct {

/// Which plug-in a settings file belongs to, as its header says.
class TGRTSettingsInfo : public Object {
  public:
    std::uint32_t plugInSubID() const { return plugInSubID_; }
    void setPlugInSubID(std::uint32_t identifier) { plugInSubID_ = identifier; }
    /// The manufacturer's code.
    std::uint32_t manuID() const { return manuID_; }
    void setManuID(std::uint32_t code) { manuID_ = code; }
    std::uint32_t productID() const { return productID_; }
    void setProductID(std::uint32_t code) { productID_ = code; }
    std::uint32_t plugInID() const { return plugInID_; }
    void setPlugInID(std::uint32_t code) { plugInID_ = code; }

    std::string description() const override;

  private:
    std::uint32_t plugInSubID_ = 0;
    std::uint32_t manuID_ = 0;
    std::uint32_t productID_ = 0;
    std::uint32_t plugInID_ = 0;
};

}  // namespace qvct
