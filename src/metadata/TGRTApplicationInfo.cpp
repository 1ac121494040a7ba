#include "metadata/TGRTApplicationInfo.h"

#include "taxonomy/TaggingTypes.h"

#include <fmt/format.h>

namespace qvct {

std::shared_ptr<TGRTApplicationInfo> TGRTApplicationInfo::init() {
    return std::shared_ptr<TGRTApplicationInfo>(new TGRTApplicationInfo);
}

std::shared_ptr<TGRTApplicationInfo> TGRTApplicationInfo::initWithDictionary(
    const PropertyList::Dictionary& dictionary) {
    auto info = init();
    if (const auto* text = dictionary.string(QVContentInfoAppIdentifierKey)) info->appIdentifier_ = *text;
    if (const auto* text = dictionary.string(QVContentInfoMinimumVersionKey)) info->minimumVersion_ = *text;
    info->legacy_ = dictionary.boolValue(QVContentInfoLegacyKey);
    return info;
}

std::optional<PropertyList::Dictionary> TGRTApplicationInfo::dictionary() const {
    if (!appIdentifier_ || appIdentifier_->empty()) return std::nullopt;
    PropertyList::Dictionary result{{std::string(QVContentInfoAppIdentifierKey), *appIdentifier_}};
    if (minimumVersion_ && !minimumVersion_->empty()) {
        result.set(QVContentInfoMinimumVersionKey, *minimumVersion_);
    }
    if (legacy_) result.set(QVContentInfoLegacyKey, true);
    return result;
}

bool TGRTApplicationInfo::isEqual(const Object& other) const {
    return dynamic_cast<const TGRTApplicationInfo*>(&other) != nullptr && other.hash() == hash();
}

std::size_t TGRTApplicationInfo::hash() const {
    return stringHash(fmt::format("{}-{}-{}", appIdentifier_.value_or("(null)"),
                                  minimumVersion_.value_or("(null)"), legacy_ ? 1 : 0));
}

std::string TGRTApplicationInfo::description() const {
    return fmt::format("<TGRTApplicationInfo {}> appIdentifier: {} minimumVersion: {} legacy: {}",
                       static_cast<const void*>(this), appIdentifier_.value_or("(null)"),
                       minimumVersion_.value_or("(null)"), legacy_ ? 1 : 0);
}

}  // namespace qvct
