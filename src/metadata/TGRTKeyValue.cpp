#include "metadata/TGRTKeyValue.h"

#include <unordered_map>
#include <utility>
#include <vector>

#include <fmt/format.h>

namespace qvct {
namespace {

/// As people read it: 1 for true, no decimals where there are none.
std::string textOfNumber(const PropertyList& number) {
    if (const auto* value = number.unsignedInteger()) return fmt::to_string(*value);
    if (const auto* value = number.real()) return fmt::to_string(*value);
    return fmt::to_string(number.integerValue().value_or(0));
}

}  // namespace

std::shared_ptr<TGRTKeyValue> TGRTKeyValue::initWithKeyNumberValue(std::string key,
                                                                   PropertyList numberValue) {
    if (!numberValue.isNumber()) return nullptr;
    const std::string text = fmt::format("<TGRTKeyValue>key:{} number:{}", key, textOfNumber(numberValue));
    std::shared_ptr<TGRTKeyValue> item(new TGRTKeyValue(std::move(key), stringHash(text)));
    item->numberValue_ = std::move(numberValue);
    return item;
}

std::shared_ptr<TGRTKeyValue> TGRTKeyValue::initWithKeyStringValue(std::string key, std::string stringValue) {
    const std::string text = fmt::format("<TGRTKeyValue>key:{} string:{}", key, stringValue);
    std::shared_ptr<TGRTKeyValue> item(new TGRTKeyValue(std::move(key), stringHash(text)));
    item->stringValue_ = std::move(stringValue);
    return item;
}

std::optional<PropertyList> TGRTKeyValue::value() const {
    return stringValue_ ? std::optional<PropertyList>(*stringValue_) : numberValue_;
}

ObjectSet<TGRTKeyValue> TGRTKeyValue::keyValuesWithDictionary(const PropertyList* dictionary) {
    ObjectSet<TGRTKeyValue> items;
    if (dictionary == nullptr || dictionary->dictionary() == nullptr) return items;
    for (const auto& [key, value] : *dictionary->dictionary()) {
        if (const std::string* text = value.string()) {
            items.insert(initWithKeyStringValue(key, *text));
        } else {
            items.insert(initWithKeyNumberValue(key, value));
        }
    }
    return items;
}

PropertyList::Dictionary TGRTKeyValue::keyValueDictionaryForKeyValues(
    const ObjectSet<TGRTKeyValue>& keyValues) {
    std::vector<PropertyList::Entry> entries;
    std::unordered_map<std::string_view, std::size_t> places;
    for (const auto& item : keyValues) {
        auto value = item->value();
        if (!value) continue;
        const auto [hit, isNew] = places.emplace(item->key_, entries.size());
        if (isNew) {
            entries.push_back({item->key_, *std::move(value)});
        } else {
            entries[hit->second].value = *std::move(value);
        }
    }
    PropertyList::Dictionary result;
    result.reserve(entries.size());
    for (PropertyList::Entry& entry : entries) result.append(std::move(entry.key), std::move(entry.value));
    return result;
}

bool TGRTKeyValue::isEqual(const Object& other) const {
    return dynamic_cast<const TGRTKeyValue*>(&other) != nullptr && other.hash() == hash();
}

std::string TGRTKeyValue::description() const {
    const std::string text = stringValue_   ? *stringValue_
                             : numberValue_ ? textOfNumber(*numberValue_)
                                            : "(null)";
    return fmt::format("<TGRTKeyValue {}> Key: {} Value: {}", static_cast<const void*>(this), key_, text);
}

}  // namespace qvct
