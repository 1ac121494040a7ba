#include "formats/preset/PresetRecord.h"

#include "platform/text/Text.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <optional>
#include <unordered_map>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kMetaData = "metadata";
constexpr std::string_view kTagging = "tagging";
constexpr std::string_view kApplicationInfo = "applicationinfo";
constexpr std::string_view kAssetDependencies = "assetdependencies";

constexpr std::string_view kCategory = "Category";
constexpr std::string_view kPath = "Path";
constexpr std::string_view kKey = "Key";
constexpr std::string_view kNumber = "Number";
constexpr std::string_view kText = "Text";
constexpr std::string_view kTrue = "true";
constexpr std::string_view kFalse = "false";

template <typename Number>
std::optional<PropertyList> wholeNumber(std::string_view text) {
    Number value{};
    const auto [end, fault] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (fault != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return PropertyList(value);
}

std::optional<PropertyList> numberOf(std::string_view text) {
    if (text == kTrue || text == kFalse) return PropertyList(text == kTrue);
    if (auto number = wholeNumber<std::int64_t>(text)) return number;
    if (auto number = wholeNumber<std::uint64_t>(text)) return number;
    return wholeNumber<double>(text);
}

std::string textOf(const PropertyList& number) {
    if (const bool* flag = number.boolean()) return std::string(*flag ? kTrue : kFalse);
    if (const auto* value = number.signedInteger()) return fmt::format("{}", *value);
    if (const auto* value = number.unsignedInteger()) return fmt::format("{}", *value);
    return fmt::format("{}", number.doubleValue().value_or(0));
}

std::optional<PropertyList> flagOf(std::string_view text) {
    if (text != kTrue && text != kFalse) return std::nullopt;
    return PropertyList(text == kTrue);
}

/// What an item says about the tag before it; nothing for other items and for invalid values.
std::optional<PropertyList> propertyOfTag(const PresetText::Item& item) {
    if (item.key == QVContentTaggingWeightKeyName) return numberOf(item.value);
    return item.key == QVContentTaggingAutoTaggingKeyName ? flagOf(item.value) : std::nullopt;
}

/// The same for the application before it.
std::optional<PropertyList> propertyOfApplication(const PresetText::Item& item) {
    if (item.key == QVContentInfoMinimumVersionKey) return PropertyList(item.value);
    return item.key == QVContentInfoLegacyKey ? flagOf(item.value) : std::nullopt;
}

/// What a section's items mean, and which were understood; the others are left in place.
template <typename Value>
struct Reading {
    Value value;
    std::vector<bool> isRead;
};

/// Category → entries, as a tagging dictionary has them.
Reading<PropertyList::Dictionary> readTaggings(const PresetText& preset) {
    Reading<PropertyList::Dictionary> reading;
    std::vector<std::pair<std::string, PropertyList::Array>> categories;
    std::unordered_map<std::string, std::size_t> places;
    PropertyList::Array* current = nullptr;
    for (const PresetText::Item& item : preset.items(kTagging)) {
        const bool isOfTag = current != nullptr && !current->empty();
        auto property = isOfTag ? propertyOfTag(item) : std::nullopt;
        const bool isLabel = current != nullptr && item.key == QVContentTaggingLabelKeyName;
        if (item.key == kCategory) {
            const auto [place, isNew] = places.try_emplace(item.value, categories.size());
            if (isNew) categories.emplace_back(item.value, PropertyList::Array{});
            current = &categories[place->second].second;
        } else if (isLabel) {
            current->emplace_back(PropertyList::Dictionary{{item.key, item.value}});
        } else if (property) {
            current->back().dictionary()->set(item.key, *property);
        }
        reading.isRead.push_back(item.key == kCategory || isLabel || property);
    }
    for (auto& [category, entries] : categories) reading.value.append(category, std::move(entries));
    return reading;
}

Reading<std::set<std::string>> readRejectedLabels(const PresetText& preset) {
    Reading<std::set<std::string>> reading;
    for (auto& [key, value] : preset.items(kTagging)) {
        reading.isRead.push_back(key == QVContentTaggingRejectedKeyName);
        if (reading.isRead.back()) reading.value.insert(std::move(value));
    }
    return reading;
}

Reading<PropertyList::Array> readApplications(const PresetText& preset) {
    Reading<PropertyList::Array> reading;
    for (const PresetText::Item& item : preset.items(kApplicationInfo)) {
        const bool isApplication = item.key == QVContentInfoAppIdentifierKey;
        auto property = reading.value.empty() ? std::nullopt : propertyOfApplication(item);
        if (isApplication) reading.value.emplace_back(PropertyList::Dictionary{{item.key, item.value}});
        if (property) reading.value.back().dictionary()->set(item.key, *property);
        reading.isRead.push_back(isApplication || property);
    }
    return reading;
}

Reading<PropertyList::Array> readDependencies(const PresetText& preset) {
    Reading<PropertyList::Array> reading;
    for (auto& [key, value] : preset.items(kAssetDependencies)) {
        reading.isRead.push_back(key == kPath);
        if (key == kPath) reading.value.emplace_back(std::move(value));
    }
    return reading;
}

struct Description {
    std::optional<std::string> displayName;
    std::int64_t subType = 0;
    ObjectSet<TGRTKeyValue> keyValues;
};

Reading<Description> readDescription(const PresetText& preset) {
    Reading<Description> reading;
    std::optional<std::string> current;
    std::size_t keyAt = 0;  // the key's item; it counts as read if it has values and all of them were read
    bool hasStrangeValue = false;
    for (const auto& [key, value] : preset.items(kMetaData)) {
        const bool isNumber = key == kNumber || key == QVContentTaggingSubTypeKeyName;
        const auto number = isNumber ? numberOf(value) : std::nullopt;
        const bool isValue = current && (key == kText || key == kNumber);
        bool isRead = key == QVContentTaggingDisplayKeyName || (isValue && key == kText);
        if (key == QVContentTaggingDisplayKeyName) {
            reading.value.displayName = value;
        } else if (key == kKey) {
            current = value;
            keyAt = reading.isRead.size();
            hasStrangeValue = false;
        } else if (key == QVContentTaggingSubTypeKeyName && number) {
            reading.value.subType = number->integerValue().value_or(0);
            isRead = true;
        } else if (isValue && key == kText) {
            reading.value.keyValues.insert(TGRTKeyValue::initWithKeyStringValue(*current, value));
        } else if (isValue && number) {
            reading.value.keyValues.insert(TGRTKeyValue::initWithKeyNumberValue(*current, *number));
            isRead = true;
        }
        if (isValue) {
            hasStrangeValue = hasStrangeValue || !isRead;
            reading.isRead[keyAt] = !hasStrangeValue;
        }
        reading.isRead.push_back(isRead);
    }
    return reading;
}

void addItem(PresetText::Items& items, std::string_view key, std::string value) {
    items.push_back({std::string(key), std::move(value)});
}

}  // namespace

