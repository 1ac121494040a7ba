#include "metadata/TGRTApplicationInfo.h"

#include "taxonomy/TaggingTypes.h"

#include <fmt/format.h>

namespace qvct {
namespace {

std::optional<std::string> stringUnder(std::string_view key, const PropertyList::Dictionary& dictionary) {
    const PropertyList* value = dictionary.value(key);
    const std::string* text = value == nullptr ? nullptr : value->string();
    return text == nullptr ? std::nullopt : std::optional(*text);
}

}  // namespace

std::shared_ptr<TGRTApplicationInfo> TGRTApplicationInfo::init() {
    return std::shared_ptr<TGRTApplicationInfo>(new TGRTApplicationInfo);
}

std::shared_ptr<TGRTApplicationInfo> TGRTApplicationInfo::initWithDictionary(
    const PropertyList::Dictionary& dictionary) {
    auto info = init();
    info->appIdentifier_ = stringUnder(QVContentInfoAppIdentifierKey, dictionary);
    info->minimumVersion_ = stringUnder(QVContentInfoMinimumVersionKey, dictionary);
    const PropertyList* legacy = dictionary.value(QVContentInfoLegacyKey);
    info->legacy_ = legacy != nullptr && legacy->boolValue();
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
