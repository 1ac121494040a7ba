#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/data/PropertyList.h"

#include <memory>
#include <optional>
#include <string>

namespace qvct {

/// An application that can open a piece of content, from some version on.
///
/// Equality and hash are those of the three fields as they stand: do not change one that is in a set.
class QVCT_API TGRTApplicationInfo : public Object {
  public:
    /// One without identifier and version.
    static std::shared_ptr<TGRTApplicationInfo> init();
    /// Fields that are absent, or of the wrong type, stay unset.
    static std::shared_ptr<TGRTApplicationInfo> initWithDictionary(
        const PropertyList::Dictionary& dictionary);

    /// As files store it; nothing without an identifier.
    std::optional<PropertyList::Dictionary> dictionary() const;

    /// The application's bundle identifier.
    const std::optional<std::string>& appIdentifier() const { return appIdentifier_; }
    void setAppIdentifier(std::optional<std::string> identifier) { appIdentifier_ = std::move(identifier); }
    /// A version such as "10.7".
    const std::optional<std::string>& minimumVersion() const { return minimumVersion_; }
    void setMinimumVersion(std::optional<std::string> version) { minimumVersion_ = std::move(version); }
    bool legacy() const { return legacy_; }
    void setLegacy(bool legacy) { legacy_ = legacy; }

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override;
    std::string description() const override;

  private:
    TGRTApplicationInfo() = default;

    bool legacy_ = false;
    std::optional<std::string> appIdentifier_;
    std::optional<std::string> minimumVersion_;
};

}  // namespace qvct