std::shared_ptr<TGRTMetaData> recordOfPreset(const PresetText& preset, TGRTTaxonomy& taxonomy) {
    auto record = TGRTMetaData::init();
    Description description = readDescription(preset).value;
    record->setDisplayName(std::move(description.displayName));
    record->setSubFileType(description.subType);
    record->setKeyValues(std::move(description.keyValues));
    record->setFileType(kFileTypeSynthPreset);
    const PropertyList taggings(readTaggings(preset).value);
    record->setTaggings(TGRTTagging::taggingsWithTaggingDictionary(&taggings, taxonomy));
    record->setRejectedLabels(readRejectedLabels(preset).value);
    const PropertyList contentInfo(PropertyList::Dictionary{
        {std::string(QVContentInfoApplicationInfosKey), readApplications(preset).value},
        {std::string(QVContentInfoDependenciesKey), readDependencies(preset).value}});
    record->setContentInfo(TGRTContentInfo::initWithDictionary(&contentInfo));
    return record;
}

void setTaggings(PresetText& preset, const ObjectSet<TGRTTagging>& taggings) {
    PresetText::Items items;
    for (const auto& category : TGRTTagging::taggingDictionaryForTaggings(taggings)) {
        addItem(items, kCategory, category.key);
        for (const PropertyList& entry : *category.value.array()) {
            for (const auto& [key, value] : *entry.dictionary()) {
                addItem(items, key, value.string() != nullptr ? *value.string() : textOf(value));
            }
        }
    }
    preset.setItems(kTagging,
                    {kCategory, QVContentTaggingLabelKeyName, QVContentTaggingWeightKeyName,
                     QVContentTaggingAutoTaggingKeyName},
                    readTaggings(preset).isRead, items);
    std::vector<bool> isUuid;
    for (const auto& item : preset.items(kMetaData))
        isUuid.push_back(item.key == QVContentTaggingUUIDKeyName);
    preset.setItems(kMetaData, {}, isUuid, {});
}

