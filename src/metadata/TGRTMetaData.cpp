#include "metadata/TGRTMetaData.h"

#include "metadata/StoredParts.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

/// A stored value that equals the number already, in whatever type, stays as it is.
void setInteger(std::string_view key, std::int64_t number, PropertyList::Dictionary& dictionary) {
    if (dictionary.integerValue(key) != number) dictionary.set(key, number);
}

bool isKeyOfRecord(std::string_view key) {
    constexpr std::array keys = {QVContentTaggingKeyName,        QVContentInfoKey,
                                 QVContentKeyValueDataKey,       QVContentTaggingTypeKeyName,
                                 QVContentTaggingSubTypeKeyName, QVContentTaggingDisplayKeyName,
                                 QVContentTaggingUUIDKeyName,    QVContentTaggingRejectedKeyName};
    return std::find(keys.begin(), keys.end(), key) != keys.end();
}

PropertyList::Dictionary storedDictionary(const URL& url, Error* error) {
    if (!fileExists(url.path())) return {};
    return readDictionaryFile(url.path(), error, PropertyListUse::rewriting)
        .value_or(PropertyList::Dictionary{});
}

}  // namespace

std::shared_ptr<TGRTMetaData> TGRTMetaData::init() {
    return std::shared_ptr<TGRTMetaData>(new TGRTMetaData);
}

void TGRTMetaData::setContentInfo(const std::shared_ptr<TGRTContentInfo>& contentInfo) {
    contentInfo_ = contentInfo ? contentInfo->copy() : nullptr;
}

const std::set<std::string>& TGRTMetaData::rejectedLabels() const {
    static const std::set<std::string> none;
    return rejectedLabels_ ? *rejectedLabels_ : none;
}

std::optional<PropertyList> TGRTMetaData::valueForKey(std::string_view key) const {
    const auto hit = std::find_if(keyValues_.begin(), keyValues_.end(),
                                  [key](const auto& item) { return item->key() == key; });
    return hit == keyValues_.end() ? std::nullopt : (*hit)->value();
}

void TGRTMetaData::storeInto(PropertyList::Dictionary& stored) const {
    const auto part = [&stored](std::string_view key) { return std::as_const(stored).value(key); };
    stored.set(QVContentTaggingKeyName, storedTaggings(part(QVContentTaggingKeyName), taggings_));
    if (contentInfo_) stored.set(QVContentInfoKey, storedContentInfo(part(QVContentInfoKey), *contentInfo_));
    stored.set(QVContentKeyValueDataKey, storedKeyValues(part(QVContentKeyValueDataKey), keyValues_));
    stored.remove(QVContentTaggingUUIDKeyName);
    setInteger(QVContentTaggingTypeKeyName, fileType_, stored);
    if (subFileType_ != 0) setInteger(QVContentTaggingSubTypeKeyName, subFileType_, stored);
    if (displayName_) {
        stored.set(QVContentTaggingDisplayKeyName, *displayName_);
    } else if (stored.string(QVContentTaggingDisplayKeyName) != nullptr) {
        stored.remove(QVContentTaggingDisplayKeyName);
    }
    if (rejectedLabels_) storeRejections(stored, *rejectedLabels_);
}

void TGRTMetaData::storeOver(PropertyList::Dictionary& stored) const {
    PropertyList::Dictionary kept;
    kept.reserve(stored.size());
    for (const auto& [key, value] : stored) {
        const bool stays = isKeyOfRecord(key)
                               ? (key != QVContentInfoKey || contentInfo_) &&
                                     (key != QVContentTaggingSubTypeKeyName || subFileType_ != 0)
                               : foreignKeys_.contains(key);
        if (stays) kept.append(key, value);
    }
    stored = std::move(kept);
    storeInto(stored);
}

PropertyList::Dictionary TGRTMetaData::prepareDictionaryForURL(const URL& url, Error* error) const {
    PropertyList::Dictionary result = storedDictionary(url, error);
    storeInto(result);
    return result;
}

std::shared_ptr<TGRTMetaData> TGRTMetaData::metaDataFromDictionary(const PropertyList::Dictionary* dictionary,
                                                                   TGRTTaxonomy& taxonomy) {
    if (dictionary == nullptr) return nullptr;
    auto record = init();
    if (const auto* name = dictionary->string(QVContentTaggingDisplayKeyName)) record->displayName_ = *name;
    record->fileType_ = dictionary->integerValue(QVContentTaggingTypeKeyName).value_or(0);
    record->subFileType_ = dictionary->integerValue(QVContentTaggingSubTypeKeyName).value_or(0);
    record->contentInfo_ = contentInfoFromDictionary(*dictionary);
    record->keyValues_ = keyValuesFromDictionary(*dictionary);
    record->taggings_ = taggingsFromDictionary(*dictionary, taxonomy);
    record->rejectedLabels_ = rejectedLabelsFromDictionary(*dictionary);
    for (const auto& entry : *dictionary) {
        if (!isKeyOfRecord(entry.key)) record->foreignKeys_.insert(entry.key);
    }
    return record;
}

ObjectSet<TGRTTagging> TGRTMetaData::taggingsFromDictionary(const PropertyList::Dictionary& dictionary,
                                                            TGRTTaxonomy& taxonomy) {
    return TGRTTagging::taggingsWithTaggingDictionary(dictionary.value(QVContentTaggingKeyName), taxonomy);
}

std::shared_ptr<TGRTContentInfo> TGRTMetaData::contentInfoFromDictionary(
    const PropertyList::Dictionary& dictionary) {
    return TGRTContentInfo::initWithDictionary(dictionary.value(QVContentInfoKey));
}

ObjectSet<TGRTKeyValue> TGRTMetaData::keyValuesFromDictionary(const PropertyList::Dictionary& dictionary) {
    return TGRTKeyValue::keyValuesWithDictionary(dictionary.value(QVContentKeyValueDataKey));
}

std::set<std::string> TGRTMetaData::rejectedLabelsFromDictionary(const PropertyList::Dictionary& dictionary) {
    return qvct::rejectedLabels(dictionary.value(QVContentTaggingRejectedKeyName));
}

std::string TGRTMetaData::description() const {
    return fmt::format(
        "<TGRTMetaData {}> displayName: {} fileType: {} subFileType: {} taggings: {} keyValues: {} "
        "contentInfo: {}",
        static_cast<const void*>(this), displayName_.value_or("(null)"), fileType_, subFileType_,
        taggings_.description(), keyValues_.description(),
        contentInfo_ ? contentInfo_->description() : "(null)");
}

}  // namespace qvct
