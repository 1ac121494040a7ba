#include "formats/preset/PresetRecord.h"

#include "platform/TaggingTypes.h"
#include "platform/Text.h"

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

/// Category → entries, as a tagging dictionary has them.
PropertyList::Dictionary taggingDictionary(const PresetText& preset) {
    std::vector<std::pair<std::string, PropertyList::Array>> categories;
    std::unordered_map<std::string, std::size_t> places;
    PropertyList::Array* current = nullptr;
    for (auto& [key, value] : preset.items(kTagging)) {
        if (key == kCategory) {
            const auto [place, isNew] = places.try_emplace(value, categories.size());
            if (isNew) categories.emplace_back(value, PropertyList::Array{});
            current = &categories[place->second].second;
        } else if (current != nullptr && key == QVContentTaggingLabelKeyName) {
            current->emplace_back(PropertyList::Dictionary{{key, std::move(value)}});
        } else if (current != nullptr && !current->empty() && key == QVContentTaggingWeightKeyName) {
            if (auto weight = numberOf(value)) current->back().dictionary()->set(key, std::move(*weight));
        } else if (current != nullptr && !current->empty() && key == QVContentTaggingAutoTaggingKeyName) {
            current->back().dictionary()->set(key, value == kTrue);
        }
    }
    PropertyList::Dictionary dictionary;
    for (auto& [category, entries] : categories) dictionary.append(category, std::move(entries));
    return dictionary;
}

PropertyList::Dictionary contentInfoDictionary(const PresetText& preset) {
    PropertyList::Array applications;
    for (auto& [key, value] : preset.items(kApplicationInfo)) {
        if (key == QVContentInfoAppIdentifierKey) {
            applications.emplace_back(PropertyList::Dictionary{{key, std::move(value)}});
        } else if (!applications.empty() && key == QVContentInfoMinimumVersionKey) {
            applications.back().dictionary()->set(key, std::move(value));
        } else if (!applications.empty() && key == QVContentInfoLegacyKey) {
            applications.back().dictionary()->set(key, value == kTrue);
        }
    }
    PropertyList::Array paths;
    for (auto& [key, value] : preset.items(kAssetDependencies)) {
        if (key == kPath) paths.emplace_back(std::move(value));
    }
    return {{std::string(QVContentInfoApplicationInfosKey), std::move(applications)},
            {std::string(QVContentInfoDependenciesKey), std::move(paths)}};
}

/// Display name, sub type and key values.
void readDescription(const PresetText& preset, TGRTMetaData& record) {
    ObjectSet<TGRTKeyValue> keyValues;
    std::string currentKey;
    for (auto& [key, value] : preset.items(kMetaData)) {
        if (key == QVContentTaggingDisplayKeyName) {
            record.setDisplayName(std::move(value));
        } else if (key == QVContentTaggingSubTypeKeyName) {
            const auto number = numberOf(value);
            record.setSubFileType(number ? number->integerValue().value_or(0) : 0);
        } else if (key == kKey) {
            currentKey = std::move(value);
        } else if (key == kText) {
            keyValues.insert(TGRTKeyValue::initWithKeyStringValue(currentKey, std::move(value)));
        } else if (key == kNumber) {
            if (auto number = numberOf(value))
                keyValues.insert(TGRTKeyValue::initWithKeyNumberValue(currentKey, std::move(*number)));
        }
    }
    record.setKeyValues(std::move(keyValues));
}

void addItem(PresetText::Items& items, std::string_view key, std::string value) {
    items.push_back({std::string(key), std::move(value)});
}

}  // namespace

std::shared_ptr<TGRTMetaData> recordOfPreset(const PresetText& preset, TGRTTaxonomy& taxonomy) {
    auto record = TGRTMetaData::init();
    readDescription(preset, *record);
    record->setFileType(kFileTypeSynthPreset);
    const PropertyList taggings(taggingDictionary(preset));
    record->setTaggings(TGRTTagging::taggingsWithTaggingDictionary(&taggings, taxonomy));
    const PropertyList contentInfo(contentInfoDictionary(preset));
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
                    items);
    preset.setItems(kMetaData, {QVContentTaggingUUIDKeyName}, {});
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
                    applications);
    preset.setItems(kAssetDependencies, {kPath}, paths);
}

void setDescription(PresetText& preset, const TGRTMetaData& record) {
    PresetText::Items items;
    std::vector<std::string_view> owned = {QVContentTaggingDisplayKeyName, kKey, kText, kNumber};
    if (record.displayName()) addItem(items, QVContentTaggingDisplayKeyName, *record.displayName());
    if (record.subFileType() != 0) {
        owned.push_back(QVContentTaggingSubTypeKeyName);
        addItem(items, QVContentTaggingSubTypeKeyName, fmt::format("{}", record.subFileType()));
    }
    for (const auto& keyValue : record.keyValues()) {
        addItem(items, kKey, keyValue->key());
        if (keyValue->stringValue()) {
            addItem(items, kText, *keyValue->stringValue());
        } else if (keyValue->numberValue()) {
            addItem(items, kNumber, textOf(*keyValue->numberValue()));
        }
    }
    preset.setItems(kMetaData, owned, items);
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
