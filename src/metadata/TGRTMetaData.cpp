#include "metadata/TGRTMetaData.h"

#include "platform/FileAccess.h"
#include "platform/PropertyListFile.h"
#include "platform/TaggingTypes.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

std::int64_t integerUnder(std::string_view key, const PropertyList::Dictionary& dictionary) {
    const PropertyList* value = dictionary.value(key);
    return value == nullptr ? 0 : value->integerValue().value_or(0);
}

PropertyList::Dictionary storedDictionary(const URL& url, Error* error) {
    if (!fileExists(url.path())) return {};
    return readDictionaryFile(url.path(), error).value_or(PropertyList::Dictionary{});
}

}  // namespace

std::shared_ptr<TGRTMetaData> TGRTMetaData::init() {
    return std::shared_ptr<TGRTMetaData>(new TGRTMetaData);
}

void TGRTMetaData::setContentInfo(const std::shared_ptr<TGRTContentInfo>& contentInfo) {
    contentInfo_ = contentInfo ? contentInfo->copy() : nullptr;
}

std::optional<PropertyList> TGRTMetaData::valueForKey(std::string_view key) const {
    const auto hit = std::find_if(keyValues_.begin(), keyValues_.end(),
                                  [key](const auto& item) { return item->key() == key; });
    return hit == keyValues_.end() ? std::nullopt : (*hit)->value();
}

PropertyList::Dictionary TGRTMetaData::prepareDictionaryForURL(const URL& url, Error* error) const {
    PropertyList::Dictionary result = storedDictionary(url, error);
    result.set(QVContentTaggingKeyName, TGRTTagging::taggingDictionaryForTaggings(taggings_));
    if (contentInfo_) result.set(QVContentInfoKey, contentInfo_->dictionary());
    result.set(QVContentKeyValueDataKey, TGRTKeyValue::keyValueDictionaryForKeyValues(keyValues_));
    result.remove(QVContentTaggingUUIDKeyName);
    result.set(QVContentTaggingTypeKeyName, fileType_);
    if (subFileType_ != 0) result.set(QVContentTaggingSubTypeKeyName, subFileType_);
    if (displayName_) {
        result.set(QVContentTaggingDisplayKeyName, *displayName_);
    } else {
        result.remove(QVContentTaggingDisplayKeyName);
    }
    return result;
}

std::shared_ptr<TGRTMetaData> TGRTMetaData::metaDataFromDictionary(const PropertyList::Dictionary* dictionary,
                                                                   TGRTTaxonomy& taxonomy) {
    if (dictionary == nullptr) return nullptr;
    auto record = init();
    const PropertyList* name = dictionary->value(QVContentTaggingDisplayKeyName);
    if (name != nullptr && name->string() != nullptr) record->displayName_ = *name->string();
    record->fileType_ = integerUnder(QVContentTaggingTypeKeyName, *dictionary);
    record->subFileType_ = integerUnder(QVContentTaggingSubTypeKeyName, *dictionary);
    record->contentInfo_ = contentInfoFromDictionary(*dictionary);
    record->keyValues_ = keyValuesFromDictionary(*dictionary);
    record->taggings_ = taggingsFromDictionary(*dictionary, taxonomy);
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

std::string TGRTMetaData::description() const {
    return fmt::format(
        "<TGRTMetaData {}> displayName: {} fileType: {} subFileType: {} taggings: {} keyValues: {} "
        "contentInfo: {}",
        static_cast<const void*>(this), displayName_.value_or("(null)"), fileType_, subFileType_,
        taggings_.description(), keyValues_.description(),
        contentInfo_ ? contentInfo_->description() : "(null)");
}

}  // namespace qvct
