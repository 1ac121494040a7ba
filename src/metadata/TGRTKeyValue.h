#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"

#include <memory>
#include <optional>
#include <string>

namespace qvct {

/// What a host's database stores of a key value.
class QVCT_API QVContentTaggingIndexableValueData {
  public:
    virtual ~QVContentTaggingIndexableValueData() = default;
    virtual std::string key() const = 0;
    /// A string or a number.
    virtual std::optional<PropertyList> value() const = 0;
};

/// One free item of a record: a key with a string or a number.
///
/// Equality and hash are those of key and value at creation. Numbers of one value are equal whatever their
/// type; a string and a number that print alike are not.
class QVCT_API TGRTKeyValue : public Object, public QVContentTaggingIndexableValueData {
  public:
    /// `initWithKey:numberValue:`; booleans are numbers too. Null when the value is no number.
    static std::shared_ptr<TGRTKeyValue> initWithKeyNumberValue(std::string key, PropertyList numberValue);
    /// `initWithKey:stringValue:`
    static std::shared_ptr<TGRTKeyValue> initWithKeyStringValue(std::string key, std::string stringValue);

    std::string key() const override { return key_; }
    const std::optional<std::string>& stringValue() const { return stringValue_; }
    const std::optional<PropertyList>& numberValue() const { return numberValue_; }
    // Setting does not change hash and equality.
    void setKey(std::string key) { key_ = std::move(key); }
    void setStringValue(std::optional<std::string> value) { stringValue_ = std::move(value); }
    void setNumberValue(std::optional<PropertyList> value) { numberValue_ = std::move(value); }
    /// The string when there is one, else the number.
    std::optional<PropertyList> value() const override;

    /// An item for each entry that is a string or a number; others are passed over. None when there is no
    /// dictionary.
    static ObjectSet<TGRTKeyValue> keyValuesWithDictionary(const PropertyList* dictionary);
    /// Key → value; of several items with one key the last.
    static PropertyList::Dictionary keyValueDictionaryForKeyValues(const ObjectSet<TGRTKeyValue>& keyValues);

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return hash_; }
    std::string description() const override;

  private:
    TGRTKeyValue(std::string key, std::size_t hash) : key_(std::move(key)), hash_(hash) {}

    std::string key_;
    std::optional<std::string> stringValue_;
    std::optional<PropertyList> numberValue_;
    std::size_t hash_;
};

}  // namespace qvct