void setContentInfo(PresetText& preset, const TGRTContentInfo& contentInfo) {
    PresetText::Items applications;
    for (const auto& info : contentInfo.applicationInfos()) {
        const auto dictionary = info->dictionary();
        if (!dictionary) continue;
        for (const auto& [key, value] : *dictionary) {
            addItem(applications, key, value.string() != nullptr ? *value.string() : textOf(value));
        }
    }
    PresetText::Items paths;
    for (const std::string& path : contentInfo.assetDependencyPaths()) addItem(paths, kPath, path);
    preset.setItems(kApplicationInfo,
                    {QVContentInfoAppIdentifierKey, QVContentInfoMinimumVersionKey, QVContentInfoLegacyKey},
                    readApplications(preset).isRead, applications);
    preset.setItems(kAssetDependencies, {kPath}, readDependencies(preset).isRead, paths);
}

void setRejectedLabels(PresetText& preset, const std::set<std::string>& labels) {
    const auto before = readRejectedLabels(preset);
    if (before.value == labels) return;
    PresetText::Items items;
    for (const std::string& label : labels) addItem(items, QVContentTaggingRejectedKeyName, label);
    preset.setItems(kTagging, {}, before.isRead, items);
}

void setDescription(PresetText& preset, const TGRTMetaData& record) {
    PresetText::Items items;
    std::vector<bool> isReplaced = readDescription(preset).isRead;
    if (record.displayName()) addItem(items, QVContentTaggingDisplayKeyName, *record.displayName());
    if (record.subFileType() != 0) {
        addItem(items, QVContentTaggingSubTypeKeyName, fmt::format("{}", record.subFileType()));
    } else {
        const PresetText::Items present = preset.items(kMetaData);
        for (std::size_t i = 0; i < present.size(); ++i)
            if (present[i].key == QVContentTaggingSubTypeKeyName) isReplaced[i] = false;
    }
    for (const auto& keyValue : record.keyValues()) {
        addItem(items, kKey, keyValue->key());
        if (keyValue->stringValue()) {
            addItem(items, kText, *keyValue->stringValue());
        } else if (keyValue->numberValue()) {
            addItem(items, kNumber, textOf(*keyValue->numberValue()));
        }
    }
    preset.setItems(kMetaData, {kKey, kText, kNumber}, isReplaced, items);
}

std::string textWithoutRecord(const PresetText& preset) {
    constexpr std::array sectionsOfRecord = {kMetaData, kTagging, kApplicationInfo, kAssetDependencies};
    const std::string text = preset.text();
    std::string result;
    std::size_t end = 0;
    for (const PresetText::Section& section : preset.sections()) {
        const auto* const hit = std::find(sectionsOfRecord.begin(), sectionsOfRecord.end(), section.name);
        if (hit == sectionsOfRecord.end()) continue;
        result.append(text, end, section.offset - end);
        end = section.offset + section.size;
    }
    result.append(text, end);
    // Before a section that is added the last line is ended.
    return std::string(trimBlanksAndLineBreaks(result));
}

}  // namespace qvct
